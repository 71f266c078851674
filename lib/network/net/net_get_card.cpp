// Reads an interface by its name.
#include "tavo_net.h"

#include "core/detail/guard.h"
#include "network/detail/card_record.h"
#include "network/detail/interface_name.h"

extern "C" int TAVONetGetCard(const char *szInterface, TAVONETCARD *pCard)
{
    if (!szInterface || !tavo::IsInterfaceName(szInterface) || !pCard)
        return Fail(ERR_BAD_PARAMETERS);
    return Guard([&] {
        TAVONETCARD card;
        if (tavo::ReadCard(szInterface, &card) == tavo::CardState::absent)
            return Fail(ERR_FILE_NOT_FOUND);
        *pCard = card;
        return 0;
    });
}
