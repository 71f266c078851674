// Reads the stored MTU of an interface as a number.
#include "tavo_net.h"

#include "core/detail/fault.h"
#include "core/detail/strict_number.h"
#include "network/detail/mtu_setting.h"

extern "C" int TAVOGetMTUSetting(const char *szInterface)
{
    char text[16];
    if (TAVOConfGetMTUValue(szInterface, text, sizeof text) != 0)
        return -1;
    const auto mtu = tavo::StrictNumber<int>(text);
    return mtu && tavo::IsMtu(*mtu) ? *mtu : Fail(ERR_FORMAT_ERROR);
}
