// Reads one account by its user id.
#include "tavo_user.h"

#include "account/detail/account_session.h"
#include "account/detail/user_accounts.h"
#include "account/detail/user_texts.h"
#include "core/detail/guard.h"

#include <array>

extern "C" int TAVOUserGetByUID(int uid, TAVOUSER **ppUser)
{
    if (!ppUser)
        return Fail(ERR_BAD_PARAMETERS);
    return Guard([&] {
        tavo::AccountSession session(tavo::kUserKind);
        constexpr std::array stores{size_t{tavo::kNameStore}, size_t{tavo::kShadowStore}, size_t{tavo::kMiscStore},
                                    size_t{tavo::kUidStore}};
        if (const tavo::Code code = session.OpenToRead(stores))
            return Fail(code);
        const tavo::Result<std::string> key = tavo::FindUserKey(session, uid);
        const int code = key ? tavo::ReadUser(session, *key, ppUser) : key.Failure();
        return code == 0 ? 0 : Fail(code);
    });
}
