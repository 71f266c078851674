// The credentials of the network backup service. /usr/tavo/etc/netbkp.users names those who are authorised, one a line;
// /etc/rsyncd.secrets holds their passwords ("name:password"), as the rsync daemon wants them. "admin" is "root" there.
#ifndef TAVO_ACCOUNT_DETAIL_NET_BACKUP_USERS_H
#define TAVO_ACCOUNT_DETAIL_NET_BACKUP_USERS_H

#include <string>

namespace tavo {

// Keeps the credentials of an authorised user in step: `old_name` empty for an added one, `password` in clear text, or
// nullptr when it did not change. A rename also renames in the list of those authorised.
bool SetNetBackupUser(const std::string &old_name, const std::string &name, const char *password);

bool RemoveNetBackupUser(const std::string &name);

}  // namespace tavo

#endif
