// The entries of domain accounts. The domain client puts them into the stores, and no text file has them. A rebuild
// from the text files keeps the entries that were refreshed lately.
#ifndef TAVO_ACCOUNT_DETAIL_DOMAIN_PART_H
#define TAVO_ACCOUNT_DETAIL_DOMAIN_PART_H

#include "account/detail/store_build.h"

#include <cstdint>
#include <ctime>

namespace tavo {

// Returns whether a domain part that was refreshed at that time still holds. As unsigned numbers: after the clock was
// set back the difference is huge, and the part is refreshed.
inline bool IsDomainPartFresh(int32_t refreshed, std::time_t now)
{
    constexpr uint32_t seconds = 300;
    return static_cast<uint32_t>(now) - static_cast<uint32_t>(refreshed) <= seconds;
}

// The fresh entries in the stores as they are, by store, with the time of the refresh. Empty when there are none, and
// when the stores may be damaged.
std::vector<StoreEntries> ReadDomainPart(const AccountKind &kind);

}  // namespace tavo

#endif
