// Lists the groups.
#include "tavo_group.h"

#include "account/detail/group_enumeration.h"
#include "core/detail/guard.h"

extern "C" int TAVOGroupEnum(TLIBSZLIST **ppList, int flags)
{
    if (!ppList || !*ppList)
        return Fail(ERR_BAD_PARAMETERS);
    return Guard([&] {
        std::vector<std::string> names;
        if (const tavo::Code code = tavo::ListGroups(
                flags, [](std::string_view) { return true; }, names))
            return Fail(code);
        return tavo::PushNames(ppList, names) ? static_cast<int>(names.size()) : Fail(ERR_OUT_OF_MEMORY);
    });
}
