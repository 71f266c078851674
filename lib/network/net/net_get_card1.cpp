// Reads the first interface.
#include "tavo_net.h"

#include "core/detail/guard.h"
#include "network/detail/card_record.h"

extern "C" int TAVONetGetCard1(TAVONETCARD *pCard)
{
    if (!pCard)
        return Fail(ERR_BAD_PARAMETERS);
    return Guard([&] {
        TAVONETCARD card;
        if (tavo::ReadCard(0, &card) == tavo::CardState::absent)
            return Fail(ERR_FILE_NOT_FOUND);
        if (!card.szInterface[0])
            return Fail(ERR_READ_FAILED);
        *pCard = card;  // an interface that is down has a record, too: with empty addresses
        return 0;
    });
}
