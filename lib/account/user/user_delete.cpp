// Deletes users.
#include "tavo_appliance.h"
#include "tavo_quota.h"
#include "tavo_user.h"

#include "account/detail/account_name.h"
#include "account/detail/account_transaction.h"
#include "account/detail/smb_connections.h"
#include "account/detail/user_dump.h"
#include "account/detail/user_texts.h"
#include "core/detail/guard.h"
#include "core/detail/keep_fault.h"
#include "core/detail/list_owner.h"
#include "core/detail/log.h"
#include "core/detail/setting_switch.h"

#include <set>

namespace {

struct Doomed {
    std::string key;
    std::string name;  // spelled as in the store
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
        const tavo::Result<tavo::PasswdLine> account =
            key ? tavo::ReadPasswdLine(db, *key) : tavo::Result<tavo::PasswdLine>(ERR_KEY_NOT_FOUND);
        const tavo::Code code = account.Failure();
        if (code == ERR_KEY_NOT_FOUND) {
            Fail(ERR_NO_SUCH_USER);
            LogError("%s:%d User [%s] does not exist", names[i]);
        } else if (code != 0) {
            Fail(code);
            LogError("%s:%d Failed to delete user [%s], tavoerr=0x%04X", names[i], code);
        } else if (!seen.insert(*key).second) {
            LogError("%s:%d Duplicate username:%s", names[i]);
        } else {
            doomed.push_back({*key, account->name, account->uid});
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

void TellServices(const std::vector<Doomed> &doomed)
{
    if (tavo::ReadSetting(tavo::kFactorySettings, "support_download", "yes").value_or(false) &&
        TAVOSchedulerHup(tavo::kReadAccountsAgain) != 0)
        LogError("%s:%d Failed to signal scheduled.");
    if (tavo::ReadSetting(tavo::kSettings, "runsamba", "yes").value_or(true))
        for (const Doomed &user : doomed)
            tavo::EndSmbConnections(user.name);
}

// The other parts of the appliance that know these users.
void PlanRemoval(const std::vector<Doomed> &doomed, tavo::AccountTransaction &change)
{
    const tavo::KeepFault keep;
    tavo::Marker &steps = change.Files().Steps();
    std::vector<std::string> names;
    for (const Doomed &user : doomed) {
        names.push_back(user.name);
        steps.names.push_back({.targets = tavo::kSambaLists | tavo::kMemberLists | tavo::kBackupUsers,
                               .old_name = user.name,
                               .new_name = {}});
        if (!change.Backup().Remove(user.name))
            LogError("%s:%d Failed to remove the network backup credentials of [%s]", user.name);
    }
    const tavo::HomePlan plan = tavo::PlanRemovals(names, steps);
    for (const std::string &name : plan.unknown)
        LogError("%s:%d Failed to look for the home folder of [%s], errno=%d", name, plan.reason);
}

}  // namespace

extern "C" int TAVOUserDelete(const char *const *rgszName, int nUser)
{
    if (nUser == 0)
        return 0;
    if (!rgszName || nUser < 0)
        return Fail(ERR_BAD_PARAMETERS);
    return Guard([&] {
        tavo::AccountTransaction change(tavo::kUserKind);
        if (const tavo::Code code = change.Begin(tavo::kAccountLocks))
            return Fail(code);
        TAVOUSERDB db = tavo::UserDb(change.Session());
        const std::vector<Doomed> doomed = Collect(db, rgszName, nUser);
        ClearQuotas(doomed);
        change.Session().BeginChange();
        for (const Doomed &user : doomed) {
            if (const tavo::Code code = tavo::RemoveUser(db, user.key, user.uid)) {
                LogError("%s:%d Failed to delete user [%s], tavoerr=0x%04X", user.name, code);
                return Fail(code);
            }
        }
        if (!doomed.empty()) {
            TellServices(doomed);
            PlanRemoval(doomed, change);
        }
        return tavo::FinishUsers(change, !doomed.empty());
    });
}
