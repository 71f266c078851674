// Writes the four account files from the open stores.
#include "tavo_appliance.h"
#include "tavo_user.h"

#include "account/detail/account_transaction.h"
#include "account/detail/commit_resume.h"
#include "account/detail/family_dump.h"
#include "account/detail/name_caches.h"
#include "account/detail/user_accounts.h"
#include "account/detail/user_batch.h"
#include "account/detail/user_dump.h"
#include "core/detail/guard.h"
#include "core/detail/log.h"

namespace {

using tavo::DumpReport;

constexpr int kLockSeconds = 5;

// Accounts of the system have no Samba password and no privileges: nothing that needs looking after.
void LogMissing(const DumpReport &report)
{
    for (const DumpReport::Missing &missing : report.missing)
        LogDebug("%s:%d No record of [%s] for %s", missing.name, missing.file);
}

void LogDropped(const DumpReport &report)
{
    for (const std::string &line : report.passwd.dropped)
        LogError("%s:%d Line [%s] of %s is not an account and is not written again", line,
                 tavo::kUserTextRows[tavo::kPasswdText].path);
}

int FailUserDump(int code, const DumpReport &report)
{
    if (report.not_opened)
        LogError("%s:%d fail to open file[%s]", report.not_opened);
    else if (!report.passwd.lost.empty())
        LogError("%s:%d Account [%s] would be lost, the files are left alone", report.passwd.lost);
    else
        LogError("%s:%d Failed to write the account files, tavoerr=0x%04X, errno=%d", code, errno);
    return Fail(code);
}

// The files have changed by then. Stores without the times are only built again.
void RecordTimes(const TAVOUSERDB &db) noexcept
try {
    TAVOBDB *const stores[] = {db.pName, db.pMisc, db.pShadow, db.pSmb, db.pUid};
    tavo::RecordSyncTimes(tavo::kUserFamily, stores);
} catch (const std::bad_alloc &) {
}

}  // namespace

int tavo::CommitUsers(AccountTransaction &change)
{
    DumpReport report;
    int code = change.Files().Samba().Take(kLockSeconds);
    if (code == 0) {
        change.Compose();
        code = change.ComposeAccounts([&] {
            report = {};
            return ComposeUsers(UserDb(change.Session()), change.Files(), report);
        });
    }
    LogMissing(report);
    if (code == 0)
        code = change.Commit();
    if (code != 0)
        return FailUserDump(code, report);
    LogDropped(report);
    return 0;
}

int tavo::FinishUsers(AccountTransaction &change, bool changed, Where where)
{
    if (changed && CommitUsers(change) != 0)
        return -1;
    if (!changed && change.Session().Seal(AccountSession::Texts::as_before) != 0)
        LogErrorAt(where, "%s:%d Failed to close the account stores, errno=%d", errno);
    const bool unlocked = change.End();
    TLIBScemdNotify(kAccountsChanged);
    return unlocked ? 0 : Fail(ERR_UNLOCK_FAILED, where);
}

extern "C" int TAVOUserDBDump(TAVOUSERDB *pDb)
{
    if (!pDb || !pDb->pName || !pDb->pMisc || !pDb->pShadow || !pDb->pSmb || !pDb->pUid)
        return Fail(ERR_BAD_PARAMETERS);
    return Guard([&] {
        tavo::DumpReport report;
        tavo::Marker earlier;
        if (const tavo::Code code = tavo::ResumeCommit(earlier))
            return FailUserDump(code, report);
        tavo::AccountCommit commit(std::move(earlier));
        int code = commit.Samba().Take(kLockSeconds);
        if (code == 0)
            code = tavo::ComposeUsers(*pDb, commit, report);
        LogMissing(report);
        if (code == 0)
            code = commit.Commit();
        if (code != 0)
            return FailUserDump(code, report);
        LogDropped(report);
        RecordTimes(*pDb);
        commit.Samba().Release();
        commit.Settle();
        tavo::FlushNameCaches();
        return 0;
    });
}
