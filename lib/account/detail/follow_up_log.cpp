// How the log names what follows a change of accounts and could not be done.
#include "account/detail/follow_up_log.h"

#include "core/detail/fault.h"
#include "core/detail/log.h"

namespace tavo {
namespace {

void LogHome(const FollowUpFailure &failure, Where where)
{
    if (!failure.home || failure.home->kind == HomeStep::kRemove) {
        Fail(ERR_REMOVE_FAILED, where);
        LogErrorAt(where, "%s:%d Remove user folders failed");
    } else if (failure.home->kind == HomeStep::kMove) {
        LogErrorAt(where, "%s:%d Failed to move the home folder of [%s], errno=%d", failure.home->name, failure.code);
    } else {
        LogErrorAt(where, "%s:%d Failed to create the home folder of [%s], errno=%d", failure.home->name, failure.code);
    }
}

}  // namespace

void LogFollowUp(const FollowUpFailure &failure, Where where) noexcept
{
    switch (failure.target) {
    case kSambaLists:
        if (failure.is_group && failure.is_removal)
            LogErrorAt(where, "%s:%d Delete groups in smb.conf failed.");
        else if (failure.is_group)
            LogErrorAt(where, "%s:%d Rename group in smb.conf failed.");
        else
            LogErrorAt(where, "%s:%d Change users in smb.conf failed. tavoerr=0x%04X", failure.code);
        break;
    case kShareLists:
        LogErrorAt(where, "%s:%d Change groups in shares failed. tavoerr=0x%04X", failure.code);
        break;
    case kMemberLists:
        LogErrorAt(where, "%s:%d Change users in groups failed. tavoerr=0x%04X", failure.code);
        break;
    case kFtpList:
        LogErrorAt(where, "%s:%d Failed to change the FTP chroot list, tavoerr=0x%04X", failure.code);
        break;
    case kBackupUsers:
        LogErrorAt(where, "%s:%d Failed to change the network backup credentials, tavoerr=0x%04X", failure.code);
        break;
    case kGuestModule:
        Fail(failure.code, where);
        LogErrorAt(where, "%s:%d SDKISetGuestAfpd failed");
        break;
    default:
        LogHome(failure, where);
        break;
    }
}

}  // namespace tavo
