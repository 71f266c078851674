// Deletes users.
#include "tavo_user.h"

#include "account/detail/account_name.h"
#include "account/detail/account_session.h"
#include "account/detail/net_backup_users.h"
#include "account/detail/setting_switch.h"
#include "account/detail/smb_connections.h"
#include "account/detail/user_follow_up.h"
#include "account/detail/user_texts.h"
#include "core/detail/guard.h"
#include "core/detail/keep_fault.h"
#include "core/detail/log.h"
#include "tavo_appliance.h"
#include "tavo_group.h"
#include "tavo_lock.h"
#include "tavo_quota.h"

#include <set>

namespace {

constexpr unsigned kLocks = TAVO_LOCK_USER | TAVO_LOCK_GROUP | TAVO_LOCK_SMB;
constexpr int kReadAccountsAgain = 10;  // for the download scheduler

struct Doomed {
    std::string key;
    std::string name;  // as it stands in the store
    int32_t uid;
};

// The accounts that are to go, each once.
std::vector<Doomed> Collect(const TAVOUSERDB &db, const char *const *names, int count)
{
    std::vector<Doomed> doomed;
    std::set<std::string> seen;
    for (int i = 0; i < count; ++i) {
        const std::optional<std::string> key = names[i] ? tavo::AccountKey(names[i]) : std::nullopt;
        if (!names[i] || (key && tavo::IsReservedKey(*key))) {
            Fail(ERR_USER_DB_DELETE);
            LogError("%s:%d User [%s] cannot be deleted", names[i]);
            continue;
        }
        if (tavo::IsDomainName(names[i]))
            continue;
        tavo::PasswdLine account;
        if (!key || tavo::ReadPasswdLine(db, *key, account) != 0) {
            Fail(ERR_NO_SUCH_USER);
            LogError("%s:%d User [%s] does not exist", names[i]);
        } else if (!seen.insert(*key).second) {
            LogError("%s:%d Duplicate username:%s", names[i]);
        } else {
            doomed.push_back({*key, account.name, account.uid});
        }
    }
    return doomed;
}

// While the names still have their user ids.
void ClearQuotas(const std::vector<Doomed> &doomed)
{
    if (doomed.empty() || TAVOSupportQUOTA() == 0)
        return;
    const tavo::KeepFault keep;
    tavo::ListOwner names(PslTLIBSzListAlloc(1024));
    for (const Doomed &user : doomed)
        if (!names || TLIBSzListPush(names.Addr(), user.name.c_str()) < 0)
            return LogError("%s:%d TAVOQuotaClean error.");
    if (TAVOQuotaCleanAllVols(names.Get()) != 0)
        LogError("%s:%d TAVOQuotaClean error.");
}

void RemoveFromLists(const std::vector<Doomed> &doomed)
{
    const tavo::KeepFault keep;  // the accounts are gone whatever comes of this
    tavo::HashOwner names;
    for (const Doomed &user : doomed)
        if (!tavo::AddNameChange(names, user.name, ""))
            LogError("%s:%d Failed to note the removal of [%s]", user.name);
    if (!names)
        return;
    if (TAVOUserModifySmbConf(names.Get()) != 0)
        LogError("%s:%d Delete users in smb.conf failed. tavoerr=0x%04X", tavoerrno);
    if (TAVOUserModifyGroup(names.Get()) != 0)
        LogError("%s:%d Delete users in groups failed. tavoerr=0x%04X", tavoerrno);
    tavo::NetBackupUsers backup;
    for (const Doomed &user : doomed)
        if (!backup.Remove(user.name))
            LogError("%s:%d Failed to remove the network backup credentials of [%s]", user.name);
    if (!backup.Store())
        LogError("%s:%d Failed to store the network backup credentials, errno=%d", errno);
}

void RemoveFolders(const std::vector<Doomed> &doomed)
{
    std::vector<std::string> names;
    for (const Doomed &user : doomed)
        names.push_back(user.name);
    if (!tavo::RemoveHomes(names)) {
        Fail(ERR_REMOVE_FAILED);
        LogError("%s:%d Remove user folders failed");
    }
}

}  // namespace

extern "C" int TAVOUserDelete(const char *const *rgszName, int nUser)
{
    if (nUser == 0)
        return 0;
    if (!rgszName || nUser < 0)
        return Fail(ERR_BAD_PARAMETERS);
    return Guard([&] {
        tavo::AccountSession session(tavo::kUserKind);
        if (const int code = session.OpenToChange(kLocks))
            return Fail(code);
        TAVOUSERDB db = tavo::UserDb(session);
        const std::vector<Doomed> doomed = Collect(db, rgszName, nUser);
        ClearQuotas(doomed);
        session.BeginChange();
        for (const Doomed &user : doomed) {
            if (const int code = tavo::RemoveUser(db, user.key, user.uid)) {
                LogError("%s:%d Failed to delete user [%s], tavoerr=0x%04X", user.name, code);
                return Fail(code);
            }
        }
        if (!doomed.empty()) {
            if (tavo::SettingIsYes(tavo::kFactorySettings, "support_download") &&
                TAVOSchedulerHup(kReadAccountsAgain) != 0)
                LogError("%s:%d Failed to signal scheduled.");
            if (tavo::SettingIsYes(tavo::kSettings, "runsamba"))
                for (const Doomed &user : doomed)
                    tavo::EndSmbConnections(user.name);
            if (TAVOUserDBDump(&db) != 0)
                return -1;
        }
        using Texts = tavo::AccountSession::Texts;
        if (session.Seal(doomed.empty() ? Texts::kAsBefore : Texts::kWritten) != 0)
            LogError("%s:%d Failed to close the account stores, errno=%d", errno);
        RemoveFromLists(doomed);
        if (!doomed.empty())
            RemoveFolders(doomed);
        return session.Unlock() ? 0 : Fail(ERR_UNLOCK_FAILED);
    });
}
