// The names in a folder of /sys, /proc or /dev.
#ifndef TAVOCTL_FOLDER_NAMES_H
#define TAVOCTL_FOLDER_NAMES_H

#include <string>
#include <vector>

namespace tavoctl {

// The names in a folder, sorted; none when there is no such folder. Throws a Failure when it cannot be read to its end:
// a device whose users cannot be listed must not count as free.
std::vector<std::string> FolderNames(const std::string &path);

}  // namespace tavoctl

#endif
