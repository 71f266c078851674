// Writes the four text files of the user family from its open stores.
#ifndef TAVO_ACCOUNT_DETAIL_USER_DUMP_H
#define TAVO_ACCOUNT_DETAIL_USER_DUMP_H

#include "tavo_user.h"

#include "account/detail/account_commit.h"
#include "account/detail/indexed_accounts.h"
#include "core/detail/result.h"
#include "core/detail/where.h"

#include <string>
#include <vector>

namespace tavo {

class AccountTransaction;

// What a rewrite of the files has to tell: the caller logs it.
struct DumpReport {
    struct Missing {
        std::string name;  // of an account
        const char *file;  // that has no line of it
    };
    std::vector<Missing> missing;
    const char *not_opened = nullptr;  // the temporary file of ERR_OPEN_FAILED
    FileReview passwd;                 // what becomes of the lines of /etc/passwd
};

// Adds the files to a commit. 0, ERR_OPEN_FAILED, ERR_WRITE_FAILED, ERR_NOT_ENOUGH_SPACE, ERR_FORMAT_ERROR (a store holds a
// line that is not an account), or a code of the stores.
Code ComposeUsers(const TAVOUSERDB &db, AccountCommit &commit, DumpReport &report);

// Composes the files and commits everything: the end of every change of users. A failure is logged and reported under the
// name of TAVOUserDBDump, which log watchers know: -1.
int CommitUsers(AccountTransaction &change);

// The tail of a function that changes users: commits, or closes the stores as they were when nothing changed, releases
// the locks, and notifies. 0, or -1 with ERR_UNLOCK_FAILED at `where` or what CommitUsers reported.
int FinishUsers(AccountTransaction &change, bool changed, Where where = Where());

}  // namespace tavo

#endif
