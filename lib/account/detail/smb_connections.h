// Connections of the Windows file service.
#ifndef TAVO_ACCOUNT_DETAIL_SMB_CONNECTIONS_H
#define TAVO_ACCOUNT_DETAIL_SMB_CONNECTIONS_H

#include <string>

namespace tavo {

// Ends the user's open connections: asks Samba which of its processes serve the user, and tells those to shut down.
// Does nothing where Samba's tools are not installed.
void EndSmbConnections(const std::string &user);

}  // namespace tavo

#endif
