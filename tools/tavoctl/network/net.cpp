// tavoctl net: what the network is, and single settings of it.
#include "families.h"
#include "frame/containers.h"
#include "frame/failure.h"
#include "frame/table.h"
#include "network/net_verbs.h"

#include "tavo_net.h"

#include <algorithm>
#include <charconv>
#include <filesystem>

namespace tavoctl {

std::vector<std::string> InterfaceNames()
{
    std::vector<std::string> names;
    std::error_code ignored;
    for (const auto &entry : std::filesystem::directory_iterator("/sys/class/net", ignored)) {
        const std::string name = entry.path().filename();
        if (name != "lo" && name != "bonding_masters")
            names.push_back(name);
    }
    std::sort(names.begin(), names.end());
    return names;
}

namespace {

std::vector<std::string> Ipv6Addresses(const char *interface)
{
    StringList list;
    return TAVONetIPv6AddrEnum(interface, list.Address()) < 0 ? std::vector<std::string>() : list.Items();
}

class NetShow : public Verb {
  public:
    static constexpr VerbInfo info = {
        "show", reads,
        "Shows the first wired interface, the gateway as it is stored and as it is used, the name servers and the host "
        "name.",
        "tavoctl net show\n"
        "tavoctl net show --json"};

    int Run(const Call &call) override
    {
        const TAVONETCARD card = FirstCard("show the network");
        char name[64] = "";
        char gateway[20] = "";
        const bool named = TAVOLnxGetHostname(name, sizeof name) == 0;
        const bool routed = TAVONetDefaultGatewayGet(gateway, sizeof gateway) == 0;
        StringList servers;
        TAVONetDNSGet(servers.Address());
        const int wakes = TAVONetWolGet(card.szInterface);

        Record record;
        record.Add("hostname", named ? Cell(name) : Cell());
        record.Add("interface", card.szInterface);
        record.Add("mode", card.nMode == TAVO_NET_DHCP ? "dhcp" : "static");
        record.Add("address", Known(card.szIp));
        record.Add("mask", Known(card.szMask));
        record.Add("network", Known(card.szNetwork));
        record.Add("broadcast", Known(card.szBroadcast));
        record.Add("gateway", Known(card.szGateway));
        record.Add("live_gateway", routed ? Cell(gateway) : Cell());
        record.Add("dns", servers.Items());
        record.Add("mac", Known(card.szMac));
        record.Add("mtu", card.nMtu);
        record.Add("link", card.fLink != 0);
        record.Add("ipv6", BlTAVONetIPv6IsEnabled(card.szInterface) == 1);
        record.Add("ipv6_addresses", Ipv6Addresses(card.szInterface));
        record.Add("wake_on_lan", wakes < 0 ? Cell() : Cell(wakes == 1));
        call.Print(record);
        return exit_done;
    }
};

class NetGateway : public Verb {
  public:
    static constexpr VerbInfo info = {"gateway", changes,
                                      "Makes ADDRESS the default gateway and stores it. When it cannot be reached from "
                                      "any interface the old one stays.",
                                      "tavoctl net gateway 192.0.2.1"};

    void Declare(Arguments &arguments) override { arguments.Text("ADDRESS", address_, "of the router"); }

    int Run(const Call &) override
    {
        if (TAVONetDefaultGatewaySet(address_.c_str()) != 0)
            throw LibraryFailure("make " + address_ + " the gateway", "is it on the network of an interface?");
        return exit_done;
    }

  private:
    std::string address_;
};

class NetDns : public Verb {
  public:
    static constexpr VerbInfo info = {"dns", changes,
                                      "Replaces the name servers, in the order in which they are asked.",
                                      "tavoctl net dns 192.0.2.53 2001:db8::53\n"
                                      "tavoctl net dns --none"};

    void Declare(Arguments &arguments) override
    {
        arguments.Flag("--none", none_, "no name server at all");
        arguments.Texts("ADDRESS", addresses_, "of a name server", 0);
    }

    int Run(const Call &) override
    {
        if (none_ != addresses_.empty())
            throw UsageFailure("set the name servers", none_ ? "there are some, and --none" : "none was named",
                               "name them in the order in which they are asked, or say --none");
        const StringList servers(addresses_);
        if (TAVONetDNSSet(servers.Get()) != 0)
            throw LibraryFailure("set the name servers", "a name server is an IPv4 or IPv6 address");
        return exit_done;
    }

