// Writes the two text files of the group family from its open stores.
#ifndef TAVO_ACCOUNT_DETAIL_GROUP_DUMP_H
#define TAVO_ACCOUNT_DETAIL_GROUP_DUMP_H

#include "tavo_group.h"

#include "account/detail/account_commit.h"
#include "account/detail/indexed_accounts.h"
#include "core/detail/result.h"
#include "core/detail/where.h"

namespace tavo {

class AccountTransaction;

// What a rewrite has to tell: the caller logs it.
struct GroupDumpReport {
    const char *not_opened = nullptr;  // the temporary file of ERR_OPEN_FAILED
    FileReview groups;                 // what becomes of the lines of /etc/group
};

// Adds the files to a commit. 0, ERR_OPEN_FAILED, ERR_WRITE_FAILED, ERR_NOT_ENOUGH_SPACE, ERR_FORMAT_ERROR (a store holds a
// line that is not a group), or a code of the stores.
Code ComposeGroups(const TAVOGROUPDB &db, AccountCommit &commit, unsigned target, GroupDumpReport &report);

// Logs the lines that are not written again because they are not groups.
void LogDroppedGroups(const GroupDumpReport &report, Where where);

// Composes the files and commits everything: the end of every change of groups. What goes wrong is logged at `where`.
int CommitGroups(AccountTransaction &change, Where where = Where());

}  // namespace tavo

#endif
