// A throw-away copy of the whole root for one job.
#pragma once

#include <string>

namespace machine {

// Puts the calling process into a copy of the root whose changes end with it. Devices, /sys and links are the machine's
// own; with a folder as layer, which is mounted over the root, they are those of the ordinary appliance root.
// The host's folder is also shown as host_at, unless that is empty. Throws std::system_error.
void EnterFreshRoot(const std::string &layer, const std::string &host_at);

}  // namespace machine
