// The record of an interface, read from its file and from the kernel.
#ifndef TAVO_NETWORK_DETAIL_CARD_RECORD_H
#define TAVO_NETWORK_DETAIL_CARD_RECORD_H

#include "tavo_net.h"

#include <string>

namespace tavo {

enum class CardState {
    absent,      // there are not that many
    has,         // an address
    has_none,    // neither the kernel nor the file has one: nothing is plugged in, or the DHCP server has not answered
    lacks,       // the file of a static card has an address that the kernel has not
    unreadable,  // the kernel did not answer
};

// Reads the index-th wired interface, from 0, into *card; of one without an address all the rest is filled in. Without a
// name where the kernel does not say which interfaces there are.
CardState ReadCard(int index, TAVONETCARD *card);

// The same of any interface, also one that is a member of a bond.
CardState ReadCard(const std::string &interface, TAVONETCARD *card);

}  // namespace tavo

#endif
