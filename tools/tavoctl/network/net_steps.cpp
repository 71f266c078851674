// The steps from the network as it is to that of a document.
#include "tavo_file.h"
#include "tavo_net.h"
#include "tavo_proc.h"

#include "frame/arguments.h"
#include "frame/containers.h"
#include "frame/failure.h"
#include "frame/files.h"
#include "frame/text.h"
#include "network/net_card.h"
#include "network/net_present.h"
#include "network/net_text.h"

#include <algorithm>
#include <csignal>
#include <functional>

#include <unistd.h>

namespace tavoctl {
namespace {

// The words come from texts that were checked: no character of them means something to a shell.
void Run(const std::string &command, const std::string &attempted)
{
    FailIf(TLIBSystem((command + " > /dev/null 2>&1").c_str()) != 0, attempted, "\"" + command + "\" failed");
}

Words Minus(const Words &all, const Words &others)
{
    Words left = all;
    std::erase_if(left, [&](const std::string &one) { return Contains(others, one); });
    return left;
}

bool IsIpv6(const std::string &text)
{
    return text.find(':') != text.npos;
}

int LengthIn(const std::string &text)
{
    return static_cast<int>(IpAddress::In(text).value().length);
}

bool Exists(const std::string &interface)
{
    return ::access(("/sys/class/net/" + interface).c_str(), F_OK) == 0;
}

void SetKey(const std::string &path, const char *key, const std::string &value)
{
    Must(TLIBFileSetKeyValue(path.c_str(), key, value.c_str(), nullptr) >= 0, "write " + path);
}

void RemoveKey(const std::string &path, const char *key)
{
    if (!NetSetting(path, key).empty())
        Must(TLIBFileRemoveKey(path.c_str(), key) >= 0, "write " + path);
}

// The start script passes over a card without a file.
void MakeFile(const std::string &name)
{
    const std::string file = InterfaceFileOf(name);
    SetKey(file, "DEVICE", name);
    SetKey(file, "ONBOOT", "yes");
    if (NetSetting(file, "BOOTPROTO").empty())
        SetKey(file, "BOOTPROTO", "none");
}

// --- interfaces that a document makes and removes ---

void SetBond(const std::string &name, int mode, const Words &members)
{
    TAVONETLINKAGGR bond = {};
    Put(bond.szBond, name);
    bond.nMode = mode;
    for (const std::string &member : members)
        Must(TAVONetLinkAggrOptSlsaveAdd(&bond, member.c_str()) == 0, "take " + member + " into " + name);
    Must(TAVONetLinkAggrSet(&bond) == 0, "change " + name);
}

void SetVlan(const std::string &name, const std::string &parent, int number)
{
    MoreFile more = ReadMoreFile(name);
    if (Exists(name) && more.parent == parent && more.vlan == number &&
        TextOf(LiveCard(name, "none"), "parent") == parent)
        return;
    more.parent = parent;
    more.vlan = number;
    MakeFile(name);
    ReplaceFile(net_folder + ("more-" + name), more.Text());
    if (Exists(name))
        Run("/sbin/ip link del " + name, "remove " + name);
    Run("/sbin/ifconfig " + parent + " up", "start " + parent);
    Run("/sbin/ip link add link " + parent + " name " + name + " type vlan id " + std::to_string(number),
        "make " + name);
    Run("/sbin/ifconfig " + name + " up", "start " + name);
}

void RemoveInterface(const std::string &name)
{
    if (!Exists(name))
        return;
    if (TextOf(LiveCard(name, "none"), "bond").empty())
        Run("/sbin/ip link del " + name, "remove " + name);
    else
        SetBond(name, TAVO_NET_AGGR_NONE, {});
    ReplaceFile(InterfaceFileOf(name), "");
    ReplaceFile(net_folder + ("more-" + name), "");
}

// --- one interface ---

class CardSteps {
  public:
    CardSteps(const std::string &name, const NetFactsMap &wanted) : name_(name), wanted_(wanted) {}

