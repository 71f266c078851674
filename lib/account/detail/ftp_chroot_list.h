// The users whom the FTP service keeps in their home folder: /etc/ftpchroot, one name a line.
#ifndef TAVO_ACCOUNT_DETAIL_FTP_CHROOT_LIST_H
#define TAVO_ACCOUNT_DETAIL_FTP_CHROOT_LIST_H

#include <string>

namespace tavo {

// When the old name is in the list (in any case), it goes and the new one is added. False when the list cannot be
// rewritten; true also when there is none.
bool RenameInFtpChrootList(const std::string &old_name, const std::string &new_name);

}  // namespace tavo

#endif
