// The records of interfaces.
#ifndef TAVOCTL_NET_CARD_H
#define TAVOCTL_NET_CARD_H

#include "tavo_net.h"

#include <cstdio>
#include <string>

namespace tavoctl {

inline constexpr int probe_milliseconds = 1000;  // as RFC 5227 has it

// The first interface; throws a Failure when there is none.
TAVONETCARD FirstCard(const std::string &attempted);

// The interface of that name, or the first one for "". Throws a Failure when there is none.
TAVONETCARD CardNamed(const std::string &attempted, const std::string &interface);

// "192.0.2.10/24", "dhcp", or "" for a card without an address.
std::string AddressText(const TAVONETCARD &card);

// Throws a Failure when another host uses the address. Nothing is asked where the cable is not plugged in.
void RefuseUsedAddress(const TAVONETCARD &card, const std::string &address);

// Fills a field of a record; text that does not fit is cut.
template <std::size_t Size>
void Put(char (&field)[Size], const std::string &text)
{
    std::snprintf(field, Size, "%s", text.c_str());
}

}  // namespace tavoctl

#endif
