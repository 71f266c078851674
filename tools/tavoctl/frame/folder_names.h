// What lies in a folder of the kernel's or of the devices'.
#ifndef TAVOCTL_FOLDER_NAMES_H
#define TAVOCTL_FOLDER_NAMES_H

#include <string>
#include <vector>

namespace tavoctl {

// The names in a folder, sorted; none when there is no such folder. Throws a Failure when it cannot be read to its end:
// a device whose holders nobody can list must not pass for a free one.
std::vector<std::string> FolderNames(const std::string &path);

}  // namespace tavoctl

#endif
