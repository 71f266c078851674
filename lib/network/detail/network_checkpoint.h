// A checkpoint of the whole network, which belongs to the process that took it: /etc/network.checkpoint. When that
// process has died without ending it, the network is restored.
#ifndef TAVO_NETWORK_DETAIL_NETWORK_CHECKPOINT_H
#define TAVO_NETWORK_DETAIL_NETWORK_CHECKPOINT_H

#include "core/detail/where.h"

namespace tavo {

// Each is called under the network lock, and gives 0 or a code.

// ERR_FILE_EXISTS: another process has one.
int TakeNetworkCheckpoint(Where where = Where());

// ERR_FILE_NOT_FOUND: there is none.
int EndNetworkCheckpoint();

// The same, after restoring the network. ERR_OP_FAILURE: an address could not be set.
int PutBackNetworkCheckpoint();

// Puts back one whose process is not there any more; after a restart of the system its files only.
void PutBackAbandonedCheckpoint(Where where = Where());

}  // namespace tavo

#endif
