// Changes of the shadow and the Samba line of one user, beside those of whole accounts.
#include "account/detail/user_lines.h"

#include "tavo_appliance.h"
#include "tavo_lock.h"

#include "account/detail/account_name.h"
#include "account/detail/account_transaction.h"
#include "account/detail/user_dump.h"
#include "account/detail/user_texts.h"
#include "core/detail/log.h"

namespace tavo {
namespace {

Code ReadLines(const AccountSession &session, std::string_view key, UserLines &lines)
{
    if (const Code code = ReadPasswdLine(*session.View(kNameStore), key).Failure())
        return code.Renaming(ERR_KEY_NOT_FOUND, ERR_NO_SUCH_USER);
    const Result<std::string_view> shadow = session.View(kShadowStore)->Get(key);
    if (!shadow)
        return shadow.Failure().Renaming(ERR_KEY_NOT_FOUND, ERR_NO_SUCH_USER);
    lines.shadow = LineOf(*shadow);
    const Result<std::string_view> samba = session.View(kSmbStore)->Get(key);
    if (samba)
        lines.samba = LineOf(*samba);
    return samba.Failure().Renaming(ERR_KEY_NOT_FOUND, ERR_SUCCESS);
}

}  // namespace

int ChangeUserLines(const char *name, const std::function<Code(UserLines &)> &edit, Where where)
{
    if (!name)
        return Fail(ERR_BAD_PARAMETERS, where);
    const std::optional<std::string> key = AccountKey(name);
    if (!key)
        return Fail(ERR_INVALID_USERNAME, where);
    if (IsDomainName(name))
        return Fail(ERR_NO_SUCH_USER, where);
    AccountTransaction change(kUserKind, where);
    if (const Code code = change.Begin(TAVO_LOCK_USER))
        return Fail(code, where);
    AccountSession &session = change.Session();
    UserLines before;
    Code code = ReadLines(session, *key, before);
    UserLines lines = before;
    if (code == 0)
        code = edit(lines);
    if (code != 0)
        return Fail(code, where);
    const bool changes = lines.shadow != before.shadow || lines.samba != before.samba;
    if (changes) {
        session.BeginChange();
        if (lines.shadow != before.shadow)
            code = session.Store(kShadowStore)->Set(*key, WithNul(lines.shadow));
        if (code == 0 && lines.samba != before.samba)
            code = session.Store(kSmbStore)->Set(*key, WithNul(lines.samba));
        if (code != 0)
            return Fail(code, where);
        if (CommitUsers(change) != 0)
            return -1;
    }
    const bool unlocked = change.End();
    if (changes)
        TLIBScemdNotify(kAccountsChanged);
    return unlocked ? 0 : Fail(ERR_UNLOCK_FAILED, where);
}

}  // namespace tavo