    void Apply()
    {
        Begin();
        if (Wants("mtu"))
            Must(TAVONetSetMTUValue(name_.c_str(), std::stoi(wanted_.at("mtu").Text())) == 0,
                 "set the MTU of " + name_);
        if (Wants("ipv6"))
            Must(TAVONetIPv6Set(name_.c_str(), IsGiven(wanted_, "ipv6")) == 0, "switch IPv6 of " + name_);
        DropAddresses();
        if (Wants("mode") || Wants("address"))
            SetMode(TextOf(wanted_, "mode"), TextOf(wanted_, "address"));
        else if (wanted_.contains("vlan") && TextOf(Live(), "address").empty())
            SetStoredMode();
        AddAddresses();
        Routes();
        Gateway();
        if (Wants("wake_on_lan"))
            Must(TAVONetWolSet(name_.c_str(), IsGiven(wanted_, "wake_on_lan")) == 0, "switch wake-on-LAN of " + name_);
        Store();
    }

  private:
    // Without facts where the files do not have it.
    NetFactsMap Stored() const { return StoredNet().cards[name_]; }
    NetFactsMap Live() const { return LiveCard(name_, TextOf(wanted_.contains("mode") ? wanted_ : Stored(), "mode")); }

    // Returns whether the fact is in the document and the network does not have it.
    bool Wants(const char *fact) const
    {
        return wanted_.contains(fact) && Instead(fact, wanted_.at(fact), Stored(), Live());
    }

    void Begin() const
    {
        if (!NetSetting(InterfaceFileOf(name_), "DEVICE").empty() ||
            std::none_of(wanted_.begin(), wanted_.end(), [&](const auto &fact) { return Wants(fact.first.c_str()); }))
            return;
        MakeFile(name_);
        Run("/sbin/ifconfig " + name_ + " up", "start " + name_);
    }

    // A VLAN with another number is another interface: it gets the address that the old one had.
    void SetStoredMode() const
    {
        const NetFactsMap stored = Stored();
        if (const std::string mode = TextOf(stored, "mode"); !mode.empty() && mode != "none")
            SetMode(mode, TextOf(stored, "address"));
    }

    void SetMode(const std::string &mode, const std::string &address) const
    {
        if (mode == "none")
            return SetNone();
        TAVONETCARD before = {};
        TAVONETCARD card = {};
        Must(TAVONetGetCard(name_.c_str(), &before) == 0, "look at " + name_);
        Put(card.szInterface, name_);
        card.nMode = mode == "dhcp" ? TAVO_NET_DHCP : TAVO_NET_STATIC;
        if (mode == "static") {
            Put(card.szIp, PlainAddress(address));
            Put(card.szMask, MaskOf(address));
        }
        Must(TAVONetSetCard1(&card, before.szIp[0] ? &before : nullptr) == 0,
             "give " + name_ + " the address " + (mode == "dhcp" ? mode : address));
    }

    void SetNone() const
    {
        const std::string file = InterfaceFileOf(name_);
        const std::string client = "/etc/dhcpc/dhcpcd-" + name_ + ".pid";
        if (::access(client.c_str(), F_OK) == 0) {
            TLIBProcSignalByPidFile(client.c_str(), SIGKILL);
            ::unlink(client.c_str());
        }
        Run("/sbin/ifconfig " + name_ + " 0.0.0.0 up", "take the address of " + name_ + " away");
        MakeFile(name_);
        SetKey(file, "BOOTPROTO", "none");
        for (const char *key : {"IPADDR", "NETMASK", "BROADCAST", "NETWORK"})
            RemoveKey(file, key);
    }

