// The verbs of tavoctl disk about the health of drives.
#ifndef TAVOCTL_DISK_VERBS_H
#define TAVOCTL_DISK_VERBS_H

#include "frame/verb.h"
#include "storage/smart_pages.h"

namespace tavoctl {

struct DiskHealth {
    std::string disk;
    std::optional<std::string> verdict = {}, reason = {}, self_test = {};
    std::optional<int> percent = {};
    std::optional<uint64_t> hours = {};
    std::optional<int> errors = {};
};

inline constexpr Column<DiskHealth> health_columns[] = {
    {"disk", field<&DiskHealth::disk>},
    {"verdict", field<&DiskHealth::verdict>, "good; worn: replace it soon; failing: replace it now"},
    {"reason", field<&DiskHealth::reason>, "of the verdict, or why there is none"},
    {"self_test", field<&DiskHealth::self_test>, "what came of the last one, or running"},
    {"percent", field<&DiskHealth::percent>, "of a running self-test"},
    {"hours", field<&DiskHealth::hours>, "that it was on"},
    {"errors", field<&DiskHealth::errors>, "in its own log"},
};

inline constexpr Column<DriveError> error_columns[] = {
    {"number", field<&DriveError::number>, "counted by the drive"},
    {"hours", field<&DriveError::hours>, "that it had been on"},
    {"error", field<&DriveError::error>},
    {"sector", field<&DriveError::sector>, "the lower 28 bits"},
    {"command", field<&DriveError::command>, "of ATA, its number"},
};

DiskHealth ReadHealth(const std::string &disk, bool wake);

Action DiskHealthList(Arguments &in);
Action DiskErrors(Arguments &in);
Action DiskTest(Arguments &in);

}  // namespace tavoctl

#endif
