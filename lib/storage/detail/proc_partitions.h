// /proc/partitions: the disks and partitions that the kernel knows.
#ifndef TAVO_STORAGE_DETAIL_PROC_PARTITIONS_H
#define TAVO_STORAGE_DETAIL_PROC_PARTITIONS_H

#include "core/detail/line_reader.h"
#include "core/detail/open_file.h"
#include "core/detail/result.h"

#include <cstdint>
#include <optional>
#include <string_view>

namespace tavo {

struct PartitionsRow {
    unsigned major;
    unsigned minor;
    uint64_t blocks;  // KiB
    std::string_view name;

    // Of the disks that have numbers: IDE ones, or SCSI ones, which SATA and USB disks count as.
    bool IsWholeIdeDisk() const;
    bool IsWholeScsiDisk() const;
    int32_t DeviceNumber() const { return static_cast<int32_t>(major * 256 + minor); }
};

// A row has exactly four fields, the first three of them numbers; the heading and the empty line below it are not rows.
std::optional<PartitionsRow> ParsePartitionsRow(std::string_view line);

// The open file, line by line.
class PartitionsFile {
  public:
    bool Next(std::string_view &line) { return fd_ && lines_.Next(line); }
    bool NextRow(PartitionsRow &row);

    // After the last line: 0, or the code of what went wrong.
    Code Failure() const;

  private:
    Fd fd_ = OpenFd("/proc/partitions", O_RDONLY);
    LineReader lines_{fd_.Get()};
};

}  // namespace tavo

#endif
