// Reads the partitions of one disk and tells what layout they make.
#include "tavo_disk.h"
#include "tavo_partition.h"

#include "core/detail/guard.h"
#include "core/detail/log.h"
#include "core/detail/model_setting.h"
#include "core/detail/strict_number.h"
#include "storage/detail/device_name.h"
#include "storage/detail/proc_partitions.h"

#include <optional>
#include <string>

namespace {

constexpr int kDataPartition = 3;

template <size_t Size>
void CopyText(char (&to)[Size], std::string_view text)
{
    to[text.copy(to, Size - 1)] = 0;
}

// The entry of a row: 0 for the disk itself, its number for a partition; none for another disk, whose name may well
// begin with this one's: "sdaa" and "sdab1" are not of "sda".
std::optional<int> EntryOf(std::string_view name, std::string_view disk)
{
    if (!name.starts_with(disk))
        return std::nullopt;
    const std::string_view rest = name.substr(disk.size());
    if (rest.empty())
        return 0;
    const auto number = tavo::StrictNumber<int>(rest);
    return rest[0] != '0' && number && *number >= 1 && *number < DISK_LAYOUT_ENTRIES ? number : std::nullopt;
}

void FillEntry(TavoPartitionEntry &entry, int number, std::string_view disk, const tavo::PartitionsRow &row)
{
    entry.nMajor = static_cast<int32_t>(row.major);
    entry.nMinor = static_cast<int32_t>(row.minor);
    entry.nKind = number == 0 ? DISK_ENTRY_DISK : DISK_ENTRY_PARTITION;
    entry.cBlock = static_cast<int64_t>(row.blocks);
    CopyText(entry.szDisk, disk);
    CopyText(entry.szName, row.name);
    CopyText(entry.szPath, std::string(tavo::kDev).append(row.name));
}

bool MatchesSystemLayout(const char *disk)
{
    const int raid = tavo::ModelHas("supportraid") ? 1 : 0;
    return BlTAVOCheckPartitionLayout(disk, raid, nullptr) == 1;
}

void Classify(TavoPartitionLayout &layout)
{
    layout.nKind = DISK_LAYOUT_PLAIN;
    if (MatchesSystemLayout(layout.szDisk)) {
        layout.nKind = DISK_LAYOUT_SYSTEM;
        layout.rgEntry[kDataPartition].nKind = DISK_ENTRY_DATA;
        return;
    }
    const int special = TAVOCheckSpecialDevice(layout.szDisk);
    if (special >= 0 && special < DISK_LAYOUT_ENTRIES) {
        layout.nKind = DISK_LAYOUT_SPECIAL;
        layout.rgEntry[special].nKind = DISK_ENTRY_SPECIAL;
    }
}

}  // namespace

extern "C" int DiskPartitionsLayoutGet(const char *szName, TavoPartitionLayout *pLayout)
{
    const std::string_view disk = szName ? szName : "";
    if (disk.size() < 2 || !pLayout || !tavo::IsDeviceName(disk))
        return Fail(ERR_BAD_PARAMETERS);
    return Guard([&] {
        DiskPartitionsLayoutInit(pLayout);
        tavo::PartitionsFile file;
        for (tavo::PartitionsRow row; file.NextRow(row);) {
            const std::optional<int> number = EntryOf(row.name, disk);
            if (!number)
                continue;
            FillEntry(pLayout->rgEntry[*number], *number, disk, row);
            ++pLayout->nEntry;
        }
        if (const tavo::Code code = file.Failure()) {
            LogError("%s:%d Failed to read line of /proc/partitions, errno=0x%X", code);
            return Fail(code);
        }
        if (pLayout->nEntry > 0) {
            CopyText(pLayout->szDisk, disk);
            Classify(*pLayout);
        }
        return 0;
    });
}
