// Asks by ARP whether another host uses an address, before it is taken (RFC 5227).
#include "tavo_net.h"

#include "core/detail/guard.h"
#include "core/detail/log.h"
#include "core/detail/owner.h"
#include "network/detail/interface_name.h"
#include "network/detail/ipv4_text.h"

#include <cerrno>
#include <cstdlib>
#include <cstring>
#include <ctime>

#include <arpa/inet.h>
#include <linux/if_packet.h>
#include <net/if.h>
#include <net/if_arp.h>
#include <netinet/if_ether.h>
#include <poll.h>
#include <sys/ioctl.h>
#include <sys/socket.h>

namespace {

int64_t Milliseconds()
{
    timespec now = {};
    ::clock_gettime(CLOCK_MONOTONIC, &now);
    return int64_t{now.tv_sec} * 1000 + now.tv_nsec / 1000000;
}

class ArpSocket {
  public:
    // False with errno.
    bool Open(const char *interface)
    {
        fd_ = tavo::Fd(::socket(AF_PACKET, SOCK_DGRAM | SOCK_CLOEXEC, htons(ETH_P_ARP)));
        ifreq ask{};
        std::strncpy(ask.ifr_name, interface, IFNAMSIZ - 1);
        if (!fd_ || ::ioctl(fd_.Get(), SIOCGIFHWADDR, &ask) != 0)
            return false;
        std::memcpy(own_, ask.ifr_hwaddr.sa_data, sizeof own_);
        everybody_.sll_family = AF_PACKET;
        everybody_.sll_protocol = htons(ETH_P_ARP);
        everybody_.sll_ifindex = static_cast<int>(::if_nametoindex(interface));
        everybody_.sll_halen = ETH_ALEN;
        std::memset(everybody_.sll_addr, 0xFF, ETH_ALEN);
        sockaddr_ll where = everybody_;
        return ::bind(fd_.Get(), reinterpret_cast<const sockaddr *>(&where), sizeof where) == 0;
    }

    bool Probe(const in_addr &wanted) const
    {
        ether_arp packet{};
        packet.arp_hrd = htons(ARPHRD_ETHER);
        packet.arp_pro = htons(ETH_P_IP);
        packet.arp_hln = ETH_ALEN;
        packet.arp_pln = sizeof wanted;
        packet.arp_op = htons(ARPOP_REQUEST);
        std::memcpy(packet.arp_sha, own_, ETH_ALEN);
        std::memcpy(packet.arp_tpa, &wanted, sizeof wanted);
        return ::sendto(fd_.Get(), &packet, sizeof packet, 0, reinterpret_cast<const sockaddr *>(&everybody_),
                        sizeof everybody_) == static_cast<ssize_t>(sizeof packet);
    }

    // Returns whether another host uses the address, or wants it too, within that time.
    bool Hears(const in_addr &wanted, int milliseconds) const
    {
        const int64_t end = Milliseconds() + milliseconds;
        for (int64_t now = Milliseconds(); now < end; now = Milliseconds()) {
            pollfd ready = {fd_.Get(), POLLIN, 0};
            if (::poll(&ready, 1, static_cast<int>(end - now)) <= 0)
                continue;
            ether_arp packet{};
            if (::recv(fd_.Get(), &packet, sizeof packet, MSG_DONTWAIT) == static_cast<ssize_t>(sizeof packet) &&
                Claims(packet, wanted))
                return true;
        }
        return false;
    }

  private:
    bool Claims(const ether_arp &packet, const in_addr &wanted) const
    {
        if (packet.arp_hrd != htons(ARPHRD_ETHER) || packet.arp_pro != htons(ETH_P_IP) || packet.arp_hln != ETH_ALEN ||
            packet.arp_pln != sizeof wanted || std::memcmp(packet.arp_sha, own_, ETH_ALEN) == 0)
            return false;
        constexpr uint8_t nobody[sizeof wanted] = {};
        const bool has = std::memcmp(packet.arp_spa, &wanted, sizeof wanted) == 0;
        const bool wants = packet.arp_op == htons(ARPOP_REQUEST) &&
                           std::memcmp(packet.arp_spa, nobody, sizeof nobody) == 0 &&
                           std::memcmp(packet.arp_tpa, &wanted, sizeof wanted) == 0;
        return has || wants;
    }

    tavo::Fd fd_;
    uint8_t own_[ETH_ALEN] = {};
    sockaddr_ll everybody_{};
};

// 1, 0, or -1 with errno.
int ProbeAddress(const char *interface, const in_addr &wanted, int unit)
{
    constexpr int probes = 3;
    ArpSocket socket;
    if (!socket.Open(interface))
        return -1;
    const auto between = [](int least, int most) {
        return least + static_cast<int>(::arc4random_uniform(static_cast<uint32_t>(most - least + 1)));
    };
    if (socket.Hears(wanted, between(0, unit)))
        return 1;
    for (int i = 1; i <= probes; ++i) {
        if (!socket.Probe(wanted))
            return -1;
        if (socket.Hears(wanted, i == probes ? 2 * unit : between(unit, 2 * unit)))
            return 1;
    }
    return 0;
}

}  // namespace

extern "C" int TAVONetAddressProbe(const char *szInterface, const char *szAddr, int cMilliseconds)
{
    constexpr int longest = 10000;
    const auto address = szAddr ? tavo::ParseIpv4(szAddr) : std::nullopt;
    if (!szInterface || !tavo::IsInterfaceName(szInterface) || !address || !tavo::IsHostAddress(*address) ||
        cMilliseconds < 1 || cMilliseconds > longest)
        return Fail(ERR_BAD_PARAMETERS);
    return Guard([&] {
        in_addr wanted{};
        wanted.s_addr = htonl(address->Word());
        const int used = ProbeAddress(szInterface, wanted, cMilliseconds);
        if (used >= 0)
            return used;
        LogError("%s:%d Cannot probe [%s] on [%s], errno=[%d/%s]", szAddr, szInterface, errno, std::strerror(errno));
        return Fail(errno == EPERM || errno == EACCES ? ERR_ACCESS_DENIED
                    : errno == ENODEV                 ? ERR_FILE_NOT_FOUND
                                                      : ERR_OP_FAILURE);
    });
}
