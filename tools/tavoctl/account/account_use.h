// Finds the uses of an account or a group on the appliance.
#ifndef TAVOCTL_ACCOUNT_USE_H
#define TAVOCTL_ACCOUNT_USE_H

#include <string>

#include <sys/types.h>

namespace tavoctl {

// "logged in at pts/0", or "running 2 processes, the first is 4711 (sleep 9)"; empty when the user does neither.
std::string UseOfUser(const std::string &name, uid_t uid);

// The users whose primary group it is, the first few by name, in the order of /etc/passwd; empty when there is none.
std::string UsersWithPrimaryGroup(gid_t gid);

}  // namespace tavoctl

#endif
