// Discovery packets: what is taken for a reply comes back from a packet of our own, and from the line of a list.
#include "host_table.h"
#include "input.h"
#include "network/detail/host_list.h"
#include "packet.h"

#include <cstring>

#include <arpa/inet.h>

using fuzz::Check;

extern "C" int LLVMFuzzerTestOneInput(const uint8_t *data, size_t size)
{
    findhostd::Host host{};
    const findhostd::Host untouched{};
    const auto kind = findhostd::ReadPacket({data, size}, host);
    if (kind != findhostd::PacketKind::reply) {
        Check(std::memcmp(&host, &untouched, sizeof host) == 0, "only a reply fills the host in");
        return 0;
    }
    Check(findhostd::IsSound(host), "a reply is sound");

    std::array<uint8_t, findhostd::kLargestPacket> packet;
    const size_t written = findhostd::WriteReply(host, packet);
    findhostd::Host again{};
    Check(findhostd::ReadPacket({packet.data(), written}, again) == findhostd::PacketKind::reply, "ours is a reply");
    Check(std::memcmp(&host, &again, sizeof host) == 0, "and says the same");

    findhostd::HostTable table;
    Check(table.Put(host, 0, 1000) && !table.Put(host, 0, 1000), "put once");
    std::string line = table.Text(1000);
    Check(line.find('\n') == line.size() - 1, "one line");
    line.pop_back();
    const tavo::HostLine read = tavo::ParseHostLine(line);
    char address[INET_ADDRSTRLEN];
    ::inet_ntop(AF_INET, &host.address, address, sizeof address);
    Check(read.kind == tavo::HostLineKind::host, "the list's reader takes it");
    Check(read.name == host.name && read.address == address, "and finds the same");
    return 0;
}
