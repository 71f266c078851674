// Deletes groups.
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

constexpr unsigned kLocks = TAVO_LOCK_GROUP | TAVO_LOCK_SMB;

using Keys = std::set<std::string>;

// Deletes one group; what goes wrong is logged and stays in the error state.
void DeleteOne(const TAVOGROUPDB &db, const char *name, Keys &deleted)
{
    if (name && tavo::IsDomainName(name))
        return;  // lives in its domain
    const std::optional<std::string> key = name ? tavo::AccountKey(name, tavo::kGroupKeySize) : std::nullopt;
    if (key && deleted.contains(*key))
        return LogNotice("%s:%d Duplicate group name:[%s]", name);
    tavo::GroupLine group;
    int code = key ? tavo::ReadGroupLine(db, *key, group) : int{ERR_NO_SUCH_GROUP};
    if (code == ERR_NO_SUCH_GROUP) {
        Fail(code);
        return LogError("%s:%d Group [%s] does not exist", name ? name : "");
    }
    code = tavo::RemoveGroup(db, *key, group.gid);
    if (code != 0) {
        Fail(code);
        return LogError("%s:%d TAVOGroupDBDelete %s failed. tavoerr=0x%04X", name, code);
    }
    deleted.insert(*key);
}

// The groups are gone whatever comes of this.
void RemoveFromLists(const Keys &deleted)
{
    const tavo::KeepFault keep;
    tavo::HashOwner names(PshTLIBSzHashAlloc(1024));
    for (const std::string &key : deleted)
        if (!names || TLIBSzHashSetValue(names.Addr(), ('@' + key).c_str(), "") < 0)
            return LogError("%s:%d Failed to note the removal of [%s]", key.c_str());
    if (const int code = tavo::ChangeGroupsInShares(names.Get()))
        LogError("%s:%d Delete groups in shares failed. tavoerr=0x%04X", code);
    if (TAVOUserModifySmbConf(names.Get()) != 0)
        LogError("%s:%d Delete groups in smb.conf failed.");
}

}  // namespace

extern "C" int TAVOGroupDelete(const char *const *rgszName, int nGroup)
{
    if (nGroup == 0)
        return 0;
    if (!rgszName || nGroup < 0)
        return Fail(ERR_BAD_PARAMETERS);
    return Guard([&] {
        tavo::AccountSession session(tavo::kGroupKind);
        if (const int code = session.OpenToChange(kLocks))
            return Fail(code);
        Keys deleted;
        session.BeginChange();
        for (int i = 0; i < nGroup; ++i)
            DeleteOne(tavo::GroupDb(session), rgszName[i], deleted);
        if (const int code = tavo::CommitGroups(session))
            return Fail(code);
        if (!deleted.empty())
            RemoveFromLists(deleted);
        return session.Unlock() ? 0 : Fail(ERR_UNLOCK_FAILED);
    });
}
