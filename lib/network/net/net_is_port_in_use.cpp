// Checks whether a socket of this appliance uses a port.
#include "tavo_net.h"

#include "core/detail/guard.h"
#include "core/detail/log.h"
#include "core/detail/text_fields.h"
#include "network/detail/kernel_interface.h"
#include "network/detail/socket_table.h"

#include <algorithm>
#include <cerrno>
#include <cstring>

namespace {

constexpr const char *kTables[] = {"/proc/net/tcp", "/proc/net/udp"};
constexpr const char *kIpv6Tables[] = {"/proc/net/tcp6", "/proc/net/udp6"};  // a listener there often takes IPv4, too

bool Holds(std::string_view table, int port)
{
    while (!table.empty()) {
        if (tavo::LocalPort(tavo::TakeLine(table)) == port)
            return true;
    }
    return false;
}

}  // namespace

extern "C" int BlTLIBIsPortInUse(int port)
{
    if (port < 1 || port > 0xFFFF)
        return FailZero(ERR_BAD_PARAMETERS);
    return Guard([&]() -> bool {
        for (const char *path : kTables) {
            const auto table = tavo::ReadKernelFile(path);
            if (!table) {
                LogError("%s:%d Fail to open [%s], errno=[%d/%s]", path, errno, std::strerror(errno));
                return FailZero(ERR_OPEN_FAILED);
            }
            if (Holds(*table, port))
                return true;
        }
        return std::any_of(std::begin(kIpv6Tables), std::end(kIpv6Tables), [&](const char *path) {
            return Holds(tavo::ReadKernelFile(path).value_or(""), port);  // none: the kernel has no IPv6
        });
    });
}
