// Arrays that are being brought up to date or spread over more members.
#include "storage/detail/unfinished_array.h"

#include "storage/detail/array_name.h"
#include "storage/detail/kernel_text.h"
#include "storage/detail/member_node.h"
#include "storage/detail/partition_command.h"

#include <algorithm>

namespace tavo {
namespace {

bool HasPosition(int number, const char *leaf)
{
    return KernelText(ArrayFile(number, leaf)).value_or("none") != "none";
}

bool HasSpare(int number)
{
    const auto names = MemberNames(number);
    return std::any_of(names.begin(), names.end(), [&](const std::string &name) {
        return KernelText(ArrayFile(number, "md/dev-" + name + "/state")) == "spare";
    });
}

bool IsUnfinished(int number)
{
    if (HasPosition(number, "md/reshape_position"))
        return true;
    const auto degraded = KernelNumber(ArrayFile(number, "md/degraded"));
    if (!degraded)  // a level without redundancy has nothing to bring up to date
        return false;
    return HasPosition(number, "md/resync_start") || (*degraded > 0 && HasSpare(number));
}

}  // namespace

void GoOnWithArray(int number)
{
    const std::string state = ArrayFile(number, "md/array_state");
    if (KernelText(state) == "read-auto" && IsUnfinished(number))
        RunDiskCommand("/bin/echo active > %s", state);
}

}  // namespace tavo
