// A throw-away copy of the whole root for one job.
#pragma once

#include <string>

namespace machine {

// Puts the calling process into a copy of the root whose changes end with it. Devices, /proc, /sys and /host are the
// machine's own. What lies in the folder layer (if any) lies over the root there. Throws std::system_error.
void EnterFreshRoot(const std::string &layer);

}  // namespace machine
