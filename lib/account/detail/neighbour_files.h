// The files of other programs that name users and groups, brought in line with a change.
#ifndef TAVO_ACCOUNT_DETAIL_NEIGHBOUR_FILES_H
#define TAVO_ACCOUNT_DETAIL_NEIGHBOUR_FILES_H

#include "account/detail/account_commit.h"
#include "account/detail/name_map.h"
#include "account/detail/net_backup_users.h"
#include "core/detail/result.h"

#include <vector>

namespace tavo {

// Composes the new file of one target for these steps, in their order, and adds it to the commit. A file that is not
// there has nothing to change. 0 or the code of what failed; then it is not part of the commit.
Code ComposeNeighbour(unsigned target, const std::vector<NameStep> &steps, NetBackupUsers &backup,
                      AccountCommit &commit);

// Removes the temporary files that a process left that died before its change was decided; some hold passwords. To be
// called with the system's lock on the account files.
void RemoveNeighbourTemporaries() noexcept;

// The credentials alone, as they were set.
Code ComposeBackup(NetBackupUsers &backup, AccountCommit &commit);

// The guest's module in the settings of the Apple file service. ERR_FILE_NOT_FOUND when it has no settings.
Code ComposeGuestModule(bool may_enter, AccountCommit &commit);

}  // namespace tavo

#endif
