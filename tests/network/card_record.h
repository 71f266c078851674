// The card and the bond that a test asks for.
#ifndef TESTS_NETWORK_CARD_RECORD_H
#define TESTS_NETWORK_CARD_RECORD_H

#include "tavo_net.h"

#include "support/test.h"

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

inline TAVONETLINKAGGR Bond(int mode = TAVO_NET_AGGR_BACKUP,
                            const std::vector<const char *> &members = {"eth0", "eth1"})
{
    TAVONETLINKAGGR bond = {};
    std::strcpy(bond.szBond, "bond0");
    bond.nMode = mode;
    for (const char *member : members)
        std::strcpy(bond.rgszMember[bond.nMember++], member);
    return bond;
}

}  // namespace test

#endif
