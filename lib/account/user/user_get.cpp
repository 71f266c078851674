// Reads one account by name.
#include "tavo_user.h"

#include "account/detail/account_name.h"
#include "account/detail/account_session.h"
#include "account/detail/user_accounts.h"
#include "account/detail/user_texts.h"
#include "core/detail/guard.h"

#include <array>

extern "C" int TAVOUserGet(const char *szName, TAVOUSER **ppUser)
{
    if (!szName || !*szName || !ppUser)
        return Fail(ERR_BAD_PARAMETERS);
    return Guard([&] {
        const std::optional<std::string> key = tavo::AccountKey(szName);
        if (!key)
            return Fail(ERR_INVALID_USERNAME);
        tavo::AccountSession session(tavo::kUserKind);
        constexpr std::array stores{size_t{tavo::kNameStore}, size_t{tavo::kShadowStore}, size_t{tavo::kMiscStore}};
        if (const tavo::Code code = session.OpenToRead(stores))
            return Fail(code);
        const int code = tavo::ReadUser(session, *key, ppUser);
        return code == 0 ? 0 : Fail(code);
    });
}
