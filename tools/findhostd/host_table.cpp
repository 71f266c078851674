// The appliances that answered the last query, and the list that is made of them.
#include "host_table.h"

#include <cstring>

#include <arpa/inet.h>
#include <net/if.h>

namespace findhostd {

bool HostTable::Put(const Host &host, unsigned interface) noexcept
{
    size_t at = 0;
    while (at < count_ && entries_[at].host.address.s_addr != host.address.s_addr)
        ++at;
    if (at == kMost)
        return false;
    if (at == count_)
        ++count_;
    else if (entries_[at].interface == interface && std::memcmp(&entries_[at].host, &host, sizeof host) == 0)
        return false;
    entries_[at] = {host, interface};
    return true;
}

std::string HostTable::Text() const
{
    std::string text;
    for (size_t i = 0; i < count_; ++i) {
        const Host &host = entries_[i].host;
        char address[INET_ADDRSTRLEN] = "";
        ::inet_ntop(AF_INET, &host.address, address, sizeof address);
        char interface[IF_NAMESIZE] = "";
        if (!::if_indextoname(entries_[i].interface, interface))
            interface[0] = 0;
        text += std::to_string(host.model) + "," + std::to_string(host.protocol) + "," + host.name + "," + address +
                "," + interface + "\n";
    }
    return text;
}

}  // namespace findhostd
