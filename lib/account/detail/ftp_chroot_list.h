// The FTP service's list of users that it keeps in their home folder: /etc/ftpchroot, one name a line.
#ifndef TAVO_ACCOUNT_DETAIL_FTP_CHROOT_LIST_H
#define TAVO_ACCOUNT_DETAIL_FTP_CHROOT_LIST_H

#include "account/detail/name_lines.h"
#include "core/detail/result.h"

namespace tavo {

inline constexpr char kFtpChroot[] = "/etc/ftpchroot";

class FtpChrootList {
  public:
    // Removes the old name, if listed, and appends the new one. Returns false when the list cannot be read.
    bool Rename(const std::string &old_name, const std::string &new_name);

    Code Compose(unsigned target, AccountCommit &commit) { return names_.Compose(target, 0644, commit); }

  private:
    NameLines names_{kFtpChroot};
};

}  // namespace tavo

#endif
