// Lists the accounts whose name begins with a text.
#include "tavo_user.h"

#include "account/detail/account_name.h"
#include "account/detail/user_enumeration.h"
#include "core/detail/guard.h"

extern "C" int TAVOUserEnumByPrefix(TLIBSZLIST **ppList, int flags, const char *szText)
{
    if (!ppList || !*ppList || !szText)
        return Fail(ERR_BAD_PARAMETERS);
    return Guard([&] {
        const std::optional<std::string> upper = tavo::AccountKey(szText);
        const std::string_view text = upper ? std::string_view(*upper).substr(0, upper->size() - 1) : "";
        std::vector<std::string> names;
        const auto wanted = [&](std::string_view key) {
            return upper && key.starts_with(text);
        };
        if (const tavo::Code code = tavo::ListUsers(flags, wanted, names))
            return Fail(code);
        return tavo::PushNames(ppList, names) ? static_cast<int>(names.size()) : Fail(ERR_OUT_OF_MEMORY);
    });
}
