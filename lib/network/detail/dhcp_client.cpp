// The DHCP client of an interface: its files and its end.
#include "network/detail/dhcp_client.h"

#include "core/detail/log.h"
#include "core/detail/pid_file.h"
#include "core/detail/process_list.h"
#include "network/detail/net_command.h"

#include <cerrno>
#include <csignal>
#include <cstring>

#include <unistd.h>

namespace tavo {

namespace {

// The file stays after a crash of the client, and another process may have its number by then.
bool IsDhcpClient(pid_t pid)
{
    for (const Process &process : pid > 0 ? ListProcesses() : std::vector<Process>()) {
        const std::string_view program = std::string_view(process.command).substr(0, process.command.find(' '));
        if (process.pid == pid)
            return program.substr(program.rfind('/') + 1).starts_with("dhcpcd");
    }
    return false;
}

}  // namespace

std::string DhcpPidFile(const std::string &interface)
{
    return "/etc/dhcpc/dhcpcd-" + interface + ".pid";
}

std::string DhcpLeaseFile(const std::string &interface)
{
    return "/etc/dhcpc/dhcpcd-" + interface + ".info";
}

pid_t DhcpClientOf(const std::string &interface)
{
    const pid_t pid = ReadPidFile(DhcpPidFile(interface).c_str()).value_or(0);
    return IsDhcpClient(pid) ? pid : 0;
}

void StartDhcpClient(const std::string &interface)
{
    RunNetCommand("/sbin/dhcpcd -n %s -t %d > /dev/null 2>&1 &", interface, kDhcpSeconds);
}

bool EndDhcpClient(const std::string &interface, Where where)
{
    constexpr int most_rounds = 30;
    for (int round = 0; KillDhcpClient(interface) == ClientEnd::alive; ++round) {
        if (round == most_rounds)
            return false;
        const auto pid = ReadPidFile(DhcpPidFile(interface).c_str());
        LogErrorAt(where, "%s(%d) dhcpcd pid[%d] still exists, wait 1 second.", pid.value_or(0));
        ::sleep(1);
    }
    if (RunNetCommand("/sbin/ifconfig %s 0.0.0.0 > /dev/null 2>&1", interface) != 0)
        LogErrorAt(where, "%s:%d Initial setting interface [%s] error %s", interface, std::strerror(errno));
    ::sleep(1);
    ::unlink(DhcpPidFile(interface).c_str());
    return true;
}

ClientEnd KillDhcpClient(const std::string &interface)
{
    if (DhcpClientOf(interface) == 0)
        return ClientEnd::gone;
    if (SignalByPidFile(DhcpPidFile(interface).c_str(), SIGKILL) == PidSignal::failed && errno != ESRCH)
        return ClientEnd::alive;
    return ClientEnd::gone;
}

}  // namespace tavo
