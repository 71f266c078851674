// The first sector of a disk.
#include "storage/detail/boot_sector.h"

#include "tavo_partition.h"

#include "core/detail/open_file.h"

#include <algorithm>
#include <cstring>

namespace tavo {
namespace {

constexpr size_t kFirstEntry = 446;
constexpr size_t kTypeAt = 4;
constexpr size_t kStartAt = 8;
constexpr size_t kCountAt = 12;
constexpr unsigned char kGuidTable = 0xEE;

// Each probe steps on from the one before by this many bytes more than the last step, so that entries 1, 2 and 4
// are read and the last probe is after the sector. Tools rely on what this finds: an entry 3 of that type alone has
// always made an MS-DOS table.
constexpr size_t kProbeSteps[] = {0, 16, 32, 48};

bool StartsWith(const BootSector &sector, size_t at, const char *text)
{
    return std::memcmp(sector.data() + at, text, std::strlen(text)) == 0;
}

uint32_t Number(const BootSector &sector, size_t at)
{
    return sector[at] | uint32_t{sector[at + 1]} << 8 | uint32_t{sector[at + 2]} << 16 | uint32_t{sector[at + 3]} << 24;
}

bool IsKnownType(unsigned type)
{
    return type != 0 && std::any_of(std::begin(PartType), std::end(PartType),
                                    [&](const PARTTYPE &row) { return row.szName && row.nType == type; });
}

bool LooksLikeTable(const BootSector &sector)
{
    const unsigned char boot = sector[kFirstEntry];
    const uint64_t start = Number(sector, kFirstEntry + kStartAt);
    const uint64_t end = start + Number(sector, kFirstEntry + kCountAt);
    return (boot == 0x00 || boot == 0x80) && start <= end && end <= UINT32_MAX &&
           IsKnownType(sector[kFirstEntry + kTypeAt]);
}

}  // namespace

Code ReadBootSector(const char *path, BootSector &sector)
{
    const Fd fd = OpenFd(path, O_RDONLY);
    if (!fd)
        return ERR_OPEN_FAILED;
    ssize_t got;
    do {
        got = ::pread(fd.Get(), sector.data(), sector.size(), 0);
    } while (got < 0 && errno == EINTR);
    return got == static_cast<ssize_t>(sector.size()) ? 0 : ERR_READ_FAILED;
}

bool HasTableSignature(const BootSector &sector)
{
    return sector[510] == 0x55 && sector[511] == 0xAA;
}

int TableKind(const BootSector &sector)
{
    if (!HasTableSignature(sector))
        return PARTITION_TABLE_NONE;
    size_t at = kFirstEntry + kTypeAt;
    for (const size_t step : kProbeSteps) {
        at += step;
        if (at < sector.size() && sector[at] == kGuidTable)
            return PARTITION_TABLE_GPT;
    }
    return PARTITION_TABLE_MBR;
}

bool IsWindowsVolume(const BootSector &sector)
{
    if (!HasTableSignature(sector) || LooksLikeTable(sector))
        return false;
    return (StartsWith(sector, 0, "\xEB\x3C\x90") && StartsWith(sector, 54, "FAT16")) ||
           (StartsWith(sector, 0, "\xEB\x58\x90") && StartsWith(sector, 82, "FAT32")) ||
           (StartsWith(sector, 0, "\xEB\x52\x90") && StartsWith(sector, 3, "NTFS"));
}

}  // namespace tavo
