// The network as one comparable text: what a change may leave half done.
#ifndef TESTS_NETWORK_NETWORK_STATE_H
#define TESTS_NETWORK_NETWORK_STATE_H

#include "tavo_net.h"

#include "support/scratch_dir.h"

#include <algorithm>
#include <cstring>
#include <filesystem>
#include <iterator>
#include <sstream>
#include <string>
#include <vector>

#include <arpa/inet.h>
#include <netdb.h>
#include <netinet/in.h>
#include <sys/socket.h>
#include <sys/utsname.h>
#include <unistd.h>

namespace test {

inline std::string TextOrNone(const char *path)
{
    return std::filesystem::exists(path) ? ReadFile(path) : "none";
}

// Without the temporary ones that a death leaves: a dot and six characters at the end.
inline std::string InterfaceFiles()
{
    std::vector<std::string> files;
    for (const auto &entry : std::filesystem::directory_iterator("/etc/sysconfig/network-scripts")) {
        if (entry.path().extension().string().size() != 7)
            files.push_back(entry.path().string() + "\n" + ReadFile(entry.path()));
    }
    std::sort(files.begin(), files.end());
    std::string text;
    for (const std::string &file : files)
        text += file;
    return text;
}

// Addresses and routes, without those that the kernel makes by itself.
inline std::string IPv6State()
{
    std::string state = TextOrNone("/proc/sys/net/ipv6/conf/eth0/disable_ipv6");
    const auto add = [&](const char *table, size_t fields, auto is_ours) {
        std::istringstream lines(TextOrNone(table));
        for (std::string line; std::getline(lines, line);) {
            std::istringstream words(line);
            const std::vector<std::string> field = {std::istream_iterator<std::string>(words), {}};
            if (field.size() == fields && field.back() == "eth0" && !line.starts_with("f") && is_ours(field))
                state += field[0] + "/" + field[fields == 6 ? 2 : 1] + " " + field[fields == 6 ? 3 : 4] + "\n";
        }
    };
    add("/proc/net/if_inet6", 6, [](const auto &) { return true; });
    add("/proc/net/ipv6_route", 10, [](const auto &field) {
        return (std::stoul(field[8], nullptr, 16) & 0x80100000) == 0;  // local, anycast
    });
    return state;
}

// All that a change may leave half done.
inline std::string NetworkState()
{
    std::string state = InterfaceFiles() + IPv6State();
    for (const char *path : {"/etc/sysconfig/network", "/etc/hosts", "/etc/resolv.conf", "/proc/net/route",
                             "/sys/class/net/eth0/mtu", "/etc/tavoinfo.conf"})
        state += std::string(path) + "\n" + TextOrNone(path);
    utsname name;
    ::uname(&name);
    TAVONETCARD card = {};
    TAVONetGetCard1(&card);
    return state + name.nodename + "\n" + card.szInterface + " " + card.szIp + "/" + card.szMask;
}

inline bool HasDefaultRoute()
{
    const std::string routes = TextOrNone("/proc/net/route");
    return routes.find("\neth0\t00000000\t") != routes.npos || routes.find("\nbond0\t00000000\t") != routes.npos;
}

// What the C library finds under the appliance's own name.
inline std::string OwnAddress()
{
    char name[256] = "";
    ::gethostname(name, sizeof name - 1);
    addrinfo hints{};
    hints.ai_family = AF_INET;
    addrinfo *found = nullptr;
    if (::getaddrinfo(name, nullptr, &hints, &found) != 0)
        return "none";
    sockaddr_in address;
    std::memcpy(&address, found->ai_addr, sizeof address);
    ::freeaddrinfo(found);
    return ::inet_ntoa(address.sin_addr);
}

}  // namespace test

#endif
