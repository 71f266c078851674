// tavoctl net ipv6, wol, bond: what one card, or several together, can do.
#include "frame/containers.h"
#include "frame/failure.h"
#include "frame/table.h"
#include "network/net_verbs.h"

#include "tavo_net.h"

#include <algorithm>
#include <charconv>
#include <cstring>
#include <iterator>

namespace tavoctl {
namespace {

// True for "on", false for "off".
bool Switch(const std::string &attempted, const std::string &word)
{
    if (word != "on" && word != "off")
        throw UsageFailure(attempted, "\"" + word + "\" is neither on nor off");
    return word == "on";
}

std::vector<std::string> OnOff()
{
    return {"on", "off"};
}

class NetIpv6 : public Verb {
  public:
    static constexpr VerbInfo info = {
        "ipv6", changes,
        "Switches IPv6 on an interface on or off, or gives it an address or, with --remove, takes one away.",
        "tavoctl net ipv6 eth0 off\n"
        "tavoctl net ipv6 eth0 2001:db8::10/64\n"
        "tavoctl net ipv6 eth0 2001:db8::10/64 --gateway 2001:db8::1\n"
        "tavoctl net ipv6 --remove eth0 2001:db8::10/64"};

    void Declare(Arguments &arguments) override
    {
        arguments.Flag("--remove", remove_, "take the address, and the route to the gateway, away");
        arguments.Option("--gateway", "ADDRESS", gateway_, "the default route goes there");
        arguments.Text("INTERFACE", interface_, "such as eth0", InterfaceNames);
        arguments.Text("WHAT", what_, "on, off, or ADDRESS/LENGTH", OnOff);
    }

    int Run(const Call &) override
    {
        const std::size_t slash = what_.find('/');
        if (slash == what_.npos) {
            const bool on = Switch("change IPv6 of " + interface_, what_);
            if (TAVONetIPv6Set(interface_.c_str(), on) != 0)
                throw LibraryFailure("switch IPv6 of " + interface_ + " " + what_);
            return exit_done;
        }
        int length = -1;
        const char *const end = what_.data() + what_.size();
        if (const auto [stop, error] = std::from_chars(what_.data() + slash + 1, end, length);
            error != std::errc() || stop != end)
            throw UsageFailure("change " + what_, "the length behind the slash is no number");
        const std::string address = what_.substr(0, slash);
        const auto route = [&] {
            if (gateway_.empty())
                return;
            const auto change = remove_ ? TAVONetIPv6RouteDel : TAVONetIPv6RouteAdd;
            if (change(interface_.c_str(), "::", 0, gateway_.c_str()) != 0)
                throw LibraryFailure((remove_ ? "remove the route to " : "add the route to ") + gateway_);
        };
        if (remove_)
            route();
        const auto change = remove_ ? TAVONetIPv6AddrDel : TAVONetIPv6AddrAdd;
        if (change(interface_.c_str(), address.c_str(), length) != 0)
            throw LibraryFailure((remove_ ? "take " + what_ + " from " : "give " + what_ + " to ") + interface_,
                                 TLIBErrGet() == ERR_OP_FAILURE ? "tavoctl net show tells what it has" : "");
        if (!remove_)
            route();
        return exit_done;
    }

  private:
    bool remove_ = false;
    std::string gateway_;
    std::string interface_;
    std::string what_;
};

class NetWol : public Verb {
  public:
    static constexpr VerbInfo info = {"wol", changes,
                                      "Lets an interface wake the appliance, or no more. On which packets is said by "
                                      "wol_enabled_options in /etc/tavoinfo.conf.",
                                      "tavoctl net wol eth0 on"};

    void Declare(Arguments &arguments) override
    {
        arguments.Text("INTERFACE", interface_, "such as eth0", InterfaceNames);
        arguments.Text("WHAT", what_, "on or off", OnOff);
    }

    int Run(const Call &) override
    {
        const bool on = Switch("change wake-on-LAN of " + interface_, what_);
        if (TAVONetWolSet(interface_.c_str(), on) != 0)
            throw LibraryFailure("switch wake-on-LAN of " + interface_ + " " + what_,
                                 TLIBErrGet() == ERR_OP_UNREGISTERED ? "this model cannot do that" : "");
        return exit_done;
    }

