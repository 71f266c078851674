// Arrays that are being brought up to date or spread over more members.
#ifndef TAVO_STORAGE_DETAIL_UNFINISHED_ARRAY_H
#define TAVO_STORAGE_DETAIL_UNFINISHED_ARRAY_H

#include "storage/detail/array_name.h"
#include "storage/detail/kernel_text.h"
#include "storage/detail/member_node.h"
#include "storage/detail/partition_command.h"

#include <algorithm>

namespace tavo {

inline bool IsUnfinished(int number)
{
    const auto is_under_way = [&](const char *leaf) {
        return KernelText(ArrayFile(number, leaf)).value_or("none") != "none";
    };
    if (is_under_way("md/reshape_position"))
        return true;
    const auto degraded = KernelNumber(ArrayFile(number, "md/degraded"));  // only of levels with redundancy
    if (!degraded || is_under_way("md/resync_start"))
        return degraded.has_value();
    const auto names = MemberNames(number);
    return *degraded > 0 && std::any_of(names.begin(), names.end(), [&](const std::string &name) {
        return KernelText(ArrayFile(number, "md/dev-" + name + "/state")) == "spare";
    });
}

// Has the kernel go on with what a power failure interrupted. Many kernels start arrays for reading only, until something
// is written: a rebuild waits for that, and so does who reads an array in the middle of a reshape.
inline void GoOnWithArray(int number)
{
    const std::string state = ArrayFile(number, "md/array_state");
    if (KernelText(state) == "read-auto" && IsUnfinished(number))
        RunDiskCommand("/bin/echo active > %s", state);
}

}  // namespace tavo

#endif
