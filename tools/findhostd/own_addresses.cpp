// The IPv4 addresses of this appliance.
#include "own_addresses.h"

#include <cstring>
#include <memory>

#include <ifaddrs.h>
#include <net/if.h>

namespace findhostd {
namespace {

in_addr AddressIn(const sockaddr *where)
{
    sockaddr_in text;
    std::memcpy(&text, where, sizeof text);
    return text.sin_addr;
}

}  // namespace

void OwnAddresses::Refresh()
{
    timespec now{};
    ::clock_gettime(CLOCK_MONOTONIC, &now);
    if (asked_ == now.tv_sec)
        return;
    asked_ = now.tv_sec;
    ifaddrs *first = nullptr;
    if (::getifaddrs(&first) != 0)
        return;
    const std::unique_ptr<ifaddrs, decltype(&::freeifaddrs)> owner(first, ::freeifaddrs);
    count_ = 0;
    for (const ifaddrs *one = first; one && count_ < entries_.size(); one = one->ifa_next) {
        if (!one->ifa_addr || one->ifa_addr->sa_family != AF_INET || !one->ifa_netmask)
            continue;
        entries_[count_++] = {AddressIn(one->ifa_addr), AddressIn(one->ifa_netmask), ::if_nametoindex(one->ifa_name)};
    }
}

bool OwnAddresses::Has(in_addr address) const noexcept
{
    for (size_t i = 0; i < count_; ++i) {
        if (entries_[i].address.s_addr == address.s_addr)
            return true;
    }
    return false;
}

const in_addr *OwnAddresses::Near(unsigned interface, in_addr asker) const noexcept
{
    for (size_t i = 0; i < count_; ++i) {
        const Entry &own = entries_[i];
        if (own.interface == interface && ((own.address.s_addr ^ asker.s_addr) & own.mask.s_addr) == 0)
            return &own.address;
    }
    return nullptr;
}

}  // namespace findhostd
