// Adds, changes and renames users.
#include "tavo_user.h"

#include "account/detail/account_session.h"
#include "account/detail/ftp_chroot_list.h"
#include "account/detail/net_backup_users.h"
#include "account/detail/setting_switch.h"
#include "account/detail/user_follow_up.h"
#include "account/detail/user_texts.h"
#include "core/detail/guard.h"
#include "core/detail/keep_fault.h"
#include "core/detail/log.h"
#include "tavo_appliance.h"
#include "tavo_group.h"
#include "tavo_lock.h"

#include <strings.h>

namespace {

constexpr unsigned kLocks = TAVO_LOCK_USER | TAVO_LOCK_GROUP | TAVO_LOCK_SMB;
constexpr int kReadAccountsAgain = 10;  // for the download scheduler
constexpr int kAccountsChanged = 47;    // for the event daemon

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

void RenameEverywhere(const std::vector<tavo::DoneUser> &done)
{
    const tavo::KeepFault keep;  // the accounts are renamed whatever comes of this
    tavo::HashOwner names;
    for (const tavo::DoneUser &user : done)
        if (user.IsRenamed() && !tavo::AddNameChange(names, user.old_name, user.name))
            LogError("%s:%d Failed to note the rename of [%s]", user.old_name);
    if (!names)
        return;
    if (TAVOUserModifySmbConf(names.Get()) != 0)
        LogError("%s:%d Rename users in smb.conf failed. tavoerr=0x%04X", tavoerrno);
    if (TAVOUserModifyGroup(names.Get()) != 0)
        LogError("%s:%d Rename users in groups failed. tavoerr=0x%04X", tavoerrno);
}

void FollowGuest(const tavo::DoneUser &user)
{
    if (::strcasecmp(user.name.c_str(), "guest") != 0)
        return;
    if (const int code = tavo::SetGuestAfpd(!user.password || !*user.password)) {
        Fail(code);
        LogError("%s:%d SDKISetGuestAfpd failed");
    }
}

void FollowUp(const std::vector<tavo::DoneUser> &done)
{
    const bool homes = tavo::SettingIsYes(tavo::kSettings, "userHomeEnable");
    const bool has_backup = tavo::SettingIsYes(tavo::kFactorySettings, "netbkp");
    RenameEverywhere(done);
    for (const tavo::DoneUser &user : done)
        FollowGuest(user);
    tavo::NetBackupUsers backup;
    for (const tavo::DoneUser &user : done)
        if (has_backup && !backup.Set(user.old_name, user.name, user.new_password ? user.password : nullptr))
            LogError("%s:%d Failed to set the network backup credentials of [%s]", user.name);
    if (!backup.Store())
        LogError("%s:%d Failed to store the network backup credentials, errno=%d", errno);
    for (const tavo::DoneUser &user : done) {
        if (homes && user.IsAdded() && !tavo::CreateHome(user))
            LogError("%s:%d Failed to create the home folder of [%s], errno=%d", user.name, errno);
        if (homes && user.IsRenamed() && !tavo::MoveHome(user.old_name, user.name))
            LogError("%s:%d Failed to move the home folder of [%s], errno=%d", user.old_name, errno);
    }
    tavo::FtpChrootList ftp;
    for (const tavo::DoneUser &user : done)
        if (user.IsRenamed() && !ftp.Rename(user.old_name, user.name))
            LogError("%s:%d Failed to rename [%s] in the FTP chroot list", user.old_name);
    if (!ftp.Store())
        LogError("%s:%d Failed to store the FTP chroot list, errno=%d", errno);
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
        tavo::AccountSession session(tavo::kUserKind);
        if (const int code = session.OpenToChange(kLocks))
            return Fail(code);
        TAVOUSERDB db = tavo::UserDb(session);
        tavo::UserBatch batch(db);
        session.BeginChange();
        if (!ApplyAll(batch, rgszOldName, rgpUser, nUser))
            return -1;
        if (tavo::SettingIsYes(tavo::kFactorySettings, "support_download") && TAVOSchedulerHup(kReadAccountsAgain) != 0)
            LogError("%s:%d Failed to signal scheduled.");
        if (!batch.Done().empty() && TAVOUserDBDump(&db) != 0)
            return -1;
        using Texts = tavo::AccountSession::Texts;
        if (session.Seal(batch.Done().empty() ? Texts::kAsBefore : Texts::kWritten) != 0)
            LogError("%s:%d Failed to close the account stores, errno=%d", errno);
        FollowUp(batch.Done());
        const bool unlocked = session.Unlock();
        TLIBScemdNotify(kAccountsChanged);
        return unlocked ? 0 : Fail(ERR_UNLOCK_FAILED);
    });
}
