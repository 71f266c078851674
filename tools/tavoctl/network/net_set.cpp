// tavoctl net set: the address of an interface, on trial or for good.
#include "tavo_net.h"

#include "network/net_card.h"
#include "network/net_change.h"
#include "network/net_verbs.h"

namespace tavoctl {
namespace {

// "dhcp", "192.0.2.10/24" or "192.0.2.10/255.255.255.0".
TAVONETCARD WantedCard(const std::string &wanted)
{
    TAVONETCARD card = {};
    if (wanted == "dhcp") {
        card.nMode = TAVO_NET_DHCP;
        return card;
    }
    const auto refuse = [&](const char *why) {
        throw UsageFailure("set the address " + wanted, why, "say dhcp, 192.0.2.10/24 or 192.0.2.10/255.255.255.0");
    };
    const std::size_t slash = wanted.find('/');
    if (slash == wanted.npos || wanted.size() >= 32)
        refuse("an address and a mask are wanted");
    const std::string address = wanted.substr(0, slash);
    std::string mask = wanted.substr(slash + 1);
    if (!BlTLIBIsIpAddr(address.c_str()))
        refuse("no host can have that address");
    if (mask.find('.') == mask.npos) {
        char text[64];
        Put(text, wanted);
        if (ErrTLIBSubnetToIpMask(text, nullptr) != 0)
            refuse("the mask has 1 to 32 bits");
        mask = std::string(text).substr(std::string(text).find('/') + 1);
    }
    if (!BlTLIBIsIpMask(mask.data()))
        refuse("not a mask");
    card.nMode = TAVO_NET_STATIC;
    Put(card.szIp, address);
    Put(card.szMask, mask);
    return card;
}

// The wanted settings of the interface, and the gateway if one was given.
struct WantedNet {
    TAVONETCARD card;
    std::string text;
    std::optional<std::string> gateway;
};

void ChangeCard(const WantedNet &wanted, const TAVONETCARD &before)
{
    const int result = TAVONetSetCard1(&wanted.card, before.szIp[0] ? &before : nullptr);
    Must(result == 0, std::string("give ") + wanted.card.szInterface + " the address " + wanted.text,
         result == -2 ? "it cannot be stored" : "");
    if (wanted.gateway)
        Must(TAVONetDefaultGatewaySet(wanted.gateway->c_str()) == 0, "make " + *wanted.gateway + " the gateway");
}

}  // namespace

Action NetSet(Arguments &in)
{
    const auto interface = in.Option("--interface", "NAME", interface_kind, "which one (the first one)");
    const auto gateway = in.Option("--gateway", "ADDRESS", ipv4_kind, "the default gateway, too");
    const auto seconds = TrialOption(in);
    const auto no_probe = in.Flag("--no-probe", no_probe_help);
    const auto address = in.Text("ADDRESS", any_text, "\"dhcp\", or an address with its mask");
    return [=](Call &call) {
        WantedNet wanted = {WantedCard(*address), *address, *gateway};
        const TAVONETCARD before = CardNamed("change the address", interface->value_or(""));
        const std::string name = before.szInterface;
        Put(wanted.card.szInterface, name);
        // The stored settings may differ from the kernel's, so the change is always made.
        call.Change(name, "address", Maybe(AddressText(before)), AddressText(wanted.card));
        if (*gateway)
            call.Change("network", "gateway", {}, **gateway);
        if (call.dry_run)
            return;
        if (wanted.card.nMode == TAVO_NET_STATIC && !*no_probe)
            RefuseUsedAddress(before, wanted.card.szIp);
        NetChange::Make(*seconds, [&] { ChangeCard(wanted, before); });
    };
}

Given<std::optional<int64_t>> TrialOption(Arguments &in)
{
    constexpr int64_t longest_trial = 86400;
    return in.Number("--try", "SECONDS", "put the old settings back unless they are confirmed by then", 1,
                     longest_trial);
}

Action NetConfirm(Arguments &)
{
    return [](Call &call) {
        call.Change("network", "trial", "running", "kept");
        if (call.Proceed())
            NetChange::Confirm();
    };
}

}  // namespace tavoctl
