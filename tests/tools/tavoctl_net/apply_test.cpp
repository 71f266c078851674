// tavoctl net apply and export: a document becomes the network, once; all of it or nothing.
#include "tavo_net.h"

#include "net_scene.h"
#include "support/rounds.h"
#include "support/test.h"

#include <random>
#include <span>

using nlohmann::json;
using test::Ran;
using test::ReadFile;
using test::Tavoctl;
using test::WriteFile;

namespace {

constexpr const char *kFile = "/tmp/net.json";

// All of the files, and what the kernel has.
std::string Network()
{
    return test::Output(
        "cd /etc && for f in hosts resolv.conf tavoinfo.conf sysconfig/network sysconfig/network-scripts/*; do "
        "echo == $f; cat $f; done; hostname; ip -4 route | sort; ip -6 route | grep -v '^fe80\\|^ff\\|^multicast' | "
        "sort; "
        "for n in /sys/class/net/*; do echo ${n##*/} $(cat $n/mtu); ip addr show dev ${n##*/} | grep inet | "
        "grep -v fe80 | sed 's/ tentative//; s/ secondary//' | sort; done; cat /proc/net/vlan/config");
}

// The last process number that was given out here.
long LastPid()
{
    return std::stol(ReadFile("/proc/sys/kernel/ns_last_pid"));
}

Ran Apply(const json &document, test::Words options = {"--no-probe"})
{
    WriteFile(kFile, document.dump());
    test::Words words = {"net", "apply", "--json"};
    words.insert(words.end(), options.begin(), options.end());
    words.emplace_back(kFile);
    return Tavoctl(words);
}

json Document(const char *text)
{
    json document = json::parse(text);
    document["format_version"] = 1;
    return document;
}

class NetApply : public test::NetScene {
  protected:
    void SetUp() override
    {
        NetScene::SetUp();
        if (IsSkipped())
            return;
        cable_->Plug(*here_, "eth1");
        here_->Do([] {
            std::filesystem::remove(test::kScripts + std::string("ifcfg-eth1"));
            WriteFile("/etc/resolv.conf", "nameserver 192.0.2.53\n");
            EXPECT_EQ(test::ShellStatus("/etc/rc.network start"), 0);
            EXPECT_EQ(TAVONetHostsRefresh(), 0);
        });
        has_vlans_ =
            here_->Shell("ip link add link eth0 name probe0 type vlan id 9 2>/dev/null && ip link del probe0") == 0;
        has_ipv6_ = here_->Shell("[ -e /proc/net/if_inet6 ]") == 0;
    }

    bool CanDo(const std::string &document) const
    {
        return (has_vlans_ || document.find("vlan") == std::string::npos) &&
               (has_ipv6_ || document.find("2001:") == std::string::npos);
    }

    // One after the other, each twice. False after the first failure.
    bool ApplyEachTwice(std::span<const char *const> documents) const
    {
        int number = 0;
        for (const char *text : documents) {
            ++number;
            if (!CanDo(text))
                continue;
            const json document = Document(text);
            const std::string before = Network();
            const Ran planned = Apply(document, {"--dry-run"});
            EXPECT_EQ(planned.status, 0) << text << planned;
            EXPECT_EQ(Network(), before) << text;
            const Ran first = Apply(document);
            EXPECT_EQ(first.status, 0) << text << first;
            EXPECT_EQ(json::parse(first.out).at("changes"), json::parse(planned.out).at("changes")) << text;
            EXPECT_EQ(json::parse(first.out).at("changed"), number != 1) << text;
            const std::string after = Network();
            EXPECT_EQ(after == before, number == 1) << text << before;

            const long processes = LastPid();
            const Ran second = Apply(document);
            EXPECT_EQ(LastPid() - processes, 1) << text << ": programs ran";
            EXPECT_EQ(second.status, 0) << text << second;
            EXPECT_EQ(json::parse(second.out).at("changed"), false) << text << second;
            EXPECT_EQ(Network(), after) << text;
            EXPECT_FALSE(std::filesystem::exists("/etc/network.checkpoint"));

            // What is there now, as a document: it changes nothing either.
            const Ran exported = Tavoctl({"net", "export"});
            EXPECT_EQ(exported.status, 0) << exported;
            const Ran again = Apply(json::parse(exported.out));
            EXPECT_EQ(again.status, 0) << text << again << exported;
            EXPECT_EQ(json::parse(again.out).at("changed"), false) << text << again << exported;

            // The start script keeps all of it.
            if (!test::TakesLong() || text == documents.back()) {
                EXPECT_EQ(test::ShellStatus("/etc/rc.network stop && /etc/rc.network start"), 0);
                EXPECT_TRUE(test::Eventually([&] { return Network() == after; })) << text << Network() << "\nbefore:\n"
                                                                                  << after;
            }
            if (HasFailure())
                return false;
        }
        return true;
    }

