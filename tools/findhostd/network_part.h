// The part of the daemon that listens to the network. It has no rights, and nothing but two sockets.
#ifndef FINDHOSTD_NETWORK_PART_H
#define FINDHOSTD_NETWORK_PART_H

#include <cstdint>

namespace findhostd {

// The socket that hears queries and answers; -1 with errno.
int OpenNetworkSocket();

// Drops root's rights and the file system for good, and limits the resources of this process. Returns false with errno.
bool DropPrivileges();

// Answers queries and reports what it hears, until the other part is gone.
void ListenToNetwork(int network, int reports, uint32_t model);

}  // namespace findhostd

#endif
