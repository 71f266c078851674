// The record of shared folders, /usr/tavo/etc/share.conf: one section a share, with its path.
#ifndef TAVO_SERVICE_DETAIL_SHARE_FILE_H
#define TAVO_SERVICE_DETAIL_SHARE_FILE_H

#include <string>

namespace tavo {

// Each gives 0 or the code of what failed. Changes are made under the lock of the shares.

// The share's path; empty when it is not recorded.
int SharePath(const char *name, std::string &path);

// Sets the path of a share and keeps what else its section says; adds a share that is not there.
int RecordShare(const char *name, const std::string &path);

// A share that is not recorded is no failure.
int ForgetShare(const char *name);

}  // namespace tavo

#endif
