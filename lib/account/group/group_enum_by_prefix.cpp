// Lists the groups whose name begins with a text.
#include "tavo_group.h"

#include "account/detail/group_enumeration.h"
#include "core/detail/guard.h"

extern "C" int TAVOGroupEnumByPrefix(TLIBSZLIST **ppList, int flags, const char *szText)
{
    if (!ppList || !*ppList || !szText)
        return Fail(ERR_BAD_PARAMETERS);
    return Guard([&] {
        const std::optional<std::string> text = tavo::GroupFilterText(szText);
        std::vector<std::string> names;
        const auto wanted = [&](std::string_view key) {
            return text && key.starts_with(*text);
        };
        if (const tavo::Code code = tavo::ListGroups(flags, wanted, names))
            return Fail(code);
        return tavo::PushNames(ppList, names) ? static_cast<int>(names.size()) : Fail(ERR_OUT_OF_MEMORY);
    });
}
