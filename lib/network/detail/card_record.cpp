// The record of an interface, read from its file and from the kernel.
#include "network/detail/card_record.h"

#include "core/detail/strict_number.h"
#include "network/detail/interface_file.h"
#include "network/detail/kernel_interface.h"
#include "network/detail/net_buffer.h"

#include <cerrno>
#include <cstring>

namespace tavo {
namespace {

template <size_t Size>
void Put(char (&field)[Size], std::string_view text)
{
    if (!ToBuffer(text, field, Size))
        field[0] = 0;
}

void PutAddress(TAVONETCARD &card, const InterfaceAddress &found)
{
    const uint32_t network = found.address.Word() & found.mask.Word();
    Put(card.szIp, found.address.Text());
    Put(card.szMask, found.mask.Text());
    Put(card.szNetwork, Ipv4::FromWord(network).Text());
    Put(card.szBroadcast, Ipv4::FromWord(network | ~found.mask.Word()).Text());
}

}  // namespace

CardState ReadCard(int index, TAVONETCARD *card)
{
    std::memset(card, 0, sizeof *card);
    const auto interfaces = WiredInterfaces();
    if (!interfaces)
        return CardState::unreadable;
    if (index < 0 || static_cast<size_t>(index) >= interfaces->size())
        return CardState::absent;
    return ReadCard((*interfaces)[static_cast<size_t>(index)], card);
}

CardState ReadCard(const std::string &interface, TAVONETCARD *card)
{
    if (InterfaceAttribute(interface, "type").empty())
        return CardState::absent;
    std::memset(card, 0, sizeof *card);
    Put(card->szInterface, interface);
    card->nMode = ReadSetting(InterfaceFile(interface), "BOOTPROTO") == "dhcp" ? TAVO_NET_DHCP : TAVO_NET_STATIC;
    Put(card->szGateway, ReadSetting(kNetworkFile, "GATEWAY"));
    Put(card->szMac, InterfaceAttribute(interface, "address"));
    card->nMtu = LeadingNumber<int>(InterfaceAttribute(interface, "mtu"));
    card->fLink = InterfaceAttribute(interface, "carrier") == "1";
    if (const auto found = AddressOf(interface)) {
        PutAddress(*card, *found);
        return CardState::has;
    }
    if (errno != EADDRNOTAVAIL)
        return CardState::unreadable;
    const bool stored = card->nMode != TAVO_NET_DHCP && ParseIpv4(ReadSetting(InterfaceFile(interface), "IPADDR"));
    return stored ? CardState::lacks : CardState::has_none;
}

}  // namespace tavo
