// Sets or deletes the description of a group.
#include "tavo_group.h"
#include "tavo_lock.h"

#include "account/detail/account_name.h"
#include "account/detail/account_transaction.h"
#include "account/detail/group_accounts.h"
#include "account/detail/group_dump.h"
#include "account/detail/group_texts.h"
#include "core/detail/guard.h"

extern "C" int TAVOGroupDescSet(const char *szName, const char *szDesc)
{
    const char *text = szDesc ? szDesc : "";
    if (!szName || !*szName || !tavo::IsGroupDescription(text))
        return Fail(ERR_BAD_PARAMETERS);
    return Guard([&] {
        const std::optional<std::string> key = tavo::AccountKey(szName, tavo::kGroupKeySize);
        if (!key)
            return Fail(ERR_INVALID_GROUPNAME);
        tavo::AccountTransaction change(tavo::kGroupKind);
        if (const tavo::Code code = change.Begin(TAVO_LOCK_GROUP))
            return Fail(code);
        tavo::AccountSession &session = change.Session();
        const tavo::Result<tavo::GroupLine> group = tavo::ReadGroupLine(tavo::GroupDb(session), *key);
        if (!group)
            return Fail(group.Failure());
        session.BeginChange();
        tavo::Btree &descriptions = *session.Store(tavo::kDescStore);
        int code = *text ? descriptions.Set(*key, tavo::FormatGroupDescLine(group->name, text).append(1, '\0'))
                         : descriptions.Delete(*key);
        if (code == 0 || (code == ERR_KEY_NOT_FOUND && !*text))
            code = tavo::CommitGroups(change);
        if (code != 0)
            return Fail(code);
        return change.End() ? 0 : Fail(ERR_UNLOCK_FAILED);
    });
}
