// The files of a bond: as it is made, changed and dissolved, and whatever is left when the process dies half-way.
#include "tavo_net.h"

#include "cards.h"
#include "network/card_record.h"
#include "support/container_text.h"
#include "support/own_child.h"
#include "support/story.h"
#include "support/test.h"
#include "support/text_lines.h"

#include <dlfcn.h>

using test::Cards;
using test::kScripts;
using test::ReadFile;
using test::WriteFile;

namespace {

int steps_to_live = -1;    // the process dies before so many steps more are done
int renames_to_fail = -1;  // the rename that fails, counted from 0
int command_to_fail = -1;  // and the command

void Step()
{
    if (steps_to_live >= 0 && steps_to_live-- == 0)
        ::raise(SIGKILL);
}

constexpr const char *kEth0 = "DEVICE=eth0\nONBOOT=yes\nBOOTPROTO=static\nIPADDR=192.0.2.10\nNETMASK=255.255.255.0\n";
constexpr const char *kEth1 = "# uplink\nDEVICE=eth1\nBOOTPROTO=dhcp\n";

constexpr const char *kMember0 = "DEVICE=eth0\nONBOOT=yes\nBOOTPROTO=none\nMASTER=bond0\nSLAVE=yes\n";
constexpr const char *kMember1 = "# uplink\nDEVICE=eth1\nBOOTPROTO=none\nONBOOT=yes\nMASTER=bond0\nSLAVE=yes\n";
constexpr const char *kBond = "DEVICE=bond0\nONBOOT=yes\nUSERCTL=no\n"
                              "BONDING_OPTS=\"mode=balance-alb use_carrier=0 miimon=100 updelay=100\"\n"
                              "BOOTPROTO=static\nIPADDR=192.0.2.10\nNETMASK=255.255.255.0\n";

class Bond : public Cards {
  protected:
    Bond()
    {
        AddCard("eth0", "192.0.2.10");
        AddCard("eth1");
        Plain();
        std::filesystem::remove(kCalls);
        WriteFile("/var/standin/rc.network.status", "0");  // the cards are no real ones
    }

    static void Plain()
    {
        for (const auto &entry : std::filesystem::directory_iterator(kScripts))
            std::filesystem::remove_all(entry);
        WriteFile(kScripts + "ifcfg-eth0", kEth0);
        WriteFile(kScripts + "ifcfg-eth1", kEth1);
    }

    // What the kernel would have, were the network started from the files.
    void KernelHas(const char *mode, const char *members)
    {
        AddCard("bond0");
        tree_.Put("/sys/class/net/bond0/bonding/mode", mode);
        tree_.Put("/sys/class/net/bond0/bonding/slaves", members);
        tree_.Put("/sys/class/net/bonding_masters", "bond0\n");
    }

    static int Set(int mode, const std::vector<const char *> &members = {})
    {
        const TAVONETLINKAGGR record = test::Bond(mode, members);
        return TAVONetLinkAggrSet(&record);
    }

    // Of the start script.
    static std::vector<std::string> NetworkCalls()
    {
        const std::string calls = std::filesystem::exists(kCalls) ? ReadFile(kCalls) : "";
        std::filesystem::remove(kCalls);
        return test::Lines(calls);
    }