    bool has_vlans_ = false;
    bool has_ipv6_ = false;
};

// Each builds on what the ones before it made.
const char *const kDocuments[] = {
    R"({})",
    R"({"hostname": "attic"})",
    R"({"hostname": "cellar", "dns": ["192.0.2.54"]})",
    R"({"dns": ["2001:db8::53", "192.0.2.53"], "search": ["example.com", "lab.example.com"]})",
    R"({"dns": []})",
    R"({"search": []})",
    R"({"dns": ["192.0.2.53"], "search": ["example.net"]})",
    R"({"cards": [{"name": "eth0", "address": "192.0.2.20/25"}]})",
    R"({"cards": [{"name": "eth0", "mode": "static", "address": "192.0.2.10/24"}], "gateway": "192.0.2.2"})",
    R"({"gateway": null})",
    R"({"gateway": "192.0.2.1"})",
    R"({"cards": [{"name": "eth1", "more_addresses": ["203.0.113.6/24"]}]})",
    R"({"cards": [{"name": "eth1", "address": "198.51.100.5/24"}]})",
    R"({"cards": [{"name": "eth1", "more_addresses": ["203.0.113.6/24", "198.51.100.6/24"]}]})",
    R"({"cards": [{"name": "eth1", "more_addresses": ["203.0.113.6/24"], "mtu": 1400}]})",
    R"({"cards": [{"name": "eth1", "routes": ["233.252.0.0/24 via 198.51.100.1", "233.252.1.0/24"]}]})",
    R"({"cards": [{"name": "eth1", "address": "198.51.100.9/24"}]})",
    R"({"cards": [{"name": "eth1", "address": "203.0.113.6/24", "more_addresses": ["198.51.100.9/24"]}]})",
    R"({"cards": [{"name": "eth1", "routes": []}]})",
    R"({"cards": [{"name": "eth0", "ipv6": true, "ipv6_addresses": ["2001:db8::20/64", "2001:db8:0::10/64"]}]})",
    R"({"cards": [{"name": "eth0", "ipv6_gateway": "2001:db8::1", "routes": ["2001:db8:9::/48 via 2001:db8::2"]}]})",
    R"({"cards": [{"name": "eth0", "ipv6_addresses": ["2001:db8::20/64"]}]})",
    R"({"cards": [{"name": "eth0", "ipv6_gateway": null, "routes": []}]})",
    R"({"cards": [{"name": "eth0", "ipv6_addresses": []}]})",
    R"({"cards": [{"name": "eth1", "mode": "none", "more_addresses": [], "mtu": 1500}]})",
    R"({"cards": [{"name": "eth0", "mode": "static", "address": "192.0.2.30/24", "ipv6": false}]})",
    R"({"hostname": "here", "gateway": "192.0.2.3", "dns": ["192.0.2.55"], "search": ["example.org"], "cards": [
        {"name": "eth0", "address": "192.0.2.10/26", "more_addresses": ["203.0.113.1/29"],
         "routes": ["233.252.0.0/24 via 192.0.2.4"], "mtu": 1450},
        {"name": "eth1", "address": "198.51.100.5/24"}]})",
};

