// The records of interfaces.
#include "network/net_card.h"

#include "frame/failure.h"

namespace tavoctl {

TAVONETCARD FirstCard(const std::string &attempted)
{
    TAVONETCARD card = {};
    Must(TAVONetGetCard1(&card) == 0, attempted, "is there a wired interface at all?");
    return card;
}

TAVONETCARD CardNamed(const std::string &attempted, const std::string &interface)
{
    if (interface.empty())
        return FirstCard(attempted);
    TAVONETCARD card = {};
    if (TAVONetGetCard(interface.c_str(), &card) == 0)
        return card;
    if (TLIBErrGet() == ERR_FILE_NOT_FOUND)
        throw NotFound(attempted, ERR_FILE_NOT_FOUND, "there is no interface " + interface);
    throw LibraryFailure(attempted);
}

std::string AddressText(const TAVONETCARD &card)
{
    if (card.nMode == TAVO_NET_DHCP)
        return "dhcp";
    return card.szIp[0] ? std::string(card.szIp) + "/" + card.szMask : "";
}

void RefuseUsedAddress(const TAVONETCARD &card, const std::string &address)
{
    if (!card.fLink || address == card.szIp)
        return;
    const std::string attempted = "take the address " + address;
    const int used = TAVONetAddressProbe(card.szInterface, address.c_str(), probe_milliseconds);
    Must(used >= 0, attempted, "--no-probe takes it without asking");
    BusyIf(used == 1, attempted, "another host uses it", "--no-probe takes it anyway");
}

}  // namespace tavoctl