    static constexpr const char *kUndo = "/var/undo";
    static constexpr const char *kCalls = "/var/standin/rc.log";
    test::Story story_{TEST_GOLDEN, {NetworkCalls, test::LogOf(log_), test::CallsOf(calls_, "f")}, {kScripts, kUndo}};
};

TEST_F(Bond, IsMadeChangedAndDissolved)
{
    // What the next change would undo, as it is while the network is started.
    WriteFile("/var/standin/rc.network.hook", "#!/bin/sh\ncp /etc/network.undo /var/undo\n", 0755);
    story_.Mask("(command|boot) .*", "$1 ...");
    WriteFile(kScripts + "ifcfg-eth0.saved", "DEVICE=eth0\nIPADDR=10.");  // the remainder of an old copy
    TELL(Set(TAVO_NET_AGGR_ADAPTIVE, {"eth0", "eth1"}));
    // As the kernel and the files have it: nothing to do, and no error either.
    KernelHas("balance-alb 6\n", "eth0 eth1\n");
    TELL(Set(TAVO_NET_AGGR_ADAPTIVE, {"eth0", "eth1"}));
    // Another mode keeps the address that the bond got meanwhile.
    std::string bond = kBond;
    bond.replace(bond.find(".10"), 3, ".99");
    WriteFile(kScripts + "ifcfg-bond0", bond);
    TELL(Set(TAVO_NET_AGGR_LACP, {"eth0", "eth1"}));
    TELL(Set(TAVO_NET_AGGR_NONE));
}

TEST_F(Bond, AMemberThatLeavesGetsItsFileBack)
{
    TELL(Set(TAVO_NET_AGGR_BACKUP, {"eth0", "eth1"}));
    TELL(Set(TAVO_NET_AGGR_BACKUP, {"eth0"}));
    // Without its saved copy, too, it is a plain interface again.
    std::filesystem::remove(kScripts + "ifcfg-eth0.saved");
    TELL(Set(TAVO_NET_AGGR_NONE));
}

// A file cannot be written, the network does not start, or the start script dies while it stops the network.
TEST_F(Bond, IsTakenBackWhenItCannotBeMade)
{
    for (int failing = 0; failing < 3; ++failing) {
        Plain();
        renames_to_fail = failing;
        story_.Head("rename " + std::to_string(failing));
        TELL(Set(TAVO_NET_AGGR_ADAPTIVE, {"eth0", "eth1"}));
        EXPECT_EQ(renames_to_fail, -1) << failing;
    }
    for (const int copy : {1, 2}) {  // after the stop
        Plain();
        command_to_fail = copy;
        story_.Head("copy " + std::to_string(copy));
        TELL(Set(TAVO_NET_AGGR_ADAPTIVE, {"eth0", "eth1"}));
    }
    Plain();
    WriteFile("/var/standin/rc.network.status", "1");
    TELL(Set(TAVO_NET_AGGR_ADAPTIVE, {"eth0", "eth1"}));
    WriteFile("/var/standin/rc.network.status", "0");
    WriteFile("/var/standin/rc.network.hook",
              "#!/bin/sh\n[ $1 = start ] || [ -e /tmp/once ] || { touch /tmp/once; kill -9 $PPID; }\n", 0755);
    TELL(Set(TAVO_NET_AGGR_ADAPTIVE, {"eth0", "eth1"}));
}

// Each interface is on its own, or belongs to a bond that has a file; no file is incomplete.
void ExpectStartable(const std::string &when)
{
    for (const char *name : {"eth0", "eth1"}) {
        const std::string file = ReadFile(kScripts + "ifcfg-" + name);
        const bool plain = file == kEth0 || file == kEth1;
        EXPECT_TRUE(plain || file == kMember0 || file == kMember1) << when << file;
        EXPECT_TRUE(plain || ReadFile(kScripts + "ifcfg-bond0") == kBond) << when;
    }
}

TEST_F(Bond, ADeathBetweenAnyTwoStepsLeavesANetworkThatStarts)
{
    const std::vector<const char *> members = {"eth0", "eth1"};
    for (const int mode : {TAVO_NET_AGGR_ADAPTIVE, TAVO_NET_AGGR_NONE}) {
        int steps = 0;
        for (bool died = true; died; ++steps) {
            Plain();
            if (mode == TAVO_NET_AGGR_NONE) {
                ASSERT_EQ(Set(TAVO_NET_AGGR_ADAPTIVE, members), 0);
            }
            const int result = test::InChild([&] {
                steps_to_live = steps;
                return Set(mode, mode == TAVO_NET_AGGR_NONE ? std::vector<const char *>() : members) == 0 ? 0 : 1;
            });
            died = result == -1;
            ASSERT_TRUE(died || result == 0);
            const std::string when = "mode " + std::to_string(mode) + ", step " + std::to_string(steps) + "\n";
            ExpectStartable(when);

            // Asked again it is completed, and what the interfaces were is not lost.
            ASSERT_EQ(Set(TAVO_NET_AGGR_ADAPTIVE, members), 0) << when;
            EXPECT_EQ(ReadFile(kScripts + "ifcfg-bond0"), kBond) << when;
            ASSERT_EQ(Set(TAVO_NET_AGGR_NONE), 0) << when;
            EXPECT_EQ(ReadFile(kScripts + "ifcfg-eth0"), kEth0) << when;
            EXPECT_EQ(ReadFile(kScripts + "ifcfg-eth1"), kEth1) << when;
        }
        EXPECT_GT(steps, mode == TAVO_NET_AGGR_NONE ? 4 : 7);
    }
}

TEST_F(Bond, RecordsThatMakeNoSenseAreRefused)
{
    TAVONETLINKAGGR rows[] = {
        test::Bond(4, {"eth0"}),         test::Bond(-1, {"eth0"}),         test::Bond(TAVO_NET_AGGR_LACP, {}),
        test::Bond(1, {"eth0", "eth0"}), test::Bond(1, {"eth0", "bond0"}), test::Bond(1, {"eth0", ""}),
        test::Bond(1, {"../../shadow"}), test::Bond(1, {"eth1"}),
    };
    std::strcpy(std::end(rows)[-1].szBond, "eth0");  // the card's file would be lost
    for (const TAVONETLINKAGGR &row : rows)
        TELL(TAVONetLinkAggrSet(&row));
}

TEST_F(Bond, IsReadFromTheKernel)
{
    TAVONETLINKAGGR record;
    const auto get = [&](const char *mode = "", const char *members = "eth0 eth1\n") {
        if (*mode)
            KernelHas(mode, members);
        story_.Head(mode);
        TELL(TAVONetLinkAggrGet("bond0", &record));
        story_.Show("mode", record.nMode);
        story_.Show("members", record.nMember);
    };
    get();
    for (const char *mode : {"active-backup 1\n", "balance-alb 6", "802.3ad 4\n"})
        get(mode);
    story_.Show("second", record.rgszMember[1]);
    test::List list = test::MakeList({});
    TELL(test::Moving(list, TAVONetLinkAggrEnum));
    TELL(test::Moving(list, [](auto **addr) { return TAVONetLinkAggrPhyGet("bond0", addr); }));
    story_.Show("list", test::Items(list.get()));
    get("balance-rr 0\n", "");
}

TEST_F(Bond, MembersAreAddedOnceAndOnlyCards)
{
    TAVONETLINKAGGR record = test::Bond(TAVO_NET_AGGR_LACP, {"eth0"});
    KernelHas("802.3ad 4\n", "");
    for (const char *name : {"eth1", "eth1", "bond0", "eth7"}) {
        story_.Head(name);
        TELL(TAVONetLinkAggrOptSlsaveAdd(&record, name));
        story_.Show("members", record.nMember);
    }
    record.nMember = TAVO_NET_MEMBERS;
    std::strcpy(record.rgszMember[1], "eth2");
    TELL(TAVONetLinkAggrOptSlsaveAdd(&record, "eth1"));
    record.nMember = 1000000;
    TELL(TAVONetLinkAggrOptSlsaveAdd(&record, "eth1"));
}

}  // namespace

extern "C" {

int rename(const char *from, const char *to) noexcept
{
    Step();
    if (renames_to_fail >= 0 && renames_to_fail-- == 0) {
        errno = ENOSPC;
        return -1;
    }
    return ::renameat(AT_FDCWD, from, AT_FDCWD, to);
}

int unlink(const char *path) noexcept
{
    Step();
    return ::unlinkat(AT_FDCWD, path, 0);
}

// A command has run.
pid_t waitpid(pid_t pid, int *status, int options)
{
    using Waitpid = pid_t(pid_t, int *, int);
    static Waitpid *const real = reinterpret_cast<Waitpid *>(::dlsym(RTLD_NEXT, "waitpid"));
    const pid_t result = real(pid, status, options);
    if (result > 0 && status && command_to_fail >= 0 && command_to_fail-- == 0)
        *status = 1 << 8;
    Step();
    return result;
}
}
