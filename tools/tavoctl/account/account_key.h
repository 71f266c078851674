// Account names are compared without regard to case.
#ifndef TAVOCTL_ACCOUNT_KEY_H
#define TAVOCTL_ACCOUNT_KEY_H

#include <string>

namespace tavoctl {

// What the name is stored under: in upper case. A name that has none stands for itself.
std::string AccountKey(const std::string &name);

}  // namespace tavoctl

#endif
