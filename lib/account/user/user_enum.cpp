// Lists the accounts.
#include "tavo_user.h"

#include "account/detail/user_enumeration.h"
#include "core/detail/guard.h"

extern "C" int TAVOUserEnum(TLIBSZLIST **ppList, int flags)
{
    if (!ppList || !*ppList)
        return Fail(ERR_BAD_PARAMETERS);
    return Guard([&] {
        std::vector<std::string> names;
        if (const tavo::Code code = tavo::ListUsers(
                flags, [](std::string_view) { return true; }, names))
            return Fail(code);
        return tavo::PushNames(ppList, names) ? static_cast<int>(names.size()) : Fail(ERR_OUT_OF_MEMORY);
    });
}