const char *const kVlanDocuments[] = {
    R"({})",
    R"({"cards": [{"name": "eth0.7", "parent": "eth0", "vlan": 7, "address": "198.51.101.7/24"}]})",
    R"({"cards": [{"name": "eth0.7", "parent": "eth0", "vlan": 8, "more_addresses": ["198.51.101.8/24"], "mtu": 1400}]})",
    R"({"cards": [{"name": "vlan9", "parent": "eth1", "vlan": 9, "mode": "none"}, {"name": "eth0.7", "absent": true}]})",
    R"({"cards": [{"name": "vlan9", "absent": true}]})",
};

const char *const kBondDocuments[] = {
    R"({})",
    R"({"cards": [{"name": "bond0", "bond": "backup", "members": ["eth0", "eth1"], "address": "192.0.2.10/26"}]})",
    R"({"cards": [{"name": "bond0", "more_addresses": ["203.0.113.1/29"], "routes": ["233.252.0.0/24 via 192.0.2.4"]}]})",
    R"({"cards": [{"name": "bond0", "bond": "adaptive", "members": ["eth1", "eth0"]}]})",
    R"({"cards": [{"name": "bond0", "absent": true}]})",
};

const char *const kLeaseDocuments[] = {
    R"({})",
    R"({"cards": [{"name": "eth0", "mode": "dhcp"}]})",
    R"({"gateway": "192.0.2.7", "cards": [{"name": "eth0", "more_addresses": ["203.0.113.1/29"], "mtu": 1400}]})",
    R"({"hostname": "attic", "cards": [{"name": "eth1", "mode": "dhcp", "routes": ["233.252.0.0/24 via 198.51.100.1"]}]})",
    R"({"cards": [{"name": "vlan7", "parent": "eth1", "vlan": 7, "mode": "dhcp"}]})",
    R"({"cards": [{"name": "vlan7", "absent": true}]})",
    R"({"cards": [{"name": "eth1", "mode": "none", "routes": []}, {"name": "eth0", "ipv6_addresses": ["2001:db8::20/64"]}]})",
    R"({"gateway": "192.0.2.1", "cards": [{"name": "eth0", "mode": "static", "address": "192.0.2.10/24"}]})",
    R"({"cards": [{"name": "eth0", "mode": "dhcp", "more_addresses": []}]})",
};

// Gets a lease at once and is never seen again.
constexpr const char *kClient = R"(#!/bin/sh
case $2 in
eth0) address=192.0.2.40 router=192.0.2.98 ;;
eth1) address=198.51.100.40 router= ;;
*) address=198.51.101.40 router= ;;
esac
busybox ifconfig "$2" $address netmask 255.255.255.0
[ ! "$router" ] || busybox route add default gw $router
printf 'IPADDR=%s\nNETMASK=255.255.255.0\nGATEWAY=%s\n' $address "$router" >/etc/dhcpc/dhcpcd-"$2".info
)";

TEST_F(NetApply, ADocumentAppliedTwiceChangesNothingTheSecondTime)
{
    const std::span documents(kDocuments);
    EXPECT_TRUE(here_->Run([&] { return ApplyEachTwice(test::TakesLong() ? documents.first(9) : documents); }));
}

TEST_F(NetApply, AVlanAppliedTwiceChangesNothingTheSecondTime)
{
    if (!has_vlans_)
        GTEST_SKIP() << "this kernel has no VLANs";
    EXPECT_TRUE(here_->Run([&] { return ApplyEachTwice(kVlanDocuments); }));
}

TEST_F(NetApply, ABondAppliedTwiceChangesNothingTheSecondTime)
{
    // The start script makes them by /sys.
    if (here_->Shell("mount -o remount,rw /sys && [ -w /sys/class/net/bonding_masters ]") != 0)
        GTEST_SKIP() << "this kernel has no bonds";
    EXPECT_TRUE(here_->Run([&] { return ApplyEachTwice(kBondDocuments); }));
}

