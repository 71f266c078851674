// Applies renames and deletions of users to the member lists of all groups.
#include "tavo_group.h"
#include "tavo_lock.h"

#include "account/detail/account_name.h"
#include "account/detail/account_transaction.h"
#include "account/detail/group_dump.h"
#include "account/detail/group_members.h"
#include "account/detail/group_texts.h"
#include "core/detail/guard.h"

extern "C" int TAVOUserModifyGroup(const TLIBSZHASH *pshNames)
{
    if (!pshNames)
        return Fail(ERR_BAD_PARAMETERS);
    return Guard([&] {
        tavo::AccountTransaction change(tavo::kGroupKind);
        if (const tavo::Code code = change.Begin(TAVO_LOCK_GROUP))
            return Fail(code);
        const auto new_name = [&](const std::string &member) {
            const std::optional<std::string> key = tavo::AccountKey(member);
            return key ? SzTLIBSzHashGetValue(pshNames, key->c_str()) : nullptr;
        };
        bool changed = false;
        if (const tavo::Code code = tavo::ChangeMembers(change.Session(), new_name, changed))
            return Fail(code);
        if (changed)
            if (const tavo::Code code = tavo::CommitGroups(change))
                return Fail(code);
        return change.End() ? 0 : Fail(ERR_UNLOCK_FAILED);
    });
}
