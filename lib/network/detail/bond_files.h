// The interface files of a bond and of its members.
//
// A process may die between any two of the steps, so they are ordered for a network that starts whatever was reached:
// copies of the members' files first, then the bond's file, then the members'; and backwards when a bond is dissolved.
#ifndef TAVO_NETWORK_DETAIL_BOND_FILES_H
#define TAVO_NETWORK_DETAIL_BOND_FILES_H

#include "network/detail/bonding.h"

#include <string>
#include <vector>

namespace tavo {

// The members that have a saved copy of their file: what an earlier bond, or one that was never finished, left.
std::vector<std::string> SavedMembers(const std::vector<std::string> &interfaces);

// True when every step succeeded.
bool DissolveBond(const std::string &bond, const std::vector<std::string> &members);
bool WriteBond(const std::string &bond, BondMode mode, const std::vector<std::string> &members);

}  // namespace tavo

#endif
