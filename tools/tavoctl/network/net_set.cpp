// tavoctl net set: the address of an interface, on trial or for good.
#include "frame/failure.h"
#include "frame/table.h"
#include "network/net_trial.h"
#include "network/net_verbs.h"

#include "tavo_net.h"

#include <cstdio>
#include <memory>

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
        refuse("that is no mask");
    card.nMode = TAVO_NET_STATIC;
    Put(card.szIp, address);
    Put(card.szMask, mask);
    return card;
}

class NetSet : public Verb {
  public:
    static constexpr VerbInfo info = {
        "set", changes,
        "Gives an interface its address: one from DHCP, or a static one. Whoever reaches the appliance by that very "
        "interface says --try: unless the new settings are confirmed in time, here or with `tavoctl net confirm` from "
        "another connection, the old ones come back, also when this command has ended with its connection.",
        "tavoctl net set dhcp\n"
        "tavoctl net set 192.0.2.10/24 --gateway 192.0.2.1\n"
        "tavoctl net set --interface eth1 192.0.2.10/255.255.255.0\n"
        "tavoctl net set --try 60 192.0.2.20/24"};

    void Declare(Arguments &arguments) override
    {
        arguments.Option("--interface", "NAME", interface_, "which one (the first one)", InterfaceNames);
        arguments.Option("--gateway", "ADDRESS", gateway_, "the default gateway, too");
        arguments.Number("--try", "SECONDS", seconds_, "put the old settings back unless they are confirmed by then", 1,
                         86400);
        arguments.Text("ADDRESS", wanted_, "\"dhcp\", or an address with its mask");
    }

    int Run(const Call &) override
    {
        const std::string attempted = "change the address";
        TAVONETCARD card = WantedCard(wanted_);
        if (!gateway_.empty() && !BlTLIBIsIpAddr(gateway_.c_str()))
            throw UsageFailure("make " + gateway_ + " the gateway", "no host can have that address");
        if (interface_.empty())
            interface_ = FirstCard(attempted).szInterface;
        CheckInterface(attempted, interface_);
        Put(card.szInterface, interface_);
        if (seconds_ == 0) {
            Change(card, NetSnapshot(interface_).Card());
            return exit_done;
        }
        NetTrial trial(interface_, seconds_);
        try {
            Change(card, trial.Before());
        } catch (Failure &failure) {
            failure.hint += std::string(failure.hint.empty() ? "" : "; ") +
                            (trial.GiveUp() ? "the old settings are back" : "the old settings could not be put back");
            throw;
        }
        trial.Begin();
        if (!trial.IsKept())
            throw Failure{.attempted = "keep the new settings",
                          .reason = "they were not confirmed, the old ones are back",
                          .status = exit_failed};
        return exit_done;
    }

  private:
    void Change(const TAVONETCARD &card, const TAVONETCARD &before) const
    {
        const int result = TAVONetSetCard1(&card, before.szIp[0] ? &before : nullptr);
        if (result != 0)
            throw LibraryFailure("give " + interface_ + " the address " + wanted_,
                                 result == -2 ? "it has the address, but that is not stored" : "the old one stays");
        if (!gateway_.empty() && TAVONetDefaultGatewaySet(gateway_.c_str()) != 0)
            throw LibraryFailure("make " + gateway_ + " the gateway", "the address is set");
    }

    std::string interface_;
    std::string gateway_;
    std::string wanted_;
    int seconds_ = 0;
};

class NetConfirm : public Verb {
  public:
    static constexpr VerbInfo info = {
        "confirm", changes, "Keeps the settings that `tavoctl net set --try` has on trial.", "tavoctl net confirm"};

    int Run(const Call &) override
    {
        NetTrial::Confirm();
        return exit_done;
    }
};

}  // namespace

void AddNetSet(Family &net)
{
    net.Add<NetSet>();
    net.Add<NetConfirm>();
}

}  // namespace tavoctl