TEST_F(NetApply, ALeaseAppliedTwiceChangesNothingTheSecondTime)
{
    const test::ScriptedClient client(kClient);
    EXPECT_TRUE(here_->Run([&] {
        std::filesystem::create_directories("/etc/dhcpc");
        return ApplyEachTwice(kLeaseDocuments);
    }));
}

// The panel of this model wakes it. It knows no word for the way back: then the document is not applied at all.
TEST_F(NetApply, AWakingCardAppliedTwiceIsSetOnce)
{
    here_->Do([&] {
        WriteFile("/etc/tavoinfo.conf", "support_wol=\"yes\"\nwol_enabled_options=\"g\"\n");
        WriteFile("/etc.defaults/tavoinfo.conf", ReadFile("/etc.defaults/tavoinfo.conf") + "wol_by_panel=\"yes\"\n");
        WriteFile("/dev/ttyS1", "");
        const char *const documents[] = {R"({})", R"({"cards": [{"name": "eth0", "wake_on_lan": true}]})"};
        EXPECT_TRUE(ApplyEachTwice(documents));
        EXPECT_EQ(ReadFile("/dev/ttyS1"), "l\n");
        const std::string before = Network();
        const Ran ran = Apply(Document(R"({"hostname": "attic", "cards": [{"name": "eth0", "wake_on_lan": false}]})"));
        EXPECT_EQ(ran.status, 1) << ran;
        EXPECT_EQ(Network(), before);
    });
}

TEST_F(NetApply, AnExportedNetworkComesBackFromNothing)
{
    here_->Do([&] {
        json document = Document(
            R"({"hostname": "attic", "gateway": "192.0.2.1", "dns": ["192.0.2.53"], "search": ["example.com"], "cards": [
                {"name": "eth0", "address": "192.0.2.10/24", "more_addresses": ["203.0.113.1/29"],
                 "routes": ["233.252.0.0/24 via 192.0.2.4"], "mtu": 1450},
                {"name": "eth1", "mode": "none"}]})");
        if (has_ipv6_)
            document["cards"][0]["ipv6_addresses"] = {"2001:db8::10/64", "2001:db8::11/64"};
        if (has_vlans_)
            document["cards"].push_back(
                {{"name", "eth1.5"}, {"parent", "eth1"}, {"vlan", 5}, {"address", "198.51.100.5/24"}});
        EXPECT_EQ(Apply(document).status, 0);
        const json exported = json::parse(Tavoctl({"net", "export"}).out);
        // From the host's name on: the files are written in another way then.
        const auto kernel = [] {
            const std::string all = Network();
            return all.substr(all.rfind("attic\n"));
        };
        const std::string before = kernel();
        EXPECT_EQ(test::ShellStatus("/etc/rc.network stop; rm -f /etc/sysconfig/network-scripts/*; hostname here; "
                                    "echo HOSTNAME=here >/etc/sysconfig/network; : >/etc/resolv.conf; "
                                    ": >/etc/tavoinfo.conf; ifconfig eth0 mtu 1500; /etc/rc.network start"),
                  0);
        const Ran ran = Apply(exported);
        EXPECT_EQ(ran.status, 0) << ran << exported;
        EXPECT_EQ(json::parse(Tavoctl({"net", "export"}).out), exported);
        EXPECT_EQ(kernel(), before);
    });
}

