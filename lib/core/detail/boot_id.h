// This run of the machine.
#ifndef TAVO_CORE_DETAIL_BOOT_ID_H
#define TAVO_CORE_DETAIL_BOOT_ID_H

#include <string>

namespace tavo {

// The line of /proc/sys/kernel/random/boot_id, another one after each start of the kernel; "unknown" when it cannot be read.
std::string BootId();

}  // namespace tavo

#endif
