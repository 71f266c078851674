// What a test asks of a card.
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

}  // namespace test

#endif
