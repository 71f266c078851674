// The record of shared folders, /usr/tavo/etc/share.conf: one section per share, with its path.
#ifndef TAVO_SERVICE_DETAIL_SHARE_FILE_H
#define TAVO_SERVICE_DETAIL_SHARE_FILE_H

#include "core/detail/result.h"

#include <string>

namespace tavo {

// Changes are made under the lock of the shares.

// Returns the share's path; empty when it is not recorded.
Result<std::string> SharePath(const char *name);

// Sets the path of a share and keeps the other keys of its section; adds a missing share.
Code RecordShare(const char *name, const std::string &path);

// Removing a share that is not recorded succeeds.
Code ForgetShare(const char *name);

}  // namespace tavo

#endif
