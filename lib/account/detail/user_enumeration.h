// Which accounts an enumeration lists.
#ifndef TAVO_ACCOUNT_DETAIL_USER_ENUMERATION_H
#define TAVO_ACCOUNT_DETAIL_USER_ENUMERATION_H

#include "account/detail/account_listing.h"

namespace tavo {

// The users that flags of TAVO_USER_ select: those of the domain who have been seen first, the others by their keys.
extern const NameSource kUserNames;

}  // namespace tavo

#endif
