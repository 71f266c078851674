// Looks up the application privilege bits of an account.
#include "tavo_user.h"

#include "account/detail/account_name.h"
#include "account/detail/account_session.h"
#include "account/detail/user_accounts.h"
#include "account/detail/user_texts.h"
#include "core/detail/guard.h"

#include <array>

extern "C" int TAVOUserPrivilegeGet(const char *szName)
{
    if (!szName || !*szName)
        return Fail(ERR_BAD_PARAMETERS);
    return Guard([&] {
        const std::optional<std::string> key = tavo::AccountKey(szName);
        if (!key)
            return Fail(ERR_INVALID_USERNAME);
        tavo::AccountSession session(tavo::kUserKind);
        if (const tavo::Code code = session.OpenToRead(std::array{size_t{tavo::kNameStore}, size_t{tavo::kMiscStore}}))
            return Fail(code);
        int32_t privilege = 0;
        if (const tavo::Code code = tavo::ReadPrivilege(session, *key, privilege))
            return Fail(code);
        return *key == tavo::WithNul("GUEST") ? 0 : int{privilege};
    });
}
