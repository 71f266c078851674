// The end of every change of the open group stores: the files are written, the stores closed and sealed.
#ifndef TAVO_ACCOUNT_DETAIL_GROUP_COMMIT_H
#define TAVO_ACCOUNT_DETAIL_GROUP_COMMIT_H

#include "account/detail/account_session.h"
#include "account/detail/group_accounts.h"
#include "account/detail/group_dump.h"
#include "core/detail/log.h"

#include <cerrno>

namespace tavo {

// A code of DumpGroups, logged under the name of the function that wrote; stores that could not be closed are built anew
// by the next call, so that is logged only.
inline int CommitGroups(AccountSession &session, Where where = Where())
{
    GroupDumpReport report;
    if (const int code = DumpGroups(GroupDb(session), report)) {
        if (report.not_opened)
            LogErrorAt(where, "%s:%d fail to open file[%s]", report.not_opened);
        else if (!report.lost.empty())
            LogErrorAt(where, "%s:%d Group [%s] would be lost, the files are left alone", report.lost);
        else
            LogErrorAt(where, "%s:%d Failed to write the group files, tavoerr=0x%04X, errno=%d", code, errno);
        return code;
    }
    if (session.Seal(AccountSession::Texts::kWritten) != 0)
        LogErrorAt(where, "%s:%d Failed to close the group stores, errno=%d", errno);
    return 0;
}

}  // namespace tavo

#endif
