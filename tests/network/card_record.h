// The card and the bond that a test asks for.
#ifndef TESTS_NETWORK_CARD_RECORD_H
#define TESTS_NETWORK_CARD_RECORD_H

#include "tavo_net.h"

#include <cstring>

namespace test {

inline TAVONETCARD Card(int mode, const char *address = "", const char *mask = "")
{
    TAVONETCARD card = {};
    card.nMode = mode;
    std::strcpy(card.szInterface, "eth0");
    std::strcpy(card.szIp, address);
    std::strcpy(card.szMask, mask);
    return card;
}

inline TAVONETLINKAGGR Bond()
{
    TAVONETLINKAGGR bond = {};
    std::strcpy(bond.szBond, "bond0");
    bond.nMode = TAVO_NET_AGGR_BACKUP;
    bond.nMember = 2;
    std::strcpy(bond.rgszMember[0], "eth0");
    std::strcpy(bond.rgszMember[1], "eth1");
    return bond;
}

}  // namespace test

#endif