  private:
    bool none_ = false;
    std::vector<std::string> addresses_;
};

class NetHostname : public Verb {
  public:
    static constexpr VerbInfo info = {"hostname", changes,
                                      "Gives the appliance another name: in the kernel, in the stored settings and in "
                                      "/etc/hosts. 1 to 15 letters, digits, \"-\" and \"_\".",
                                      "tavoctl net hostname attic"};

    void Declare(Arguments &arguments) override { arguments.Text("NAME", name_, "the new host name"); }

    int Run(const Call &) override
    {
        if (TAVOLnxSetHostname(name_.c_str()) != 0)
            throw LibraryFailure("name this appliance " + name_);
        return exit_done;
    }

  private:
    std::string name_;
};

class NetMtu : public Verb {
  public:
    static constexpr VerbInfo info = {"mtu", changes, "Sets and stores the MTU of an interface.",
                                      "tavoctl net mtu eth0 9000"};

    void Declare(Arguments &arguments) override
    {
        arguments.Text("INTERFACE", interface_, "such as eth0", InterfaceNames);
        arguments.Text("BYTES", bytes_, "68 to 65535");
    }

    int Run(const Call &) override
    {
        int mtu = 0;
        const char *const end = bytes_.data() + bytes_.size();
        if (const auto [stop, error] = std::from_chars(bytes_.data(), end, mtu); error != std::errc() || stop != end)
            throw UsageFailure("set the MTU " + bytes_, "that is no number");
        if (TAVONetSetMTUValue(interface_.c_str(), mtu) != 0)
            throw LibraryFailure("set the MTU of " + interface_ + " to " + bytes_,
                                 TLIBErrGet() == ERR_OP_FAILURE ? "the card does not take it" : "");
        return exit_done;
    }

  private:
    std::string interface_;
    std::string bytes_;
};

class NetRefresh : public Verb {
  public:
    static constexpr VerbInfo info = {
        "refresh", changes,
        "Puts back what a program that died in the middle of a change has left, and brings "
        "the appliance's name in /etc/hosts up to date. Never waits: it leaves both to a "
        "program that is changing the network just now. The start of the network and the "
        "DHCP client's hook run it.",
        "tavoctl net refresh"};

    int Run(const Call &) override
    {
        if (TAVONetHostsRefresh() < 0)
            throw LibraryFailure("refresh the network");
        return exit_done;
    }
};

class NetCheckAddress : public Verb {
  public:
    static constexpr VerbInfo info = {
        "check-address", reads,
        "Tells whether another host uses ADDRESS already: \"free\", or \"used\" with exit status 4. Only a host that "
        "answers a ping is noticed; the appliance's own address is free.",
        "tavoctl net check-address 192.0.2.20\n"
        "tavoctl net check-address --interface eth1 192.0.2.20"};

    void Declare(Arguments &arguments) override
    {
        arguments.Option("--interface", "NAME", interface_, "that would have the address (the first one)",
                         InterfaceNames);
        arguments.Text("ADDRESS", address_, "an IPv4 address");
    }

    int Run(const Call &call) override
    {
        const std::string attempted = "check " + address_;
        if (interface_.empty())
            interface_ = FirstCard(attempted).szInterface;
        const int used = TAVOIIpConflict(interface_.c_str(), address_.c_str());
        if (used < 0)
            throw LibraryFailure(attempted);
        Record record;
        record.Add("address", address_);
        record.Add("interface", interface_);
        record.Add("used", used == 1);
        call.PrintValue(used ? "used" : "free", record);
        return used ? exit_busy : exit_done;
    }

  private:
    std::string interface_;
    std::string address_;
};

}  // namespace

void AddNet(Program &program)
{
    Family &net = program.Add("net", "Interfaces, addresses, names and bonds");
    net.Add<NetShow>();
    AddNetSet(net);
    net.Add<NetGateway>();
    net.Add<NetDns>();
    net.Add<NetHostname>();
    net.Add<NetMtu>();
    net.Add<NetCheckAddress>();
    net.Add<NetRefresh>();
    AddNetCards(net);
}

}  // namespace tavoctl
