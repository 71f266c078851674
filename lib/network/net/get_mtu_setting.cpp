// Reads the stored MTU of an interface as a number.
#include "tavo_net.h"

#include "core/detail/fault.h"
#include "network/detail/mtu_setting.h"

#include <charconv>
#include <cstring>

extern "C" int TAVOGetMTUSetting(const char *szInterface)
{
    char text[16];
    if (TAVOConfGetMTUValue(szInterface, text, sizeof text) != 0)
        return -1;
    int mtu = 0;
    const char *const end = text + std::strlen(text);
    const auto [next, error] = std::from_chars(text, end, mtu);
    if (error != std::errc() || next != end || !tavo::IsMtu(mtu))
        return Fail(ERR_FORMAT_ERROR);
    return mtu;
}
