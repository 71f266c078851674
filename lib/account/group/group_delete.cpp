// Deletes groups.
#include "tavo_group.h"
#include "tavo_lock.h"

#include "account/detail/account_name.h"
#include "account/detail/account_transaction.h"
#include "account/detail/group_accounts.h"
#include "account/detail/group_dump.h"
#include "account/detail/group_texts.h"
#include "core/detail/guard.h"
#include "core/detail/log.h"

#include <map>

namespace {

constexpr unsigned kLocksOfDelete = TAVO_LOCK_GROUP | TAVO_LOCK_SMB;

using Deleted = std::map<std::string, std::string>;  // key to name

// Deletes one group; a failure is logged and stays in the error state. False when the stores may be damaged: then the
// whole call is discarded.
bool DeleteOne(const TAVOGROUPDB &db, const char *name, Deleted &deleted)
{
    if (name && tavo::IsDomainName(name))
        return true;  // lives in its domain
    const std::optional<std::string> key = name ? tavo::AccountKey(name, tavo::kGroupKeySize) : std::nullopt;
    if (key && deleted.contains(*key)) {
        LogNotice("%s:%d Duplicate group name:[%s]", name);
        return true;
    }
    const tavo::Result<tavo::GroupLine> group =
        key ? tavo::ReadGroupLine(db, *key) : tavo::Result<tavo::GroupLine>(ERR_NO_SUCH_GROUP);
    int code = group.Failure();
    if (code == ERR_NO_SUCH_GROUP) {
        Fail(code);
        LogError("%s:%d Group [%s] does not exist", name ? name : "");
        return true;
    }
    if (code == 0)
        code = tavo::RemoveGroup(db, *key, group->gid);
    if (code != 0) {
        Fail(code);
        LogError("%s:%d TAVOGroupDBDelete %s failed. tavoerr=0x%04X", name, code);
        return false;
    }
    deleted.emplace(*key, group->name);
    return true;
}

}  // namespace

extern "C" int TAVOGroupDelete(const char *const *rgszName, int nGroup)
{
    if (nGroup == 0)
        return 0;
    if (!rgszName || nGroup < 0)
        return Fail(ERR_BAD_PARAMETERS);
    return Guard([&] {
        tavo::AccountTransaction change(tavo::kGroupKind);
        if (const tavo::Code code = change.Begin(kLocksOfDelete))
            return Fail(code);
        Deleted deleted;
        change.Session().BeginChange();
        for (int i = 0; i < nGroup; ++i)
            if (!DeleteOne(tavo::GroupDb(change.Session()), rgszName[i], deleted))
                return -1;
        for (const auto &[key, name] : deleted)
            change.Files().Steps().names.push_back(
                {.is_group = true, .targets = tavo::kShareLists | tavo::kSambaLists, .old_name = name, .new_name = {}});
        if (const tavo::Code code = tavo::CommitGroups(change))
            return Fail(code);
        return change.End() ? 0 : Fail(ERR_UNLOCK_FAILED);
    });
}
