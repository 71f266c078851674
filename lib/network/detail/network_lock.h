// The lock of the network's files: the host lock, exclusive or shared, without waiting inside the kernel.
#ifndef TAVO_NETWORK_DETAIL_NETWORK_LOCK_H
#define TAVO_NETWORK_DETAIL_NETWORK_LOCK_H

#include "tavo_lock.h"

namespace tavo {

inline constexpr unsigned kNetworkExclusive = TAVO_LOCK_HOST | TAVO_LOCK_EXCLUSIVE | TAVO_LOCK_NONBLOCKING;
inline constexpr unsigned kNetworkShared = TAVO_LOCK_HOST | TAVO_LOCK_SHARED | TAVO_LOCK_NONBLOCKING;
inline constexpr int kNetworkSeconds = 5;

}  // namespace tavo

#endif
