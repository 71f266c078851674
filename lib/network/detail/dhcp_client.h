// The DHCP client of an interface: its files, its end and its start.
#ifndef TAVO_NETWORK_DETAIL_DHCP_CLIENT_H
#define TAVO_NETWORK_DETAIL_DHCP_CLIENT_H

#include "core/detail/where.h"

#include <string>

#include <sys/types.h>

namespace tavo {

std::string DhcpPidFile(const std::string &interface);

enum class ClientEnd {
    gone,   // killed, or there was none
    alive,  // it runs and cannot be killed right now
};

// One attempt. A pid file without a process, or with the id of another program, names no client.
ClientEnd KillDhcpClient(const std::string &interface);

// Ends the client that runs, so that two never fight over one interface, and clears the address. False, with nothing
// cleared, for a client that survives 30 attempts, one per second, because it is blocked in the kernel.
bool EndDhcpClient(const std::string &interface, Where where = Where());

// The client that takes care of the interface; 0 for none.
pid_t DhcpClientOf(const std::string &interface);

// Starts one without waiting for its lease.
void StartDhcpClient(const std::string &interface);

inline constexpr int kDhcpSeconds = 30;  // for a lease

// The lease that the client noted: its file, with IPADDR, NETMASK and, where the server named one, GATEWAY.
std::string DhcpLeaseFile(const std::string &interface);

}  // namespace tavo

#endif
