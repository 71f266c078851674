// tavoctl net: the state of the network, and single settings of it.
#include "tavo_error.h"
#include "tavo_net.h"

#include "families.h"
#include "frame/containers.h"
#include "frame/files.h"
#include "network/net_card.h"
#include "network/net_document.h"
#include "network/net_text.h"
#include "network/net_verbs.h"

#include <algorithm>

#include <unistd.h>

namespace tavoctl {

std::vector<std::string> InterfaceNames()
{
    std::vector<std::string> names = FolderNames("/sys/class/net");
    std::erase_if(names, [](const std::string &name) { return name == "lo" || name == "bonding_masters"; });
    return names;
}

const ArgumentKind interface_kind = {
    .name = "interface",
    .allowed = "1 to 15 letters, digits, \".\", \"-\", \"_\" and \":\"",
    .valid =
        [](const std::string &name) {
            return !name.empty() && name.size() < sizeof TAVONETCARD::szInterface && name[0] != '.' &&
                   std::all_of(name.begin(), name.end(), [](unsigned char c) {
                       return std::isalnum(c) || c == '.' || c == '-' || c == '_' || c == ':';
                   });
        },
    .candidates = InterfaceNames,
    .sample = "eth77",
    .wrong = "../eth0",
};
const ArgumentKind ipv4_kind = {
    .name = "IPv4 address",
    .allowed = "the IPv4 address of a host, such as 192.0.2.1",
    .valid = [](const std::string &text) { return NormalIpv4(text).has_value(); },
    .code = ERR_INVALID_NETNAME,
    .sample = "192.0.2.77",
    .wrong = "nonsense",
};

namespace {

constexpr ArgumentKind server_kind = {
    .name = "address",
    .allowed = "the IPv4 or IPv6 address of a host, such as 192.0.2.53",
    .valid = [](const std::string &text) { return NormalServer(text).has_value(); },
    .code = ERR_INVALID_NETNAME,
    .sample = "192.0.2.53",
    .wrong = "nonsense",
};
constexpr ArgumentKind hostname_kind = {
    .name = "host name",
    .allowed = "1 to 15 letters, digits, \"-\" and \"_\", with a letter first",
    .valid = [](const std::string &text) { return NormalHostname(text).has_value(); },
    .code = ERR_INVALID_NETNAME,
    .sample = "nemo",
    .wrong = "a b",
};

// Of the appliance as a whole.
struct NetFacts {
    std::optional<std::string> hostname, gateway, live_gateway;
    std::vector<std::string> dns;
};

constexpr Column<NetFacts> net_columns[] = {
    {"hostname", field<&NetFacts::hostname>},
    {"gateway", field<&NetFacts::gateway>},
    {"live_gateway", field<&NetFacts::live_gateway>},
    {"dns", field<&NetFacts::dns>},
};

struct CardFacts {
    TAVONETCARD card;
    NetFacts net;
    std::vector<std::string> ipv6_addresses;
    std::optional<bool> wake_on_lan;
};

constexpr Column<CardFacts> card_columns[] = {
    {"interface", [](const CardFacts &c) { return std::string(c.card.szInterface); }},
    {"mode", [](const CardFacts &c) -> std::string { return c.card.nMode == TAVO_NET_DHCP ? "dhcp" : "static"; },
     "dhcp or static"},
    {"address", [](const CardFacts &c) { return Maybe(c.card.szIp); }},
    {"mask", [](const CardFacts &c) { return Maybe(c.card.szMask); }},
    {"network", [](const CardFacts &c) { return Maybe(c.card.szNetwork); }, "", in_details},
    {"broadcast", [](const CardFacts &c) { return Maybe(c.card.szBroadcast); }, "", in_details},
    {"mac", [](const CardFacts &c) { return Maybe(c.card.szMac); }},
    {"mtu", [](const CardFacts &c) { return c.card.nMtu; }, "", in_list, "bytes"},
    {"link", [](const CardFacts &c) { return c.card.fLink != 0; }},
    {"ipv6", [](const CardFacts &c) { return BlTAVONetIPv6IsEnabled(c.card.szInterface) == 1; }, "", in_details},
    {"ipv6_addresses", field<&CardFacts::ipv6_addresses>, "", in_details},
    {"wake_on_lan", field<&CardFacts::wake_on_lan>, "", in_details},
    {"hostname", [](const CardFacts &c) { return c.net.hostname; }, "of the appliance, as the next three", in_details},
    {"gateway", [](const CardFacts &c) { return c.net.gateway; }, "as it is stored", in_details},
    {"live_gateway", [](const CardFacts &c) { return c.net.live_gateway; }, "as it is used", in_details},
    {"dns", [](const CardFacts &c) { return c.net.dns; }, "the name servers", in_details},
};

struct AddressUse {
    std::string address, interface;
    bool used;
};

constexpr Column<AddressUse> address_columns[] = {
    {"address", field<&AddressUse::address>},
    {"interface", field<&AddressUse::interface>, "that would have the address"},
    {"used", field<&AddressUse::used>, "by another host"},
};

NetFacts PresentNet()
{
    NetFacts facts;
    char text[64] = "";
    if (TAVOLnxGetHostname(text, sizeof text) == 0)
        facts.hostname = text;
    if (TAVONetDefaultGatewayGetConf(text, sizeof text) == 0)
        facts.gateway = Maybe(text);
    if (TAVONetDefaultGatewayGet(text, sizeof text) == 0)
        facts.live_gateway = Maybe(text);
    StringList servers;
    TAVONetDNSGet(servers.Address());
    facts.dns = servers.Items();
    return facts;
}

CardFacts FactsOf(const TAVONETCARD &card, const NetFacts &net)
{
    CardFacts facts = {card, net, Ipv6Of(card.szInterface), {}};
    if (const int wakes = TAVONetWolGet(card.szInterface); wakes >= 0)
        facts.wake_on_lan = wakes == 1;
    return facts;
}

Action NetShow(Arguments &in)
{
    const auto only = in.OptionalText("INTERFACE", interface_kind, "all about this one");
    return [=](Call &call) {
        const NetFacts net = PresentNet();
        if (*only)
            return call.One(card_columns, FactsOf(CardNamed("show " + **only, **only), net));
        std::vector<CardFacts> cards;
        for (const std::string &name : InterfaceNames()) {
            TAVONETCARD card = {};
            if (TAVONetGetCard(name.c_str(), &card) == 0 && card.szMac[0])
                cards.push_back(FactsOf(card, net));
        }
        if (!call.json && call.style.columns.empty() && call.style.headings)
            call.Print(Record(net_columns, net), call.TableOf(card_columns, cards));
        else
            call.List(card_columns, cards);
    };
}

Action NetGateway(Arguments &in)
{
    const auto address = in.Text("ADDRESS", ipv4_kind, "of the router");
    return [=](Call &call) {
        // It is stored, too, so that the change is made in any case.
        call.Change("network", "gateway", PresentNet().live_gateway, *address);
        if (!call.dry_run)
            Must(TAVONetDefaultGatewaySet(address->c_str()) == 0, "make " + *address + " the gateway",
                 "is it on the network of an interface?");
    };
}

Action NetDns(Arguments &in)
{
    const auto none = in.Flag("--none", "no name server at all");
    const auto addresses = in.Texts("ADDRESS", server_kind, "of a name server", 0);
    return [=](Call &call) {
        RefuseIf(*none != addresses->empty(), "set the name servers",
                 *none ? "there are some, and --none" : "none was named",
                 "name them in the order in which they are asked, or use --none");
        call.Change("network", "dns", PresentNet().dns, *addresses);
        if (call.Proceed())
            Must(TAVONetDNSSet(StringList(*addresses).Get()) == 0, "set the name servers");
    };
}

Action NetHostname(Arguments &in)
{
    const auto name = in.Text("NAME", hostname_kind, "the new host name");
    return [=](Call &call) {
        call.Change("network", "hostname", PresentNet().hostname, *name);
        if (!call.dry_run)
            Must(TAVOLnxSetHostname(name->c_str()) == 0, "name this appliance " + *name);
    };
}

Action NetMtu(Arguments &in)
{
    const auto interface = in.Text("INTERFACE", interface_kind, interface_help);
    const auto bytes = in.Number("BYTES", "BYTES", "68 to 65535", 68, 65535);
    return [=](Call &call) {
        const std::string attempted = "set the MTU of " + *interface + " to " + std::to_string(**bytes);
        const TAVONETCARD card = CardNamed(attempted, *interface);
        const int stored = TAVOGetMTUSetting(card.szInterface);
        call.Change(*interface, "mtu", card.nMtu == **bytes ? stored : card.nMtu, **bytes);
        if (call.Proceed())
            Must(TAVONetSetMTUValue(card.szInterface, static_cast<int>(**bytes)) == 0, attempted,
                 HintFor{ERR_OP_FAILURE, "the card does not take it"});
    };
}

Action NetRefresh(Arguments &)
{
    return [](Call &call) {
        // The library finds out whether there is anything to do.
        call.Change("network", "state", {}, "refreshed");
        if (call.Proceed())
            Must(TAVONetHostsRefresh() >= 0, "refresh the network");
    };
}

Action NetCheckAddress(Arguments &in)
{
    const auto wanted = in.Option("--interface", "NAME", interface_kind, "that would have the address (the first one)");
    const auto address = in.Text("ADDRESS", ipv4_kind, "an IPv4 address");
    return [=](Call &call) {
        const std::string attempted = "check " + *address;
        const std::string interface = *wanted ? **wanted : std::string(FirstCard(attempted).szInterface);
        int used = TAVOIIpConflict(interface.c_str(), address->c_str());
        Must(used >= 0, attempted);
        const TAVONETCARD card = CardNamed(attempted, interface);
        // Many hosts answer no ping; ARP they must answer.
        if (used == 0 && card.fLink && *address != card.szIp && ::geteuid() == 0) {
            used = TAVONetAddressProbe(card.szInterface, address->c_str(), probe_milliseconds);
            Must(used >= 0, attempted);
        }
        call.Value(used ? "used" : "free", address_columns, AddressUse{*address, interface, used == 1});
        call.status = used ? exit_busy : exit_done;
    };
}

struct PortUse {
    int64_t port;
    bool used;
};

constexpr Column<PortUse> port_columns[] = {
    {"port", field<&PortUse::port>},
    {"used", field<&PortUse::used>, "by a TCP or UDP socket, of IPv4 or IPv6"},
};

Action NetCheckPort(Arguments &in)
{
    const auto port = in.Number("PORT", "PORT", "1 to 65535", 1, 65535);
    return [=](Call &call) {
        TLIBErrSet(ERR_SUCCESS);
        const bool used = BlTLIBIsPortInUse(static_cast<int>(**port)) == 1;
        Must(used || TLIBErrGet() == ERR_SUCCESS, "check port " + std::to_string(**port));
        call.Value(used ? "used" : "free", port_columns, PortUse{**port, used});
        call.status = used ? exit_busy : exit_done;
    };
}

}  // namespace

void AddNet(Program &program)
{
    Family &net = program.Add("net", "Interfaces, addresses, names and bonds");
    net.Add("show", reads, Answer::List(card_columns).OrOne(card_columns), NetShow,
            R"(Shows the host name, the gateway as it is
stored and as it is used, the name servers and the interfaces, or all about one of them.

tavoctl net show
tavoctl net show eth0
tavoctl net show --json)");
    net.Add("set", changes, NetSet, R"(Sets the address of an interface: one from DHCP, or a static one. If
you reach the appliance by that very interface, use --try: unless the new settings are confirmed in time, here or with
`tavoctl net confirm` from another connection, the old ones come back, also when this command has ended with its
connection. A static address is taken only when no other host answers for it.

tavoctl net set dhcp
tavoctl net set 192.0.2.10/24 --gateway 192.0.2.1
tavoctl net set --interface eth1 192.0.2.10/255.255.255.0
tavoctl net set --try 60 192.0.2.20/24)");
    net.Add("export", reads, Answer::Own(NetDocumentSchema, "network.md"), NetExport,
            R"(Writes the whole network as a JSON document, in
the form that apply reads.

tavoctl net export
tavoctl net export >network.json)");
    net.Add("apply", changes, NetApply, R"(Brings the network to what a JSON document says. What is so already is
not touched, and what the document does not speak of stays. When a step fails everything is as it was. --try puts
the old network back unless it is confirmed in time.

tavoctl net apply --dry-run network.json
tavoctl net apply --try 60 network.json)");
    net.Add("confirm", changes, NetConfirm, R"(Keeps the settings that `tavoctl net set --try` or
`tavoctl net apply --try` has on trial.

tavoctl net confirm)");
    net.Add("gateway", changes, NetGateway, R"(Makes ADDRESS the default gateway and stores it. When it cannot be
reached from any interface the old one stays.

tavoctl net gateway 192.0.2.1)");
    net.Add("dns", changes, NetDns, R"(Replaces the name servers, in the order in which they are asked.

tavoctl net dns 192.0.2.53 2001:db8::53
tavoctl net dns --none)");
    net.Add("hostname", changes, NetHostname, R"(Renames the appliance: in the kernel, in the stored
settings and in /etc/hosts. 1 to 15 letters, digits, "-" and "_".

tavoctl net hostname attic)");
    net.Add("mtu", changes, NetMtu, R"(Sets and stores the MTU of an interface.

tavoctl net mtu eth0 9000)");
    net.Add("check-address", reads, Answer::One(address_columns), NetCheckAddress,
            R"(Checks whether another host uses ADDRESS: "free", or
"used" with exit status 4. It asks by ping and, when called by root, by ARP (RFC 5227), which hosts that answer no ping
answer, too. The appliance's own address is free.

tavoctl net check-address 192.0.2.20
tavoctl net check-address --interface eth1 192.0.2.20)");
    net.Add("check-port", reads, Answer::One(port_columns), NetCheckPort,
            R"(Checks whether a program on this appliance uses a TCP or
UDP port: "free", or "used" with exit status 4.

tavoctl net check-port 5000)");
    net.Add("refresh", changes, NetRefresh, R"(Puts back what a program that died in the middle of a change has
left, and brings the appliance's name in /etc/hosts up to date. Never waits: it leaves both to a program that is changing
the network just now. The start of the network and the DHCP client's hook run it.

tavoctl net refresh)");
    net.Add("ipv6", changes, NetIpv6, R"(Switches IPv6 on an interface on or off, or gives it an address or,
with --remove, takes one away.

tavoctl net ipv6 eth0 off
tavoctl net ipv6 eth0 2001:db8::10/64
tavoctl net ipv6 eth0 2001:db8::10/64 --gateway 2001:db8::1
tavoctl net ipv6 --remove eth0 2001:db8::10/64)");
    net.Add("wol", changes, NetWol, R"(Allows or forbids an interface to wake the appliance. On which packets is set
by wol_enabled_options in /etc/tavoinfo.conf.

tavoctl net wol eth0 on)");
    net.Add("bonds", reads, Answer::List(bond_columns), NetBonds,
            R"(Lists the bonds: their mode, their members, and the switch at
the other end of an 802.3ad one.

tavoctl net bonds)");
    net.Add("bond", changes | destroys, NetBond, R"(Makes a bond of interfaces, changes it, or dissolves it (mode
"none"). The network is stopped meanwhile. lacp is 802.3ad and wants a switch that knows it; adaptive spreads the load
by itself; backup uses one card at a time.

tavoctl net bond backup eth0 eth1
tavoctl net bond --name bond0 lacp eth0 eth1
tavoctl net bond --yes none)");
}

}  // namespace tavoctl
