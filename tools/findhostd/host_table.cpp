// The appliances that have answered lately, and the list that is made of them.
#include "host_table.h"

#include <algorithm>
#include <cstring>

#include <arpa/inet.h>
#include <net/if.h>

namespace findhostd {

void HostTable::NoteQuery(int64_t now) noexcept
{
    if (now - begun_ < kCollection)
        return;
    begun_ = now;
    ++collection_;
}

void HostTable::DropOld(int64_t now) noexcept
{
    Entry *const end = entries_.data() + count_;
    Entry *const kept =
        std::remove_if(entries_.data(), end, [&](const Entry &entry) { return now - entry.seen > kKept; });
    count_ -= static_cast<size_t>(end - kept);
}

bool HostTable::Put(const Host &host, unsigned interface, int64_t now) noexcept
{
    size_t at = 0;
    while (at < count_ && entries_[at].host.address.s_addr != host.address.s_addr)
        ++at;
    if (at == count_) {
        if (count_ == kMost)
            DropOld(now);
        if (count_ == kMost)
            return false;
        entries_[count_++] = {host, interface, collection_, now};
        return true;
    }
    Entry &entry = entries_[at];
    const bool gone = now - entry.seen > kKept;  // not listed any more
    entry.seen = now;
    if (entry.collection == collection_ && !gone)
        return false;
    entry.collection = collection_;
    if (!gone && entry.interface == interface && std::memcmp(&entry.host, &host, sizeof host) == 0)
        return false;
    entry.host = host;
    entry.interface = interface;
    return true;
}

std::string HostTable::Text(int64_t now)
{
    DropOld(now);
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
