// The discovery daemon as its callers see it: whether it runs, how it is started, and the place of its list.
#ifndef TAVO_NETWORK_DETAIL_DISCOVERY_DAEMON_H
#define TAVO_NETWORK_DETAIL_DISCOVERY_DAEMON_H

#include "core/detail/owner.h"

namespace tavo {

inline constexpr unsigned kAnswerSeconds = 10;  // for which the hosts on the network may answer

// True when a process of root holds the lock of the daemon's pid file. A process name proves nothing.
bool IsDiscoveryAlive();

// Starts it and waits 3 s. False when it leaves no pid then.
bool StartDiscovery();

// Removes a foreign file at the list's path, and creates an empty list where there is none: everybody may write to the
// folder. False with errno.
bool MakeHostList();

// Opens a list for reading; empty with errno when there is none, or when it is neither root's nor ours. Of the daemon
// it is the part that keeps root's rights that writes it; the part that listens to the network has none.
Fd OpenHostList(const char *path);

}  // namespace tavo

#endif
