// Asks the network for appliances.
#include "tavo_fhost.h"

extern "C" uint32_t ErrFHOSTSendQueryPkt(void)
{
    // Twice, because broadcasts get lost; a host that answers both is listed once.
    const uint32_t first = ErrFHOSTSendBroadcastUdp(stFHOSTBroadCastVDS20, FHOSTBroadCastSizeVDS20);
    return first | ErrFHOSTSendBroadcastUdp(stFHOSTBroadCastVDS20, FHOSTBroadCastSizeVDS20);
}
