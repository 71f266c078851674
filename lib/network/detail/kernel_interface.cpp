// The kernel's state of the network interfaces.
#include "network/detail/kernel_interface.h"

#include "core/detail/open_file.h"
#include "core/detail/text_fields.h"
#include "network/detail/folder_names.h"

#include <algorithm>
#include <cerrno>
#include <cstring>

#include <arpa/inet.h>
#include <net/if.h>
#include <sys/ioctl.h>
#include <sys/socket.h>

namespace tavo {
namespace {

constexpr const char *kClass = "/sys/class/net/";

// An Ethernet device, a bond included, that is not the member of another one.
// Empty when the kernel does not say.
std::optional<bool> IsWired(const std::string &interface)
{
    const auto is_absent = [] {
        return errno == ENOENT || errno == ENOTDIR || errno == ENODEV;
    };
    const auto type = ReadKernelFile((kClass + interface + "/type").c_str());
    if (!type)
        return is_absent() ? std::optional(false) : std::nullopt;
    if (type->substr(0, type->find('\n')) != "1")
        return false;
    if (OpenFd((kClass + interface + "/master").c_str(), O_PATH))
        return false;
    return is_absent() ? std::optional(true) : std::nullopt;
}

// By the letters, then by the number after them.
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

std::optional<std::vector<std::string>> WiredInterfaces()
{
    auto names = FolderNames(kClass);
    if (!names)
        return std::nullopt;
    bool read = true;
    std::erase_if(*names, [&](const std::string &name) {
        const auto wired = IsWired(name);
        read = read && wired.has_value();
        return wired != true;
    });
    if (!read)
        return std::nullopt;
    std::sort(names->begin(), names->end(), ComesBefore);
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
