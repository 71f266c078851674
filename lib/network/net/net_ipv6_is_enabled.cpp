// Checks whether IPv6 is enabled on an interface.
#include "tavo_net.h"

#include "core/detail/guard.h"
#include "core/detail/text_fields.h"
#include "network/detail/interface_name.h"
#include "network/detail/kernel_interface.h"

extern "C" int BlTAVONetIPv6IsEnabled(const char *szInterface)
{
    if (!szInterface || !tavo::IsInterfaceName(szInterface))
        return FailZero(ERR_BAD_PARAMETERS);
    return Guard([&]() -> bool {
        const auto text =
            tavo::ReadKernelFile(("/proc/sys/net/ipv6/conf/" + std::string(szInterface) + "/disable_ipv6").c_str());
        if (!text)
            return FailZero(ERR_OPEN_FAILED);
        std::string_view rest = *text;
        return tavo::TakeLine(rest) == "0";
    });
}