    // Before the first address changes: the kernel takes away what is in its network.
    void DropAddresses() const
    {
        const NetFactsMap live = Live();
        if (wanted_.contains("more_addresses"))
            for (const std::string &one : Minus(TextsOf(live, "more_addresses"), TextsOf(wanted_, "more_addresses")))
                if (one != TextOf(wanted_, "address"))
                    Run("/sbin/ip addr del " + one + " dev " + name_, "take " + one + " from " + name_);
        const std::string first = TextOf(wanted_, "address");
        if (Contains(TextsOf(live, "more_addresses"), first))
            Run("/sbin/ip addr del " + first + " dev " + name_, "make " + first + " the first address of " + name_);
        if (wanted_.contains("ipv6_addresses"))
            for (const std::string &one : Minus(TextsOf(live, "ipv6_addresses"), TextsOf(wanted_, "ipv6_addresses")))
                Must(TAVONetIPv6AddrDel(name_.c_str(), PlainAddress(one).c_str(), LengthIn(one)) == 0,
                     "take " + one + " from " + name_);
    }

    void AddAddresses() const
    {
        // What another step has taken away comes back, also where the document does not speak of it.
        const Words more = wanted_.contains("more_addresses") ? TextsOf(wanted_, "more_addresses") : StoredMore(false);
        for (const std::string &one : Minus(more, TextsOf(Live(), "more_addresses")))
            Run("/sbin/ip addr add " + one + " dev " + name_, "give " + name_ + " the address " + one);
        if (wanted_.contains("ipv6_addresses"))
            for (const std::string &one : Minus(TextsOf(wanted_, "ipv6_addresses"), TextsOf(Live(), "ipv6_addresses")))
                Must(TAVONetIPv6AddrAdd(name_.c_str(), PlainAddress(one).c_str(), LengthIn(one)) == 0,
                     "give " + name_ + " the address " + one);
    }

    Words StoredMore(bool ipv6) const
    {
        Words more = ReadMoreFile(name_).addresses;
        std::erase_if(more, [&](const std::string &one) { return IsIpv6(one) != ipv6; });
        return more;
    }

    void ChangeRoute(const char *verb, const std::string &route) const
    {
        Run(std::string("/sbin/ip ") + (IsIpv6(route) ? "-6 " : "") + "route " + verb + " " + route + " dev " + name_,
            std::string(verb) + " the route " + route);
    }

    void Routes() const
    {
        const bool stated = wanted_.contains("routes");
        const Words wanted = stated ? TextsOf(wanted_, "routes") : ReadMoreFile(name_).routes;
        if (stated)
            for (const std::string &route : Minus(TextsOf(Live(), "routes"), wanted))
                ChangeRoute("del", route);
        for (const std::string &route : Minus(wanted, TextsOf(Live(), "routes")))
            ChangeRoute("add", route);
    }

    void Gateway() const
    {
        const std::string wanted =
            wanted_.contains("ipv6_gateway") ? TextOf(wanted_, "ipv6_gateway") : ReadMoreFile(name_).ipv6_gateway;
        const std::string live = TextOf(Live(), "ipv6_gateway");
        if (wanted == live)
            return;
        if (!live.empty() && wanted_.contains("ipv6_gateway"))
            Must(TAVONetIPv6RouteDel(name_.c_str(), "::", 0, live.c_str()) == 0, "remove the IPv6 gateway of " + name_);
        if (!wanted.empty())
            Must(TAVONetIPv6RouteAdd(name_.c_str(), "::", 0, wanted.c_str()) == 0,
                 "make " + wanted + " the IPv6 gateway of " + name_);
    }

    // The library stores one IPv6 address itself.
    void Store() const
    {
        const MoreFile old = ReadMoreFile(name_);
        MoreFile more = old;
        Words ipv6 = StoredMore(true);
        if (wanted_.contains("ipv6_addresses")) {
            const std::string file = InterfaceFileOf(name_);
            ipv6 = TextsOf(wanted_, "ipv6_addresses");
            if (!ipv6.empty()) {
                SetKey(file, "IPV6ADDR", PlainAddress(ipv6.front()));
                SetKey(file, "IPV6PREFIXLENG", std::to_string(LengthIn(ipv6.front())));
                ipv6.erase(ipv6.begin());
            } else {
                RemoveKey(file, "IPV6ADDR");
                RemoveKey(file, "IPV6PREFIXLENG");
            }
        }
        more.addresses = wanted_.contains("more_addresses") ? TextsOf(wanted_, "more_addresses") : StoredMore(false);
        more.addresses.insert(more.addresses.end(), ipv6.begin(), ipv6.end());
        if (wanted_.contains("routes"))
            more.routes = TextsOf(wanted_, "routes");
        if (wanted_.contains("ipv6_gateway"))
            more.ipv6_gateway = TextOf(wanted_, "ipv6_gateway");
        if (!(more == old))
            ReplaceFile(net_folder + ("more-" + name_), more.Text());
    }

