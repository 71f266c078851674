// Adds, changes or renames a group.
#include "tavo_group.h"

#include "account/detail/account_name.h"
#include "account/detail/account_transaction.h"
#include "account/detail/group_accounts.h"
#include "account/detail/group_dump.h"
#include "account/detail/group_texts.h"
#include "core/detail/guard.h"
#include "core/detail/log.h"

namespace {

tavo::Code Apply(tavo::AccountTransaction &transaction, const char *old_name, const TAVOGROUP &group,
                 tavo::GroupChange &change)
{
    const TAVOGROUPDB db = tavo::GroupDb(transaction.Session());
    const bool choose = !old_name && group.nGid == -1;
    int32_t gid = group.nGid;
    if (choose)
        if (const tavo::Code code = tavo::FindFreeId(*tavo::Btree::Of(db.pGid), tavo::kGids, gid))
            return code;
    if (const tavo::Code code = tavo::PrepareGroup(db, old_name, group, gid, change))
        return code;
    if (change.key != change.old_key && transaction.IsPending(true, change.key))
        return ERR_REMOVE_FAILED;
    transaction.Session().BeginChange();
    if (const tavo::Code code = tavo::StoreGroup(db, change))
        return code;
    return choose ? tavo::Btree::Of(db.pGid)->SetNumber(tavo::kCurrentGidKey, gid) : tavo::Code();
}

}  // namespace

extern "C" int TAVOGroupSet(const char *szOldName, const TAVOGROUP *pGroup)
{
    if (!pGroup || !pGroup->szName)
        return Fail(ERR_BAD_PARAMETERS);
    return Guard([&] {
        if (tavo::IsDomainName(pGroup->szName)) {
            LogError("%s:%d Cannot set not-local group. group name=[%s]", pGroup->szName);
            return Fail(ERR_INVALID_GROUPNAME);
        }
        tavo::AccountTransaction transaction(tavo::kGroupKind);
        if (const tavo::Code code = transaction.Begin(tavo::kAccountLocks))
            return Fail(code);
        tavo::GroupChange change;
        int code = Apply(transaction, szOldName, *pGroup, change);
        if (code == 0 && !change.old_name.empty() && change.old_name != change.line.name)
            transaction.Files().Steps().names.push_back({.is_group = true,
                                                         .targets = tavo::kShareLists | tavo::kSambaLists,
                                                         .old_name = change.old_name,
                                                         .new_name = change.line.name});
        if (code == 0)
            code = tavo::CommitGroups(transaction);
        if (code != 0)
            return Fail(code);
        return transaction.End() ? 0 : Fail(ERR_UNLOCK_FAILED);
    });
}
