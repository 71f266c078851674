// The credentials of the network backup service. /usr/tavo/etc/netbkp.users names those who are authorised, one a line;
// /etc/rsyncd.secrets holds their passwords ("name:password"), as the rsync daemon wants them. "admin" is "root" there.
#ifndef TAVO_ACCOUNT_DETAIL_NET_BACKUP_USERS_H
#define TAVO_ACCOUNT_DETAIL_NET_BACKUP_USERS_H

#include "account/detail/name_lines.h"
#include "core/detail/result.h"

namespace tavo {

inline constexpr char kNetBackupUsers[] = "/usr/tavo/etc/netbkp.users";
inline constexpr char kRsyncSecrets[] = "/etc/rsyncd.secrets";

class NetBackupUsers {
  public:
    // Keeps the credentials of an authorised user in step: `old_name` empty for an added one, `password` in clear text,
    // or nullptr when it did not change. A rename also renames in the list of those authorised.
    // False when a file cannot be read, or cannot hold the password: then there is none any more.
    bool Set(const std::string &old_name, const std::string &name, const char *password);

    bool Remove(const std::string &name);

    bool IsUnreadable() const { return authorised_.IsUnreadable() || secrets_.IsUnreadable(); }
    bool IsChanged() const { return authorised_.IsChanged() || secrets_.IsChanged(); }

    // Adds what has changed to a commit. 0 or a code of AccountCommit::WriteNeighbour.
    Code Compose(unsigned target, AccountCommit &commit);

  private:
    NameLines authorised_{kNetBackupUsers};
    NameLines secrets_{kRsyncSecrets};
};

}  // namespace tavo

#endif