    const std::string &name_;
    const NetFactsMap &wanted_;
};

// --- the appliance as a whole ---

void SetGateway(const NetFactsMap &wanted)
{
    const std::string gateway = TextOf(wanted, "gateway");
    const bool live_counts = LiveNet(StoredNet()).net.contains("gateway");
    if (gateway.empty()) {
        RemoveKey(network_file, "GATEWAY");
        if (live_counts)
            TLIBSystem("/sbin/route delete default > /dev/null 2>&1");
    } else if (live_counts) {
        Must(TAVONetDefaultGatewaySet(gateway.c_str()) == 0, "make " + gateway + " the gateway");
    } else {
        SetKey(network_file, "GATEWAY", gateway);
    }
}

// The library replaces the whole file when it sets the servers.
void KeepSearch(const Words &search)
{
    std::string text = search.empty() ? "" : "search " + Joined(search, " ") + "\n";
    for (const std::string &line : Split(FileText(resolver_file), '\n'))
        if (!line.starts_with("search") && !line.starts_with("domain"))
            text += line + "\n";
    if (text != FileText(resolver_file))
        ReplaceFile(resolver_file, text.empty() ? "\n" : text);
}

void ApplyWhole(const NetFactsMap &wanted)
{
    const NetDocument stored = StoredNet();
    const NetFactsMap live = LiveNet(stored).net;
    const auto wants = [&](const char *fact) {
        return wanted.contains(fact) && Instead(fact, wanted.at(fact), stored.net, live);
    };
    if (wants("hostname"))
        Must(TAVOLnxSetHostname(TextOf(wanted, "hostname").c_str()) == 0, "set the host name");
    if (wants("gateway"))
        SetGateway(wanted);
    if (wants("dns"))
        Must(TAVONetDNSSet(StringList(TextsOf(wanted, "dns")).Get()) == 0, "set the name servers");
    if (wants("search")) {
        const Words search = TextsOf(wanted, "search");
        ReplaceFile(search_file, search.empty() ? "" : Joined(search, " ") + "\n");
    }
    if (wants("search") || wants("dns"))
        KeepSearch(TextsOf(StoredNet().net, "search"));
}

// Parents before what they carry.
void ForEachCard(const NetDocument &wanted, const std::function<void(const std::string &, const NetFactsMap &)> &step)
{
    for (const bool vlans : {false, true})
        for (const auto &[name, card] : wanted.cards)
            if (card.contains("vlan") == vlans)
                step(name, card);
}

}  // namespace

void ApplyNet(const NetDocument &wanted)
{
    for (const std::string &name : wanted.absent)
        RemoveInterface(name);
    for (const auto &[name, card] : wanted.cards)
        if (card.contains("bond")) {
            const std::string mode = TextOf(card, "bond");
            SetBond(name,
                    mode == "lacp"       ? TAVO_NET_AGGR_LACP
                    : mode == "adaptive" ? TAVO_NET_AGGR_ADAPTIVE
                                         : TAVO_NET_AGGR_BACKUP,
                    TextsOf(card, "members"));
        }
    ForEachCard(wanted, [](const std::string &name, const NetFactsMap &card) {
        if (card.contains("vlan"))
            SetVlan(name, TextOf(card, "parent"), std::stoi(card.at("vlan").Text()));
        CardSteps(name, card).Apply();
    });
    ApplyWhole(wanted.net);
    // A router is reached through addresses that were set after it, and a change of the gateway may take a route away.
    ForEachCard(wanted, [](const std::string &name, const NetFactsMap &card) { CardSteps(name, card).Apply(); });
}

}  // namespace tavoctl
