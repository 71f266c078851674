// What Samba's programs still write into a password file that was replaced while they waited for its lock: some of them do
// not look whether the file that they have open is still the one of that name.
#ifndef TAVO_ACCOUNT_DETAIL_SAMBA_LATECOMERS_H
#define TAVO_ACCOUNT_DETAIL_SAMBA_LATECOMERS_H

#include <string>
#include <string_view>

namespace tavo {

// The new text with the lines that differ between `before` and `after`, the texts of the old file: for the account of that name
// and id, or of that id where it has been renamed. An account that is gone stays gone; a line that was added is appended.
std::string WithLateLines(std::string_view text, std::string_view before, std::string_view after);

// `old_fd` is locked and has lost its name to `new_fd`, which is locked, too. Lets the programs that have the old file open
// finish, at most for a second, and carries over what they write. Releases the lock of the old file. Throws bad_alloc.
void CarryOverLateLines(int old_fd, int new_fd);

}  // namespace tavo

#endif
