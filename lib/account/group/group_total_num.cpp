// Counts the groups.
#include "tavo_group.h"

#include "account/detail/group_enumeration.h"
#include "core/detail/guard.h"

extern "C" int TAVOGroupTotalNum(int flags)
{
    return Guard([&] {
        std::vector<std::string> names;
        if (const tavo::Code code = tavo::ListGroups(
                flags, [](std::string_view) { return true; }, names))
            return Fail(code);
        return static_cast<int>(names.size());
    });
}
