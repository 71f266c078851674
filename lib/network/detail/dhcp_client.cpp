// The DHCP client of an interface: its files and its end.
#include "network/detail/dhcp_client.h"

#include "core/detail/pid_file.h"

#include <cerrno>
#include <csignal>

namespace tavo {

std::string DhcpPidFile(const std::string &interface)
{
    return "/etc/dhcpc/dhcpcd-" + interface + ".pid";
}

ClientEnd KillDhcpClient(const std::string &interface) noexcept
{
    if (SignalByPidFile(DhcpPidFile(interface).c_str(), SIGKILL) == PidSignal::failed && errno != ESRCH)
        return ClientEnd::alive;
    return ClientEnd::gone;
}

}  // namespace tavo
