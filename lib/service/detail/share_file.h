// The record of shared folders, /usr/tavo/etc/share.conf: one section per share, with its path.
#ifndef TAVO_SERVICE_DETAIL_SHARE_FILE_H
#define TAVO_SERVICE_DETAIL_SHARE_FILE_H

#include <string>

namespace tavo {

// Each function returns 0 or a code. Changes are made under the lock of the shares.

// Returns the share's path; empty when it is not recorded.
int SharePath(const char *name, std::string &path);

// Sets the path of a share and keeps the other keys of its section; adds a missing share.
int RecordShare(const char *name, const std::string &path);

// Removing a share that is not recorded succeeds.
int ForgetShare(const char *name);

}  // namespace tavo

#endif