  private:
    std::string interface_;
    std::string what_;
};

constexpr const char *modes[] = {"none", "lacp", "adaptive", "backup"};  // in the order of TAVONETLINKAGGR.nMode

std::vector<std::string> Modes()
{
    return {std::begin(modes), std::end(modes)};
}

class NetBonds : public Verb {
  public:
    static constexpr VerbInfo info = {"bonds", reads,
                                      "Lists the bonds: their mode, their members, and the switch at the other end of "
                                      "an 802.3ad one.",
                                      "tavoctl net bonds"};

    int Run(const Call &call) override
    {
        StringList bonds;
        if (TAVONetLinkAggrEnum(bonds.Address()) < 0)
            throw LibraryFailure("list the bonds");
        Table table({"bond", "mode", "members", "partner"});
        for (const std::string &bond : bonds.Items()) {
            TAVONETLINKAGGR record = {};
            if (TAVONetLinkAggrGet(bond.c_str(), &record) != 0) {
                table.Add({bond, Cell(), Members(bond), Cell()});  // a mode that is none of ours
                continue;
            }
            table.Add({bond, modes[record.nMode], Members(bond), Known(record.szPartner)});
        }
        call.Print(table);
        return exit_done;
    }

  private:
    static Cell Members(const std::string &bond)
    {
        StringList members;
        TAVONetLinkAggrPhyGet(bond.c_str(), members.Address());
        return members.Items();
    }
};

class NetBond : public Verb {
  public:
    static constexpr VerbInfo info = {"bond", changes | destroys,
                                      "Makes a bond of interfaces, changes it, or dissolves it (mode \"none\"). The "
                                      "network is stopped meanwhile. lacp "
                                      "is 802.3ad and wants a switch that knows it; adaptive spreads the load by "
                                      "itself; backup uses one card at a time.",
                                      "tavoctl net bond backup eth0 eth1\n"
                                      "tavoctl net bond --name bond0 lacp eth0 eth1\n"
                                      "tavoctl net bond --yes none"};

    void Declare(Arguments &arguments) override
    {
        arguments.Option("--name", "BOND", name_, "the bond (bond0)");
        arguments.Text("MODE", mode_, "lacp, adaptive, backup, or none", Modes);
        arguments.Texts("INTERFACE", members_, "its members, in their order", 0, InterfaceNames);
    }

    int Run(const Call &call) override
    {
        const std::string attempted = "change " + name_;
        TAVONETLINKAGGR record = {};
        if (name_.size() >= sizeof record.szBond)
            throw UsageFailure(attempted, "the name is too long");
        std::memcpy(record.szBond, name_.c_str(), name_.size());
        const auto names = Modes();
        const auto found = std::find(names.begin(), names.end(), mode_);
        if (found == names.end())
            throw UsageFailure(attempted, "there is no mode " + mode_, "lacp, adaptive, backup, or none");
        record.nMode = static_cast<int32_t>(found - names.begin());
        if ((record.nMode == TAVO_NET_AGGR_NONE) != members_.empty())
            throw UsageFailure(attempted, members_.empty() ? "it has no members" : "a dissolved bond has no members");
        for (const std::string &member : members_) {
            if (TAVONetLinkAggrOptSlsaveAdd(&record, member.c_str()) != 0)
                throw LibraryFailure("take " + member + " into " + name_,
                                     TLIBErrGet() == ERR_LINK_AGGR_TYPE ? "it is no Ethernet card" : "");
        }
        call.Confirm("The network stops while " + name_ + " changes. Go on?");
        if (TAVONetLinkAggrSet(&record) != 0)
            throw LibraryFailure(attempted);
        return exit_done;
    }

  private:
    std::string name_ = "bond0";
    std::string mode_;
    std::vector<std::string> members_;
};

}  // namespace

void AddNetCards(Family &net)
{
    net.Add<NetIpv6>();
    net.Add<NetWol>();
    net.Add<NetBonds>();
    net.Add<NetBond>();
}

}  // namespace tavoctl
