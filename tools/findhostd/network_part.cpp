// The part of the daemon that listens to the network.
#include "network_part.h"

#include "answer_budget.h"
#include "clock.h"
#include "own_addresses.h"
#include "packet.h"
#include "report.h"

#include <cerrno>
#include <cstring>

#include <arpa/inet.h>
#include <poll.h>
#include <sys/socket.h>
#include <unistd.h>

namespace findhostd {
namespace {

constexpr int64_t kCollect = 15000;  // ms after a query of ours; later or unasked replies are not listed

struct Packet {
    std::array<uint8_t, kLargestPacket + 1> bytes;  // one more than any packet of ours has: too large is seen
    size_t size;
    in_addr from;
    unsigned interface;
};

// The arguments of recvmsg and sendmsg: one packet, the address of the other side, and the interface.
struct Message {
    Message(const void *bytes, size_t size) : part{const_cast<void *>(bytes), size}
    {
        header.msg_name = &peer;
        header.msg_namelen = sizeof peer;
        header.msg_iov = &part;
        header.msg_iovlen = 1;
        header.msg_control = control;
        header.msg_controllen = sizeof control;
    }
    Message(const Message &) = delete;
    Message &operator=(const Message &) = delete;

    sockaddr_in peer{};
    iovec part;
    alignas(cmsghdr) char control[CMSG_SPACE(sizeof(in_pktinfo))] = {};
    msghdr header{};
};

bool Receive(int network, Packet &packet)
{
    Message message(packet.bytes.data(), packet.bytes.size());
    const ssize_t size = ::recvmsg(network, &message.header, MSG_DONTWAIT);
    if (size < 0 || message.peer.sin_family != AF_INET)
        return false;
    packet.size = static_cast<size_t>(size);
    packet.from = message.peer.sin_addr;
    packet.interface = 0;
    for (cmsghdr *part_of = CMSG_FIRSTHDR(&message.header); part_of; part_of = CMSG_NXTHDR(&message.header, part_of)) {
        if (part_of->cmsg_level != IPPROTO_IP || part_of->cmsg_type != IP_PKTINFO)
            continue;
        in_pktinfo info;
        std::memcpy(&info, CMSG_DATA(part_of), sizeof info);
        packet.interface = static_cast<unsigned>(info.ipi_ifindex);
    }
    return true;
}

// To the asker's daemon, out of the interface on which the question came and from the address there.
void Send(int network, std::span<const uint8_t> bytes, in_addr to, unsigned interface, in_addr from)
{
    Message message(bytes.data(), bytes.size());
    message.peer.sin_family = AF_INET;
    message.peer.sin_addr = to;
    message.peer.sin_port = htons(kPort);
    cmsghdr *const head = CMSG_FIRSTHDR(&message.header);
    head->cmsg_level = IPPROTO_IP;
    head->cmsg_type = IP_PKTINFO;
    head->cmsg_len = CMSG_LEN(sizeof(in_pktinfo));
    in_pktinfo info{};
    info.ipi_ifindex = static_cast<int>(interface);
    info.ipi_spec_dst = from;
    std::memcpy(CMSG_DATA(head), &info, sizeof info);
    ::sendmsg(network, &message.header, MSG_DONTWAIT | MSG_NOSIGNAL);
}

// Reads the present host name; a name that a list cannot hold counts as empty.
void PutOwnName(Host &host)
{
    char name[256] = "";
    ::gethostname(name, sizeof name - 1);
    const std::string_view known = IsHostName(name) ? name : "appliance";
    known.copy(host.name, kLongestName);
}

class Listener {
  public:
    Listener(int network, int reports, uint32_t model) : network_(network), reports_(reports), model_(model) {}

    void Handle(const Packet &packet)
    {
        Host host{};
        switch (ReadPacket({packet.bytes.data(), packet.size}, host)) {
        case PacketKind::query:
            addresses_.Refresh();
            if (addresses_.Has(packet.from))
                NoteOwnQuery();
            else
                Answer(packet);
            break;
        case PacketKind::reply:
            // A host can announce only its own address, so it cannot list another host or one outside the network.
            if (host.address.s_addr != packet.from.s_addr || asked_ == 0 || Now() - asked_ > kCollect)
                break;
            addresses_.Refresh();
            if (addresses_.Near(packet.interface, packet.from) && !addresses_.Has(packet.from))
                Tell({Report::host_found, packet.interface, host});
            break;
        case PacketKind::other:
            break;
        }
    }

  private:
    void NoteOwnQuery()
    {
        asked_ = Now();
        Tell({Report::query_sent, 0, {}});
    }

    void Answer(const Packet &packet)
    {
        // An address outside the network may be forged, and its host would be flooded with our answers.
        const in_addr *const own = addresses_.Near(packet.interface, packet.from);
        if (!own || !budget_.Take(packet.from, Now()))
            return;
        Host self{};
        self.model = model_;
        self.protocol = kProtocol;
        self.address = *own;
        PutOwnName(self);
        std::array<uint8_t, kLargestPacket> bytes;
        const size_t size = WriteReply(self, bytes);
        Send(network_, {bytes.data(), size}, packet.from, packet.interface, *own);
    }

    // A report for which the other part has no room is lost; the next query brings it again.
    void Tell(const Report &report) { ::send(reports_, &report, sizeof report, MSG_DONTWAIT | MSG_NOSIGNAL); }

    int network_;
    int reports_;
    uint32_t model_;
    OwnAddresses addresses_;
    AnswerBudget budget_;
    int64_t asked_ = 0;  // never
};

}  // namespace

int OpenNetworkSocket()
{
    const int fd = ::socket(AF_INET, SOCK_DGRAM | SOCK_CLOEXEC | SOCK_NONBLOCK, 0);
    if (fd < 0)
        return -1;
    const int on = 1;
    sockaddr_in everywhere{};
    everywhere.sin_family = AF_INET;
    everywhere.sin_port = htons(kPort);
    if (::setsockopt(fd, IPPROTO_IP, IP_PKTINFO, &on, sizeof on) == 0 &&
        ::bind(fd, reinterpret_cast<const sockaddr *>(&everywhere), sizeof everywhere) == 0)
        return fd;
    const int error = errno;
    ::close(fd);
    errno = error;
    return -1;
}

void ListenToNetwork(int network, int reports, uint32_t model)
{
    static Listener listener(network, reports, model);
    static Packet packet;
    for (;;) {
        pollfd ends[] = {{network, POLLIN, 0}, {reports, POLLIN, 0}};
        if (::poll(ends, 2, -1) < 0 && errno != EINTR)
            return;
        if (ends[1].revents)
            return;  // it never says anything: its end is gone
        if (ends[0].revents && Receive(network, packet))
            listener.Handle(packet);
    }
}

}  // namespace findhostd
