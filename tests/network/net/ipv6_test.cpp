// IPv6 addresses and routes, wake-on-LAN and the DHCP clients: what is run, asked, stored and refused.
#include "tavo_net.h"

#include "cards.h"
#include "network/lock_holder.h"
#include "network/named_process.h"
#include "support/container_text.h"
#include "support/recorded_commands.h"
#include "support/story.h"

#include <utility>

#include <linux/ethtool.h>
#include <linux/sockios.h>

using test::Cards;
using test::ReadFile;
using test::WriteFile;

namespace {

constexpr const char *kTavoinfo = "/etc/tavoinfo.conf";

// A card that knows wake-on-LAN.
struct Wake {
    uint32_t supported = WAKE_MAGIC | WAKE_PHY;
    uint32_t enabled = 0;
    std::vector<std::string> orders = {};
    bool answers = true;
    bool obeys = true;

    int Answer(ifreq *ask)
    {
        ethtool_wolinfo info;
        std::memcpy(&info, ask->ifr_data, sizeof info);
        errno = EOPNOTSUPP;
        if (!answers)
            return -1;
        if (info.cmd == ETHTOOL_GWOL) {
            info.supported = supported;
            info.wolopts = enabled;
            std::memcpy(ask->ifr_data, &info, sizeof info);
            return 0;
        }
        if (!obeys)
            return -1;
        enabled = info.wolopts;
        orders.push_back("wakes by " + std::to_string(enabled));
        return info.cmd == ETHTOOL_SWOL ? 0 : -1;
    }
};

class NetIPv6 : public Cards {
  protected:
    NetIPv6()
    {
        AddCard("eth0", "192.0.2.10");
        WriteFile(kIfcfg, "DEVICE=eth0\nBOOTPROTO=dhcp\n");
        WriteFile(kTavoinfo, "support_wol=\"yes\"\nwol_enabled_options=\"g\"\n");
        story_.Mask("(boot|owner) .*", "$1 ...");            // of a checkpoint
        story_.Mask("dhcpcd error .*", "dhcpcd error ...");  // of an earlier call
        calls_.OnIoctl([this](int, unsigned long request, void *argument) {
            return request == SIOCETHTOOL ? wake_.Answer(static_cast<ifreq *>(argument)) : Answer(request, argument);
        });
    }

    const std::string kIfcfg = test::kScripts + "ifcfg-eth0";
    test::RecordedCommands commands_;
    Wake wake_;
    test::Story story_{TEST_GOLDEN,
                       {test::CommandsOf(commands_), test::LogOf(log_), test::CallsOf(calls_, "sleep"), WakeCalls()},
                       {kIfcfg, kTavoinfo, "/etc/network.checkpoint"}};

