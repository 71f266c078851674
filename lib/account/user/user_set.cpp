// Adds, changes and renames users.
#include "tavo_appliance.h"
#include "tavo_user.h"

#include "account/detail/account_transaction.h"
#include "account/detail/user_dump.h"
#include "account/detail/user_texts.h"
#include "core/detail/guard.h"
#include "core/detail/keep_fault.h"
#include "core/detail/log.h"
#include "core/detail/setting_switch.h"

#include <strings.h>

namespace {

// The code of an entry that failed goes to the log and into the error state; the batch goes on.
void ReportEntry(const tavo::UserBatch::Outcome &outcome, const char *old_name, const TAVOUSER *user)
{
    const char *name = user && user->szName ? user->szName : "";
    if (outcome.duplicate)
        LogError("%s:%d Duplicated key:[%s]", old_name);
    if (outcome.absent)
        LogError("%s:%d szOldName=[%s] is NOT EXIST.", old_name);
    LogNotice("%s:%d Failed to set user [%s], tavoerr=0x%04X", name, outcome.code);
    Fail(outcome.code);
}

void SetCredentials(const std::vector<tavo::DoneUser> &done, tavo::NetBackupUsers &backup)
{
    const tavo::KeepFault keep;
    for (const tavo::DoneUser &user : done)
        if (!backup.Set(user.old_name, user.name, user.new_password ? user.password : nullptr))
            LogError("%s:%d Failed to set the network backup credentials of [%s]", user.name);
}

// The other parts of the appliance that know these users.
void PlanFollowUp(const std::vector<tavo::DoneUser> &done, tavo::AccountTransaction &change)
{
    // Where that cannot be read: only names that stand in the service's files are changed there.
    const bool has_backup = tavo::ReadSetting(tavo::kFactorySettings, "netbkp", "yes").value_or(true);
    tavo::Marker &steps = change.Files().Steps();
    const unsigned targets =
        tavo::kSambaLists | tavo::kMemberLists | tavo::kFtpList | (has_backup ? unsigned{tavo::kBackupUsers} : 0);
    for (const tavo::DoneUser &user : done) {
        if (user.IsRenamed())
            steps.names.push_back({.targets = targets, .old_name = user.old_name, .new_name = user.name});
        if (::strcasecmp(user.name.c_str(), "guest") == 0)
            steps.names.push_back({.targets = tavo::kGuestModule,
                                   .old_name = user.name,
                                   .new_name = !user.password || !*user.password ? "yes" : "no"});
    }
    if (has_backup)
        SetCredentials(done, change.Backup());
    const tavo::HomePlan plan = tavo::PlanHomes(done, steps);
    for (const std::string &name : plan.unknown)
        LogError("%s:%d Failed to look for the home folder of [%s], errno=%d", name, plan.reason);
}

// True when the stores can still be trusted.
bool ApplyAll(tavo::UserBatch &batch, const char *const *old_names, const TAVOUSER *const *users, int count)
{
    for (int i = 0; i < count; ++i) {
        const tavo::UserBatch::Outcome outcome = batch.Apply(old_names[i], users[i]);
        if (outcome.code != 0)
            ReportEntry(outcome, old_names[i], users[i]);
        if (outcome.damaged)
            return false;
    }
    return true;
}

}  // namespace

extern "C" int TAVOUserSet(const char *const *rgszOldName, const TAVOUSER *const *rgpUser, int nUser)
{
    if (nUser == 0)
        return 0;
    if (!rgszOldName || !rgpUser || nUser < 0)
        return Fail(ERR_BAD_PARAMETERS);
    return Guard([&] {
        tavo::AccountTransaction change(tavo::kUserKind);
        if (const tavo::Code code = change.Begin(tavo::kAccountLocks))
            return Fail(code);
        TAVOUSERDB db = tavo::UserDb(change.Session());
        tavo::UserBatch batch(db, [&](const std::string &key) { return change.IsPending(false, key); });
        change.Session().BeginChange();
        if (!ApplyAll(batch, rgszOldName, rgpUser, nUser))
            return -1;
        if (tavo::ReadSetting(tavo::kFactorySettings, "support_download", "yes").value_or(false) &&
            TAVOSchedulerHup(tavo::kReadAccountsAgain) != 0)
            LogError("%s:%d Failed to signal scheduled.");
        if (!batch.Done().empty())
            PlanFollowUp(batch.Done(), change);
        return tavo::FinishUsers(change, !batch.Done().empty());
    });
}
