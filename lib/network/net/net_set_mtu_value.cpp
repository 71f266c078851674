// Stores the MTU of an interface and gives it to the kernel.
#include "tavo_net.h"

extern "C" int TAVONetSetMTUValue(const char *szInterface, int mtu)
{
    if (TAVOConfSetMTUValue(szInterface, mtu) != 0)
        return -1;
    return TAVONetSetMTUEth(szInterface, mtu);
}
