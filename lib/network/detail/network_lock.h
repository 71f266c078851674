// The lock of the network's files: the host lock (0x100), exclusive or shared, without waiting inside the kernel.
#ifndef TAVO_NETWORK_DETAIL_NETWORK_LOCK_H
#define TAVO_NETWORK_DETAIL_NETWORK_LOCK_H

namespace tavo {

inline constexpr unsigned kNetworkExclusive = 0x106;
inline constexpr unsigned kNetworkShared = 0x105;
inline constexpr int kNetworkSeconds = 5;

}  // namespace tavo

#endif
