// Completes the commits of programs that died over them.
#ifndef TAVO_ACCOUNT_DETAIL_COMMIT_RESUME_H
#define TAVO_ACCOUNT_DETAIL_COMMIT_RESUME_H

#include "account/detail/commit_marker.h"
#include "account/detail/store_family.h"
#include "core/detail/result.h"

namespace tavo {

// Completes the moves of account files that a dead process left half done, and those of neighbours' files that are
// unchanged since. `marker` becomes what is left to do. 0, ERR_READ_FAILED or ERR_RENAME_FAILED.
Code ResumeCommit(Marker &marker);

// Does only the part that a reader needs: moves the account files. The marker stays for the next change when more steps
// follow.
Code FinishAccountFiles();

// Removes the temporary files of a family, unless a commit is to be completed with them. 0 or ERR_REMOVE_FAILED.
Code RemoveTemporaries(const StoreFamily &family);

}  // namespace tavo

#endif
