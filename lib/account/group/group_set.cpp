// Adds, changes or renames a group.
#include "tavo_group.h"

#include "account/detail/account_name.h"
#include "account/detail/group_commit.h"
#include "account/detail/group_texts.h"
#include "account/detail/share_groups.h"
#include "core/detail/guard.h"
#include "core/detail/keep_fault.h"
#include "core/detail/log.h"
#include "tavo_appliance.h"
#include "tavo_lock.h"

namespace {

constexpr unsigned kLocks = TAVO_LOCK_USER | TAVO_LOCK_GROUP | TAVO_LOCK_SMB;

// The group is renamed whatever comes of this.
void RenameEverywhere(const std::string &old_key, const std::string &new_name)
{
    const tavo::KeepFault keep;
    tavo::HashOwner names(PshTLIBSzHashAlloc(1024));
    const std::string old_entry = "@" + old_key;
    if (!names || TLIBSzHashSetValue(names.Addr(), old_entry.c_str(), new_name.c_str()) < 0)
        return LogError("%s:%d Failed to note the rename to [%s]", new_name);
    if (const int code = tavo::ChangeGroupsInShares(names.Get()))
        LogError("%s:%d Rename group in shares failed. tavoerr=0x%04X", code);
    if (TAVOUserModifySmbConf(names.Get()) != 0)
        LogError("%s:%d Rename group in smb.conf failed.");
}

int Apply(tavo::AccountSession &session, const char *old_name, const TAVOGROUP &group, tavo::GroupChange &change)
{
    const TAVOGROUPDB db = tavo::GroupDb(session);
    const bool choose = !old_name && group.nGid == -1;
    int32_t gid = group.nGid;
    if (choose)
        if (const int code = tavo::FindFreeId(*tavo::Btree::Of(db.pGid), tavo::kGids, gid))
            return code;
    if (const int code = tavo::PrepareGroup(db, old_name, group, gid, change))
        return code;
    session.BeginChange();
    if (const int code = tavo::StoreGroup(db, change))
        return code;
    return choose ? tavo::Btree::Of(db.pGid)->SetNumber(tavo::kCurrentGidKey, gid) : 0;
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
        tavo::AccountSession session(tavo::kGroupKind);
        if (const int code = session.OpenToChange(kLocks))
            return Fail(code);
        tavo::GroupChange change;
        int code = Apply(session, szOldName, *pGroup, change);
        if (code == 0)
            code = tavo::CommitGroups(session);
        if (code != 0)
            return Fail(code);
        if (!change.old_name.empty() && change.old_name != change.line.name)
            RenameEverywhere(change.old_key, change.line.name);
        return session.Unlock() ? 0 : Fail(ERR_UNLOCK_FAILED);
    });
}
