// Account names are compared without regard to case.
#ifndef TAVOCTL_ACCOUNT_KEY_H
#define TAVOCTL_ACCOUNT_KEY_H

#include <string>

namespace tavoctl {

// The key under which a name is stored: the name in upper case, or unchanged when it cannot be converted.
std::string AccountKey(const std::string &name);

}  // namespace tavoctl

#endif
