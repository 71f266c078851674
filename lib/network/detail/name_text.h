// Names of the network as text: domains, the parts of mail addresses, workgroups. ASCII only, whatever the locale.
#ifndef TAVO_NETWORK_DETAIL_NAME_TEXT_H
#define TAVO_NETWORK_DETAIL_NAME_TEXT_H

#include "core/detail/ascii.h"

#include <string_view>

namespace tavo {

// Of the sixteen bytes of a NetBIOS name the last is its type.
inline constexpr size_t kLongestNetbiosName = 15;

// Labels of letters, digits and inner hyphens, 1 to 63 bytes each, joined by dots; 255 bytes in all.
bool IsDomainText(std::string_view text) noexcept;

// Printable characters without blanks and without the specials of mail addresses: "(),.:;<>[]\@ and the double quote.
bool IsAtomText(std::string_view text) noexcept;

// Atoms joined by dots, "@", a domain.
bool IsMailboxText(std::string_view text) noexcept;

}  // namespace tavo

#endif
