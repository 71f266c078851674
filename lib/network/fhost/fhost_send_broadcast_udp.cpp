// Broadcasts a packet from every wired interface.
#include "tavo_fhost.h"

#include "core/detail/log.h"
#include "core/detail/owner.h"
#include "network/detail/card_record.h"

#include <cerrno>
#include <cstring>
#include <new>

#include <arpa/inet.h>
#include <sys/socket.h>

namespace {

constexpr int kInterfaces = 8;
constexpr uint16_t kPort = 9999;

sockaddr_in Address(in_addr_t address, uint16_t port)
{
    sockaddr_in where{};
    where.sin_family = AF_INET;
    where.sin_addr.s_addr = address;
    where.sin_port = htons(port);
    return where;
}

const sockaddr *Generic(const sockaddr_in &address)
{
    return reinterpret_cast<const sockaddr *>(&address);
}

bool SendFrom(const char *source_text, const void *packet, size_t size)
{
    const tavo::Fd socket(::socket(AF_INET, SOCK_DGRAM | SOCK_CLOEXEC, 0));
    if (!socket) {
        tavo::LogBare("create socket error.");
        return false;
    }
    // Bound to the interface's address the broadcast leaves by that interface and no other.
    const sockaddr_in source = Address(::inet_addr(source_text), 0);
    if (::bind(socket.Get(), Generic(source), sizeof source) != 0) {
        tavo::LogBare("bind(sockfd=%d, brdcast.sin_addr.s_addr = %lu) error!! errno=%d, err_str=[%s]", socket.Get(),
                      source.sin_addr.s_addr, errno, std::strerror(errno));
        return false;
    }
    const int on = 1;
    if (::setsockopt(socket.Get(), SOL_SOCKET, SO_BROADCAST, &on, sizeof on) != 0) {
        tavo::LogBare("set socket option error.");
        return false;
    }
    const sockaddr_in everybody = Address(INADDR_BROADCAST, kPort);
    if (::sendto(socket.Get(), packet, size, 0, Generic(everybody), sizeof everybody) != static_cast<ssize_t>(size)) {
        tavo::LogBare("sendto error.");
        return false;
    }
    return true;
}

}  // namespace

extern "C" uint32_t ErrFHOSTSendBroadcastUdp(const void *pPacket, int cbPacket)
{
    uint32_t failed = 0;
    if (!pPacket || cbPacket <= 0)
        return failed;
    for (int index = 0; index < kInterfaces; ++index) {
        TAVONETCARD card;
        tavo::CardState state = tavo::CardState::unreadable;
        try {
            state = tavo::ReadCard(index, &card);
        } catch (const std::bad_alloc &) {
            // counts as an interface that cannot be read
        }
        if (state == tavo::CardState::absent)
            return failed;
        if (state == tavo::CardState::has_none)
            continue;
        if (state != tavo::CardState::has || !SendFrom(card.szIp, pPacket, static_cast<size_t>(cbPacket)))
            failed |= 1u << index;
    }
    return failed;
}
