// The order in which the dispatcher drives daemons.
#ifndef TAVO_SERVICE_DETAIL_DAEMON_ORDER_H
#define TAVO_SERVICE_DETAIL_DAEMON_ORDER_H

#include <cstdint>

namespace tavo {

// Drives the daemons in `mask`, each even when an earlier one failed. Returns the bits of those that succeeded, with
// another bit for the system's web server: its own would make the result negative, which callers take for a failure.
int DriveInOrder(uint32_t mask, int operation);

}  // namespace tavo

#endif
