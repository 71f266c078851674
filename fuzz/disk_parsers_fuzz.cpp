// What the kernel's files, the drives and the partitioning tool say: parsers read no further than the text, keep to what it
// plainly says, and take their own output back.
#include "tavo_partition.h"

#include "input.h"
#include "storage/detail/ata_pass_through.h"
#include "storage/detail/boot_sector.h"
#include "storage/detail/caching_page.h"
#include "storage/detail/device_name.h"
#include "storage/detail/disk_path.h"
#include "storage/detail/drive_page.h"
#include "storage/detail/proc_partitions.h"
#include "storage/detail/sfdisk_line.h"
#include "storage/detail/usb_id.h"

#include <algorithm>
#include <cstdint>
#include <cstdio>
#include <cstring>
#include <memory>
#include <string>

using fuzz::Check;

namespace {

void CheckPartitions(std::string_view text)
{
    const auto row = tavo::ParsePartitionsRow(text);
    if (!row)
        return;
    Check(!row->name.empty() && row->name.data() >= text.data() &&
              row->name.data() + row->name.size() <= text.data() + text.size(),
          "a name from outside the line");
    const std::string again = std::to_string(row->major) + " " + std::to_string(row->minor) + " " +
                              std::to_string(row->blocks) + " " + std::string(row->name);
    const auto same = tavo::ParsePartitionsRow(again);
    Check(same && same->major == row->major && same->minor == row->minor && same->blocks == row->blocks &&
              same->name == row->name,
          "another row from its own text");
}

void CheckSfdiskLine(std::string_view text)
{
    const auto geometry = tavo::ParseSfdiskLine(text);
    if (!geometry)
        return;
    char again[128];
    std::snprintf(again, sizeof again, "d %lld - %lld %x", static_cast<long long>(geometry->start),
                  static_cast<long long>(geometry->count), geometry->type);
    const auto same = tavo::ParseSfdiskLine(again);
    Check(same && same->start == geometry->start && same->count == geometry->count && same->type == geometry->type,
          "another geometry from its own text");
}

void CheckPath(const std::string &text)
{
    const tavo::ParsedDiskPath parsed = tavo::ParseDiskPath(text.c_str());
    if (parsed.outcome != tavo::ParsedDiskPath::Outcome::good) {
        Check(!parsed.tail || (parsed.tail >= text.c_str() && parsed.tail <= text.c_str() + text.size()),
              "a wrong character from outside the path");
        return;
    }
    const std::string device = tavo::DiskDevice(parsed.path);
    Check(tavo::IsDevicePath(device), "a disk without a device name");
    const tavo::ParsedDiskPath whole = tavo::ParseDiskPath(device.c_str());
    DISKPATH expected = parsed.path;
    expected.nPartition = 0;
    Check(std::memcmp(&whole.path, &expected, sizeof expected) == 0, "another disk from its own path");
}

void CheckName(std::string_view text)
{
    if (!tavo::IsDeviceName(text))
        return;
    Check(text.find_first_of("/;&|$`'\"\\ \t\n*?[]{}()<>~#!\x7f") == text.npos && text != ".." && text[0] != '-',
          "a name that a shell reads otherwise");
}

// The pages are of fixed size: what is missing is zero, and blocks of exactly that size show any read beyond.
template <class Page>
std::unique_ptr<Page> PageFrom(const uint8_t *data, size_t size)
{
    auto page = std::make_unique<Page>();
    std::copy_n(data, std::min(size, page->size()), page->begin());
    return page;
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const uint8_t *data, size_t size)
{
    const std::string text(reinterpret_cast<const char *>(data), size);
    CheckPartitions(text);
    CheckSfdiskLine(text);
    CheckPath(text);
    CheckName(text);
    tavo::ParseUsbId(text);

    const auto page = PageFrom<tavo::DrivePage>(data, size);
    const auto degrees = tavo::SmartTemperature(*page);
    Check(!degrees || (*degrees >= -60 && *degrees <= 200), "a temperature that no disk survives");
    tavo::HasNoRotatingMedium(*page);
    tavo::HasWriteCacheOn(*page);
    const auto sector = PageFrom<tavo::BootSector>(data, size);
    const int kind = tavo::TableKind(*sector);
    Check((kind == PARTITION_TABLE_NONE) == !tavo::HasTableSignature(*sector), "a table without a signature");
    Check(!tavo::IsWindowsVolume(*sector) || kind != PARTITION_TABLE_NONE, "a volume without a signature");

    const std::vector<uint8_t> bytes(data, data + size);
    tavo::ParseAtaResult(bytes);
    if (const auto at = tavo::FindCachingPage(bytes))
        Check(*at + 2 + bytes[*at + 1] <= bytes.size() && bytes[*at + 1] > 0, "a page beyond the answer");
    return 0;
}
