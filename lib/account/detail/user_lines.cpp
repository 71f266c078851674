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

int ReadLines(const AccountSession &session, std::string_view key, UserLines &lines)
{
    PasswdLine account;
    int code = ReadPasswdLine(*session.View(kNameStore), key, account);
    std::string_view value;
    if (code == 0)
        code = session.View(kShadowStore)->Get(key, value);
    if (code != 0)
        return code == ERR_KEY_NOT_FOUND ? int{ERR_NO_SUCH_USER} : code;
    lines.shadow = LineOf(value);
    code = session.View(kSmbStore)->Get(key, value);
    if (code == 0)
        lines.samba = LineOf(value);
    return code == ERR_KEY_NOT_FOUND ? 0 : code;
}

}  // namespace

int ChangeUserLines(const char *name, const std::function<int(UserLines &)> &edit, Where where)
{
    if (!name)
        return Fail(ERR_BAD_PARAMETERS, where);
    const std::optional<std::string> key = AccountKey(name);
    if (!key)
        return Fail(ERR_INVALID_USERNAME, where);
    if (IsDomainName(name))
        return Fail(ERR_NO_SUCH_USER, where);
    AccountTransaction change(kUserKind, where);
    if (const int code = change.Begin(TAVO_LOCK_USER))
        return Fail(code, where);
    AccountSession &session = change.Session();
    UserLines before;
    int code = ReadLines(session, *key, before);
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
