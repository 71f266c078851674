// Checks whether another host uses an address.
#include "tavo_net.h"

#include "core/detail/guard.h"
#include "core/detail/log.h"
#include "network/detail/interface_name.h"
#include "network/detail/kernel_interface.h"
#include "network/detail/net_command.h"

#include <cerrno>
#include <cstring>

extern "C" int TAVOIIpConflict(const char *szInterface, const char *szAddr)
{
    const auto address = szAddr ? tavo::ParseIpv4(szAddr) : std::nullopt;
    if (!szInterface || !tavo::IsInterfaceName(szInterface) || !address)
        return Fail(ERR_BAD_PARAMETERS);
    return Guard([&] {
        const auto own = tavo::AddressOf(szInterface);
        if (own && own->address.octet == address->octet)
            return 0;
        const auto command = tavo::ShellCommand("/bin/ping -c 1 -w 2 %s > /dev/null 2>&1", address->Text());
        const int status = command ? tavo::RunCommand(*command) : -1;
        if (status == -1 || status == 127) {
            LogError("%s(%d): system(%s) failed.(strerror=%s)", command.value_or(""), std::strerror(errno));
            return Fail(ERR_OP_FAILURE);
        }
        return status == 0 ? 1 : 0;
    });
}
