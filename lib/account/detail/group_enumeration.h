// Which groups an enumeration lists.
#ifndef TAVO_ACCOUNT_DETAIL_GROUP_ENUMERATION_H
#define TAVO_ACCOUNT_DETAIL_GROUP_ENUMERATION_H

#include "account/detail/account_listing.h"

namespace tavo {

// The groups that flags of TAVO_GROUP_ select, in the order of their keys.
extern const NameSource kGroupNames;

}  // namespace tavo

#endif