TEST_F(NetApply, HostileDocumentsAreRefusedWithThePlace)
{
    struct Row {
        const char *text, *says;
    };
    const Row rows[] = {
        {"", "not JSON"},
        {"{", "not JSON"},
        {"[]", "not an object"},
        {"{}", "format_version"},
        {R"({"format_version": 2})", "format_version"},
        {R"({"format_version": 1} x)", "not JSON"},
        {R"({"format_version": 1, "format_version": 1})", "duplicate field format_version"},
    };
    // After the version.
    const Row parts[] = {
        {R"("routers": [])", "routers: there is no such field"},
        {R"("hostname": "a b")", "hostname: \"a b\" is not valid; allowed: 1 to 15 letters"},
        {R"("hostname": null)", "hostname: cannot be null"},
        {R"("hostname": "a\u0000b")", "hostname: "},
        {R"("gateway": "192.0.2.999")", "gateway: "},
        {R"("gateway": "010.0.0.1")", "gateway: "},
        {R"("gateway": "203.0.113.1")", "gateway: 203.0.113.1 is on the network of no card"},
        {R"("gateway": 17)", "gateway: not a text"},
        {R"("dns": "192.0.2.1")", "dns: not a list"},
        {R"("dns": ["192.0.2.1", "`reboot`"])", "dns[1]: "},
        {R"("dns": ["192.0.2.1", "192.0.2.1"])", "dns[1]: duplicate"},
        {R"("search": ["a\nnameserver 192.0.2.66"])", "search[0]: "},
        {R"("cards": {})", "cards: not a list"},
        {R"("cards": [1])", "cards[0]: not an object"},
        {R"("cards": [{}])", "cards[0]: has no name"},
        {R"("cards": [{"name": "../../shadow"}])", "cards[0].name"},
        {R"("cards": [{"name": "eth0;reboot"}])", "cards[0].name"},
        {R"("cards": [{"name": "lo"}])", "cards[0].name"},
        {R"("cards": [{"name": "eth0"}, {"name": "eth0"}])", "cards[1].name: duplicate"},
        {R"("cards": [{"name": "eth9", "mtu": 1500}])", "eth9: there is no such interface"},
        {R"("cards": [{"name": "eth0", "speed": 1}])", "cards[0].speed: there is no such field"},
        {R"("cards": [{"name": "eth0", "mtu": 67}])", "cards[0].mtu: not a number from 68"},
        {R"("cards": [{"name": "eth0", "mtu": 1e99}])", "cards[0].mtu"},
        {R"("cards": [{"name": "eth0", "mtu": 18446744073709551615}])", "cards[0].mtu"},
        {R"("cards": [{"name": "eth0", "mtu": "1500"}])", "cards[0].mtu"},
        {R"("cards": [{"name": "eth0", "mode": "auto"}])", "cards[0].mode"},
        {R"("cards": [{"name": "eth0", "mode": "static"}])", "cards[0]: a static card has an address"},
        {R"("cards": [{"name": "eth0", "mode": "dhcp", "address": "192.0.2.1/24"}])", "cards[0].address"},
        {R"("cards": [{"name": "eth0", "address": null}])", "cards[0].address"},
        {R"("cards": [{"name": "eth0", "address": "192.0.2.1"}])", "cards[0].address"},
        {R"("cards": [{"name": "eth0", "address": "192.0.2.0/24"}])", "cards[0].address"},
        {R"("cards": [{"name": "eth0", "address": "192.0.2.255/24"}])", "cards[0].address"},
        {R"("cards": [{"name": "eth0", "address": "127.0.0.1/8"}])", "cards[0].address"},
        {R"("cards": [{"name": "eth0", "address": "192.0.2.1/033"}])", "cards[0].address"},
        {R"("cards": [{"name": "eth0", "address": "192.0.2.7/24"}, {"name": "eth1", "address": "192.0.2.7/24"}])",
         "192.0.2.7 is also that of eth0"},
        {R"("cards": [{"name": "eth0", "ipv6_addresses": ["ff02::1/64"]}])", "cards[0].ipv6_addresses[0]"},
        {R"("cards": [{"name": "eth0", "ipv6_addresses": ["2001:db8::1/64", "2001:db8:0::1/64"]}])",
         "cards[0].ipv6_addresses[1]: duplicate"},
        {R"("cards": [{"name": "eth0", "ipv6": false, "ipv6_gateway": "2001:db8::1"}])", "cards[0].ipv6"},
        {R"("cards": [{"name": "eth0", "routes": ["192.0.2.1/24 via 192.0.2.2"]}])", "cards[0].routes[0]"},
        {R"("cards": [{"name": "eth0", "routes": ["233.252.0.0/24 via 2001:db8::1"]}])", "cards[0].routes[0]"},
        {R"("cards": [{"name": "eth0", "routes": ["233.252.0.0/24; reboot"]}])", "cards[0].routes[0]"},
        {R"("cards": [{"name": "eth0", "routes": ["0.0.0.0/0 via 192.0.2.2"]}])", "cards[0].routes[0]"},
        {R"("cards": [{"name": "eth0", "absent": true}])", "eth0: only a bond or a VLAN"},
        {R"("cards": [{"name": "eth0", "absent": false}])", "cards[0].absent"},
        {R"("cards": [{"name": "eth0", "vlan": 7}])", "cards[0]: a VLAN has both"},
        {R"("cards": [{"name": "eth0", "vlan": 7, "parent": "eth1"}])", "cannot become a VLAN"},
        {R"("cards": [{"name": "v", "vlan": 4095, "parent": "eth1"}])", "cards[0].vlan"},
        {R"("cards": [{"name": "v", "vlan": 5, "parent": "v"}])", "v cannot carry a VLAN"},
        {R"("cards": [{"name": "v", "vlan": 5, "parent": "eth8"}])", "there is no interface eth8"},
        {R"("cards": [{"name": "v", "vlan": 5, "parent": "eth0"}, {"name": "w", "vlan": 5, "parent": "eth0"}])",
         "eth0 VLAN 5 is also that of v"},
        {R"("cards": [{"name": "bond0", "bond": "backup", "members": []}])", "cards[0].members"},
        {R"("cards": [{"name": "bond0", "bond": "fast", "members": ["eth0"]}])", "cards[0].bond"},
        {R"("cards": [{"name": "bond0", "bond": "backup", "members": ["eth9"]}])", "eth9 is not an Ethernet card"},
        {R"("cards": [{"name": "b", "bond": "backup", "members": ["eth1"]}, {"name": "c", "bond": "backup", "members": ["eth1"]}])",
         "eth1 is also that of b"},
        {R"("cards": [{"name": "b", "bond": "backup", "members": ["eth1"]}, {"name": "eth1", "address": "192.0.2.9/24"}])",
         "eth1 cannot be a member"},
    };
    here_->Do([&] {
        const std::string before = Network();
        const auto refuses = [&](const std::string &text, const char *says) {
            test::IsRefused({"net", "apply", "-"}, says, 2, text);
        };
        for (const auto &[text, says] : rows)
            refuses(text, says);
        for (const auto &[text, says] : parts)
            refuses(std::string(R"({"format_version": 1, )") + text + "}", says);
        refuses(std::string(50000, '['), "nested too deeply");
        json many = Document("{}");
        for (int i = 0; i < 257; ++i)
            many["cards"].push_back({{"name", "a" + std::to_string(i)}});
        refuses(many.dump(), "cards: not a list of at most 256");
        many.erase("cards");
        for (int i = 0; i < 257; ++i)
            many["search"].push_back("a" + std::to_string(i) + ".example");
        refuses(many.dump(), "search: more than 256");
        EXPECT_EQ(Network(), before);
    });
}

