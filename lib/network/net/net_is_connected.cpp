// Checks whether an interface has a carrier: a cable is plugged in and the other end is up.
#include "tavo_net.h"

#include "core/detail/guard.h"
#include "network/detail/interface_name.h"
#include "network/detail/kernel_interface.h"

extern "C" int BlTLIBIsConnected(const char *szInterface)
{
    if (!szInterface || !tavo::IsInterfaceName(szInterface))
        return FailZero(ERR_BAD_PARAMETERS);
    return Guard([&]() -> bool { return tavo::InterfaceAttribute(szInterface, "carrier") == "1"; });
}
