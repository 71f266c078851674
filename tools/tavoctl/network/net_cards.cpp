// tavoctl net ipv6, wol, bond: settings of one card, or of several together.
#include "tavo_net.h"

#include "frame/containers.h"
#include "frame/text.h"
#include "network/net_card.h"
#include "network/net_present.h"
#include "network/net_verbs.h"

#include <algorithm>
#include <iterator>

#include <unistd.h>

namespace tavoctl {
namespace {

// "on", "off", or an address with its length.
bool IsIpv6Change(const std::string &what)
{
    const std::size_t slash = what.find('/');
    return slash == what.npos ? what == "on" || what == "off" : NumberIn<int>(what.substr(slash + 1)).has_value();
}

constexpr ArgumentKind ipv6_kind = {
    .name = "IPv6 change",
    .allowed = "on, off or ADDRESS/LENGTH",
    .valid = IsIpv6Change,
    .candidates =
        [] {
            return std::vector<std::string>{"on", "off"};
        },
    .sample = "on",
    .wrong = "maybe",
};

std::vector<std::string> MembersOfBond(const std::string &bond)
{
    StringList members;
    TAVONetLinkAggrPhyGet(bond.c_str(), members.Address());
    return members.Items();
}

}  // namespace

std::vector<std::string> Ipv6Of(const std::string &interface)
{
    StringList list;
    return TAVONetIPv6AddrEnum(interface.c_str(), list.Address()) < 0 ? std::vector<std::string>() : list.Items();
}

Action NetIpv6(Arguments &in)
{
    const auto remove = in.Flag("--remove", "take the address, and the route to the gateway, away");
    const auto gateway = in.Option("--gateway", "ADDRESS", any_text, "the default route goes there");
    const auto interface = in.Text("INTERFACE", interface_kind, interface_help);
    const auto what = in.Text("WHAT", ipv6_kind, "on, off, or ADDRESS/LENGTH");
    return [=](Call &call) {
        const std::size_t slash = what->find('/');
        const char *name = interface->c_str();
        if (slash == what->npos) {
            const bool on = *what == "on";
            call.Change(*interface, "ipv6", BlTAVONetIPv6IsEnabled(name) == 1, on);
            if (call.Proceed())
                Must(TAVONetIPv6Set(name, on) == 0, "switch IPv6 of " + *interface + " " + *what);
            return;
        }
        const bool has = Contains(Ipv6Of(*interface), *what);
        // An address that is there may be written in another way: the library knows.
        call.Change(*interface, "ipv6_addresses", *remove ? Cell(*what) : Cell(),
                    *remove || (has && !*gateway) ? Cell() : Cell(*what));
        if (!call.Proceed())
            return;
        const auto route = [&] {
            const auto change = *remove ? TAVONetIPv6RouteDel : TAVONetIPv6RouteAdd;
            if (*gateway)
                Must(change(name, "::", 0, (*gateway)->c_str()) == 0,
                     (*remove ? "remove the route to " : "add the route to ") + **gateway);
        };
        if (*remove)
            route();
        const auto change = *remove ? TAVONetIPv6AddrDel : TAVONetIPv6AddrAdd;
        if (!has || *remove)
            Must(change(name, what->substr(0, slash).c_str(), std::stoi(what->substr(slash + 1))) == 0,
                 (*remove ? "take " + *what + " from " : "give " + *what + " to ") + *interface,
                 HintFor{ERR_OP_FAILURE, "tavoctl net show tells what it has"});
        if (!*remove)
            route();
    };
}

Action NetWol(Arguments &in)
{
    const auto interface = in.Text("INTERFACE", interface_kind, interface_help);
    const auto what = in.Choice("WHAT", {"on", "off"}, "on or off");
    return [=](Call &call) {
        const bool on = *what == "on";
        const int wakes = TAVONetWolGet(interface->c_str());
        call.Change(*interface, "wake_on_lan", wakes < 0 ? Cell() : Cell(wakes == 1), on);
        if (call.Proceed())
            Must(TAVONetWolSet(interface->c_str(), on) == 0, "switch wake-on-LAN of " + *interface + " " + *what,
                 HintFor{ERR_OP_UNREGISTERED, "this model cannot do that"});
    };
}

Action NetBonds(Arguments &)
{
    return [](Call &call) {
        StringList bonds;
        Must(TAVONetLinkAggrEnum(bonds.Address()) >= 0, "list the bonds");
        std::vector<BondFacts> facts;
        for (const std::string &bond : bonds.Items()) {
            TAVONETLINKAGGR record = {};
            facts.push_back({bond, {}, MembersOfBond(bond), {}});
            if (TAVONetLinkAggrGet(bond.c_str(), &record) != 0)
                continue;  // a mode that the appliance does not offer
            facts.back().mode = bond_modes[record.nMode];
            facts.back().partner = Maybe(record.szPartner);
        }
        call.List(bond_columns, facts);
    };
}

Action NetBond(Arguments &in)
{
    const auto bond = in.Option("--name", "BOND", interface_kind, "the bond (bond0)");
    const auto mode =
        in.Choice("MODE", {std::begin(bond_modes), std::end(bond_modes)}, "lacp, adaptive, backup, or none");
    const auto members = in.Texts("INTERFACE", interface_kind, "its members, in their order", 0);
    return [=](Call &call) {
        const std::string name = bond->value_or("bond0");
        const std::string attempted = "change " + name;
        TAVONETLINKAGGR record = {};
        Put(record.szBond, name);
        const auto *found = std::find(std::begin(bond_modes), std::end(bond_modes), *mode);
        record.nMode = static_cast<int32_t>(found - std::begin(bond_modes));
        RefuseIf((record.nMode == TAVO_NET_AGGR_NONE) != members->empty(), attempted,
                 members->empty() ? "it has no members" : "a dissolved bond has no members");
        for (const std::string &member : *members)
            Must(TAVONetLinkAggrOptSlsaveAdd(&record, member.c_str()) == 0, "take " + member + " into " + name,
                 HintFor{ERR_LINK_AGGR_TYPE, "it is not an Ethernet card"});
        TAVONETLINKAGGR now = {};  // where kernel and file do not agree, neither is how it is
        const bool stored = ::access(InterfaceFileOf(name).c_str(), F_OK) == 0;
        const bool agreed = TAVONetLinkAggrGet(name.c_str(), &now) == 0 && stored == (now.nMode != TAVO_NET_AGGR_NONE);
        call.Change(name, "mode", agreed ? Cell(bond_modes[now.nMode]) : Cell(), *mode);
        call.Change(name, "members", MembersOfBond(name), *members);
        if (call.Proceed("The network stops while " + name + " changes. Go on?"))
            Must(TAVONetLinkAggrSet(&record) == 0, attempted);
    };
}

}  // namespace tavoctl