// The last step fails: a route through a router that no card reaches.
TEST_F(NetApply, AFailedChangeLeavesEverythingUnchanged)
{
    here_->Do([&] {
        const json failing = Document(
            R"({"hostname": "attic", "dns": ["192.0.2.54"], "search": ["example.com"], "cards": [
                {"name": "eth0", "address": "192.0.2.77/24", "more_addresses": ["203.0.113.1/29"], "mtu": 1400},
                {"name": "eth1", "address": "198.51.100.5/24", "routes": ["233.252.0.0/24 via 198.18.0.1"]}]})");
        const std::string before = Network();
        const Ran ran = Apply(failing);
        EXPECT_EQ(ran.status, 1) << ran;
        EXPECT_THAT(ran.err, testing::HasSubstr("233.252.0.0/24"));
        EXPECT_THAT(ran.err, testing::HasSubstr("the old settings are back"));
        EXPECT_EQ(Network(), before);

        json good = failing;
        good["cards"][1].erase("routes");
        test::RunningTavoctl trial({"net", "apply", "--no-probe", "--try", "2", kFile});
        EXPECT_EQ(trial.Wait().status, 1) << "the failing one";
        WriteFile(kFile, good.dump());
        test::IsRefused({"net", "apply", "--no-probe", "--try", "2", kFile}, "the old ones are back", 1);
        EXPECT_EQ(Network(), before);

        // A start script that keeps nothing: only what every one keeps is done.
        const std::string script = ReadFile("/etc/rc.network");
        WriteFile("/etc/rc.network", "#!/bin/sh\nexit 2\n", 0755);
        const Ran unkept = Apply(good);
        EXPECT_EQ(unkept.status, 1) << unkept;
        EXPECT_THAT(unkept.err, testing::HasSubstr("/etc/rc.network would not keep it"));
        EXPECT_EQ(Network(), before);
        EXPECT_EQ(Apply(Document(R"({"hostname": "attic", "gateway": "192.0.2.9"})")).status, 0);
        WriteFile("/etc/rc.network", script, 0755);
    });
    ASSERT_TRUE(here_);
    test::Node there("there");
    cable_->Plug(there, "eth0");
    ASSERT_EQ(there.Shell("ifconfig eth0 192.0.2.99 netmask 255.255.255.0 up"), 0);
    here_->Do([] {
        for (const char *card : {R"("address": "192.0.2.99/24")", R"("more_addresses": ["192.0.2.99/24"])"}) {
            const Ran used =
                Apply(Document((std::string(R"({"cards": [{"name": "eth0", )") + card + "}]}").c_str()), {});
            EXPECT_EQ(used.status, 4) << used;
        }
    });
}