  private:
    // The orders that the card got.
    test::Story::Source WakeCalls()
    {
        return [this] {
            return std::exchange(wake_.orders, {});
        };
    }
};

TEST_F(NetIPv6, AddressesAreGivenStoredAndTakenBack)
{
    TELL(TAVONetIPv6AddrAdd("eth0", "2001:DB8:0:0::1", 64));
    TELL(TAVONetIPv6AddrDel("eth0", "2001:db8::2", 64));  // another one than the stored one
    TELL(TAVONetIPv6AddrDel("eth0", "2001:db8:0::1", 64));
    commands_.Fail("/sbin/ip");
    TELL(TAVONetIPv6AddrAdd("eth0", "2001:db8::7", 64));
}

TEST_F(NetIPv6, RoutesGoToNetworks)
{
    TELL(TAVONetIPv6RouteAdd("eth0", "2001:db8:1::", 48, "fe80::1"));
    TELL(TAVONetIPv6RouteAdd("eth0", "::", 0, "2001:db8::ffff"));
    TELL(TAVONetIPv6RouteDel("eth0", "2001:db8:2::", 47, nullptr));
    TELL(TAVONetIPv6RouteAdd("eth0", "2001:db8::", 64, "::"));
    commands_.Fail("/sbin/ip", 2);
    TELL(TAVONetIPv6RouteDel("eth0", "::", 0, nullptr));
}

TEST_F(NetIPv6, RefusesInvalidAddresses)
{
    const struct {
        const char *interface, *text;
        int length;
    } rows[] = {
        {"eth0", "2001:db8::1", -1},  {"eth0", "2001:db8::1", 129}, {"eth0", "2001:db8::1", 128},
        {"eth0", "2001:db8::1", 127}, {"eth0", "fe80::1%eth0", 64}, {"eth0", "192.0.2.1", 24},
        {"eth0", "::1;reboot", 128},  {"eth0", "ff02::1", 128},     {"eth0", "", 64},
        {"eth0", nullptr, 64},        {"eth0;x", "2001:db8::", 64}, {nullptr, "2001:db8::", 64},
    };
    for (const auto &row : rows) {
        story_.Head(std::string(row.text ? row.text : "NULL") + "/" + std::to_string(row.length) + " of " +
                    (row.interface ? row.interface : "NULL"));
        TELL(TAVONetIPv6AddrAdd(row.interface, row.text, row.length));
        TELL(TAVONetIPv6RouteAdd(row.interface, row.text, row.length, nullptr));
        TELL(TAVONetIPv6RouteDel(row.interface, row.text, row.length, nullptr));
    }
}

TEST_F(NetIPv6, AddressesComeFromTheKernelsTable)
{
    tree_.Put("/proc/net/if_inet6", "00000000000000000000000000000001 01 80 10 80       lo\n"
                                    "20010db8000000000000000000000001 02 40 00 80     eth0\n"
                                    "fe800000000000000000000000000a01 02 40 20 80     eth0\n"
                                    "fe800000000000000000000000000b01 03 40 20 80    eth01\n"
                                    "zz800000000000000000000000000b01 03 40 20 80     eth0\n"
                                    "fe80 03 40 20 80     eth0\n"
                                    "fe800000000000000000000000000b01 03 ff 20 80     eth0\n");
    test::List list = test::MakeList({});
    const auto enumerate = [&] {
        return test::Moving(list, [](auto **addr) { return TAVONetIPv6AddrEnum("eth0", addr); });
    };
    TELL(enumerate());
    story_.Show("addresses", test::Items(list.get()));
    tree_.Remove("/proc/net/if_inet6");
    TELL(enumerate());
    tree_.Put("/proc/net/if_inet6/unreadable", "");
    TELL(enumerate());
}

TEST_F(NetIPv6, SetsTheWakeUpPacketsOfACard)
{
    TELL(TAVONetWolGet("eth0"));
    TELL(TAVONetWolSet("eth0", 1));
    TELL(TAVONetWolGet("eth0"));
    TELL(TAVONetWolSet("eth0", 1));  // it knows already
    TELL(TAVONetWolSet("eth0", 0));
}

// Stored and set, or neither; also as a part of a larger change.
TEST_F(NetIPv6, WakeOnLanIsPutBack)
{
    wake_.obeys = false;
    TELL(TAVONetWolSet("eth0", 1));
    wake_.obeys = true;
    // A shared lock of this process's own never becomes exclusive, so the calls do not wait.
    ASSERT_EQ(ErrTLIBFileLock(TAVO_LOCK_TAVOINFO | TAVO_LOCK_SHARED, 0), 0);
    TELL(TAVONetWolSet("eth0", 1));
    TELL(TAVOConfSetMTUValue("eth0", 1400));
    ErrTLIBFileUnlock(TAVO_LOCK_TAVOINFO);
    TELL(TAVONetCheckpointTake());
    TELL(TAVONetWolSet("eth0", 1));
    TELL(TAVONetCheckpointPutBack());
}

TEST_F(NetIPv6, ReportsWhyACardCannotWake)
{
    const std::string yes = "support_wol=\"yes\"\n";
    const std::string packet = "wol_enabled_options=\"g\"\n";
    const struct {
        const char *what;
        std::string settings;
        bool answers;
    } rows[] = {
        {"a model that does not say", packet, true},
        {"a model without", "support_wol=\"no\"\n" + packet, true},
        {"no packets", yes, true},
        {"unknown packets", yes + "wol_enabled_options=\"gx\"\n", true},
        {"a silent card", yes + packet, false},
        {"packets of other cards", yes + "wol_enabled_options=\"s\"\n", true},
    };
    for (const auto &row : rows) {
        WriteFile(kTavoinfo, row.settings);
        wake_.answers = row.answers;
        story_.Head(row.what);
        TELL(TAVONetWolSet("eth0", 1));
        TELL(TAVONetWolGet("eth0"));
    }
}

TEST_F(NetIPv6, UsesThePanelOnlyOnModelsThatHaveOne)
{
    tree_.Put("/dev/ttyS1", "");
    TELL(TAVONetWolSet("eth0", 1));
    EXPECT_EQ(ReadFile(tree_.Place("/dev/ttyS1")), "") << "here a console or a modem may hang";

    tree_.Put("/etc.defaults/tavoinfo.conf", "wol_by_panel=\"yes\"\n");
    WriteFile(kTavoinfo, "support_wol=\"yes\"\nwol_enabled_options=\"g\"\n");
    TELL(TAVONetWolGet("eth0"));
    TELL(TAVONetWolSet("eth0", 1));
    EXPECT_EQ(ReadFile(tree_.Place("/dev/ttyS1")), "l\n");
    TELL(TAVONetWolGet("eth0"));
    TELL(TAVONetWolSet("eth0", 0));
    {
        const test::LockHolder other(TAVO_LOCK_TTYS1 | TAVO_LOCK_EXCLUSIVE | TAVO_LOCK_NONBLOCKING);
        TELL(TAVONetWolSet("eth0", 1));  // another program is writing to the panel
    }
    tree_.Remove("/dev/ttyS1");
    TELL(TAVONetWolSet("eth0", 1));
}

TEST_F(NetIPv6, TheDhcpTestTellsThreeThings)
{
    for (const int status : {0, 1, 2, 126, 127}) {
        commands_.Exit(status);
        TELL(TAVONetDhcpTest("eth0", 12));
    }
    for (const char *bad : {"", "eth0;x", "-T"})
        TELL(TAVONetDhcpTest(bad, 12));
}

// Programs that bear the DHCPv6 client's name, for one interface each.
TEST_F(NetIPv6, ADhcp6ClientIsWaitedForOnItsOwnInterface)
{
    test::NamedProcess client("/usr/sbin/dhcp6c", "eth0");
    TELL(TAVONetDhcp6Wait("eth0", 3));
    TELL(TAVONetDhcp6Wait("eth", 3));
    client.End();
    TELL(TAVONetDhcp6Wait("eth0", 3));
}

}  // namespace
