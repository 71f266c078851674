// The verbs of tavoctl net stand in several files.
#ifndef TAVOCTL_NET_VERBS_H
#define TAVOCTL_NET_VERBS_H

#include "frame/program.h"
#include "network/net_snapshot.h"

namespace tavoctl {

// The network interfaces of the kernel, without the loopback.
std::vector<std::string> InterfaceNames();

void AddNetSet(Family &net);    // addresses, on trial or for good
void AddNetCards(Family &net);  // IPv6, wake-on-LAN, bonds

}  // namespace tavoctl

#endif
