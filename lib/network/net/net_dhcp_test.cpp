// Asks whether a DHCP server answers on an interface, without taking a lease.
#include "tavo_net.h"

#include "core/detail/guard.h"
#include "core/detail/log.h"
#include "network/detail/interface_name.h"
#include "network/detail/net_command.h"

#include <cerrno>
#include <cstring>

namespace {

// The exit statuses of a shell for a program that does not exist or cannot be executed.
constexpr int kNotExecutable = 126;
constexpr int kNotFound = 127;

}  // namespace

extern "C" int TAVONetDhcpTest(const char *szInterface, int cSeconds)
{
    if (!szInterface || !tavo::IsInterfaceName(szInterface) || cSeconds < 1)
        return Fail(ERR_BAD_PARAMETERS);
    return Guard([&] {
        const int status = tavo::RunNetCommand("/sbin/dhcpcd -T %s -t %d > /dev/null 2>&1", szInterface, cSeconds);
        if (status == -1 || status == kNotExecutable || status == kNotFound) {
            LogError("%s(%d) run dhcpcd error %s", std::strerror(errno));
            return Fail(ERR_OP_FAILURE);
        }
        return status == 0 ? 0 : 1;
    });
}