// At any moment: before the change, in the middle of it, after it.
TEST_F(NetApply, KilledInTheMiddleItLeavesTheOldNetwork)
{
    EXPECT_TRUE(here_->Run([&] {
        const json document = Document(
            R"({"hostname": "attic", "dns": ["192.0.2.54"], "search": ["example.com"], "cards": [
                {"name": "eth0", "address": "192.0.2.77/24", "more_addresses": ["203.0.113.1/29"], "mtu": 1400},
                {"name": "eth1", "address": "198.51.100.5/24", "routes": ["233.252.0.0/24 via 198.51.100.1"]}]})");
        const json old = json::parse(Tavoctl({"net", "export"}).out);
        EXPECT_EQ(Apply(document).status, 0);
        const std::string asked = Network();
        EXPECT_EQ(Apply(old).status, 0);
        const json base = json::parse(Tavoctl({"net", "export"}).out);
        EXPECT_EQ(base, old);
        const std::string again = Network();  // some files are written in another way now
        WriteFile(kFile, document.dump());
        std::mt19937 random(7);
        int undone = 0;
        const int rounds = test::Rounds(50);
        for (int round = 0; round < rounds; ++round) {
            {
                const test::RunningTavoctl apply({"net", "apply", "--no-probe", kFile});
                ::usleep(static_cast<useconds_t>(random() % 400000));
                ::kill(apply.Pid(), SIGKILL);
            }
            EXPECT_TRUE(test::Eventually([] { return ::access("/var/run/tavo-net-trial.pid", F_OK) != 0; }));
            EXPECT_EQ(TAVONetHostsRefresh(), 0);
            const std::string found = Network();
            EXPECT_TRUE(found == again || found == asked) << "round " << round << "\n" << found << "\nold:\n" << again;
            EXPECT_FALSE(std::filesystem::exists("/etc/network.checkpoint"));
            undone += found == again;
            if (found != again) {
                EXPECT_EQ(Apply(old).status, 0);
                WriteFile(kFile, document.dump());
            }
            if (HasFailure())
                return false;
        }
        EXPECT_GT(undone, 0);
        return true;
    }));
}

}  // namespace
