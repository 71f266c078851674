// What the kernel knows of the network interfaces.
#include "network/detail/kernel_interface.h"

#include "core/detail/open_file.h"
#include "core/detail/text_fields.h"
#include "network/detail/folder_names.h"

#include <algorithm>
#include <cstring>

#include <arpa/inet.h>
#include <net/if.h>
#include <sys/ioctl.h>
#include <sys/socket.h>

namespace tavo {
namespace {

constexpr const char *kClass = "/sys/class/net/";

// An Ethernet device, a bond included, that is not the member of another one.
bool IsWired(const std::string &interface)
{
    return InterfaceAttribute(interface, "type") == "1" && !OpenFd((kClass + interface + "/master").c_str(), O_PATH);
}

// By the letters, then by the number behind them.
bool ComesBefore(const std::string &left, const std::string &right)
{
    const auto split = [](const std::string &name) {
        return name.find_last_not_of("0123456789") + 1;
    };
    const size_t at = split(left);
    if (const int order = left.compare(0, at, right, 0, split(right)))
        return order < 0;
    return left.size() != right.size() ? left.size() < right.size() : left < right;
}

std::optional<Ipv4> Ask(int socket, const std::string &interface, unsigned long request)
{
    ifreq ask{};
    std::strncpy(ask.ifr_name, interface.c_str(), IFNAMSIZ - 1);
    if (::ioctl(socket, request, &ask) != 0)
        return std::nullopt;
    sockaddr_in answer;
    std::memcpy(&answer, &ask.ifr_addr, sizeof answer);
    return Ipv4::FromWord(ntohl(answer.sin_addr.s_addr));
}

}  // namespace

std::vector<std::string> WiredInterfaces()
{
    std::vector<std::string> names;
    for (std::string &name : FolderNames(kClass)) {
        if (IsWired(name))
            names.push_back(std::move(name));
    }
    std::sort(names.begin(), names.end(), ComesBefore);
    return names;
}

std::string InterfaceAttribute(const std::string &interface, const char *attribute)
{
    const auto text = ReadKernelFile((kClass + interface + "/" + attribute).c_str());
    if (!text)
        return "";
    std::string_view rest = *text;
    return std::string(TakeLine(rest));
}

std::optional<InterfaceAddress> AddressOf(const std::string &interface)
{
    const Fd socket(::socket(AF_INET, SOCK_DGRAM | SOCK_CLOEXEC, 0));
    if (!socket)
        return std::nullopt;
    const auto address = Ask(socket.Get(), interface, SIOCGIFADDR);
    const auto mask = Ask(socket.Get(), interface, SIOCGIFNETMASK);
    if (!address || !mask)
        return std::nullopt;
    return InterfaceAddress{*address, *mask};
}

std::optional<std::string> ReadKernelFile(const char *path)
{
    const Fd fd = OpenFd(path, O_RDONLY);
    if (!fd)
        return std::nullopt;
    std::string text;
    char block[4096];
    for (;;) {
        const ssize_t got = ::read(fd.Get(), block, sizeof block);
        if (got > 0)
            text.append(block, static_cast<size_t>(got));
        else if (got == 0)
            return text;
        else if (errno != EINTR)
            return std::nullopt;
    }
}

}  // namespace tavo
