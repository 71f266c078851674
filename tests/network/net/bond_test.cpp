// The files of a bond: as it is made, changed and dissolved, and whatever is left when the process dies half-way.
#include "tavo_net.h"

#include "cards.h"
#include "network/card_record.h"
#include "support/container_text.h"
#include "support/own_child.h"

#include <csignal>
#include <cstdio>

#include <dlfcn.h>
#include <fcntl.h>
#include <unistd.h>

using test::Cards;
using test::kScripts;
using test::LastFault;
using test::ReadFile;
using test::WriteFile;
using testing::ElementsAre;
using testing::IsEmpty;

namespace {

int steps_to_live = -1;    // the process dies before so many steps more are done
int renames_to_fail = -1;  // the rename that fails, counted from 0

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

    static std::map<std::string, std::string> Files()
    {
        std::map<std::string, std::string> files;
        for (const auto &entry : std::filesystem::directory_iterator(kScripts)) {
            if (entry.is_regular_file())
                files[entry.path().filename()] = ReadFile(entry.path());
        }
        return files;
    }

    static std::string NetworkCalls() { return std::filesystem::exists(kCalls) ? ReadFile(kCalls) : ""; }

    static constexpr const char *kCalls = "/var/standin/rc.log";
    static constexpr const char *kStopStart = "rc.network stop\nrc.network start\n";
    const std::map<std::string, std::string> kPlainFiles = {{"ifcfg-eth0", kEth0}, {"ifcfg-eth1", kEth1}};
    const std::map<std::string, std::string> kBondFiles = {{"ifcfg-eth0", kMember0},
                                                           {"ifcfg-eth0.saved", kEth0},
                                                           {"ifcfg-eth1", kMember1},
                                                           {"ifcfg-eth1.saved", kEth1},
                                                           {"ifcfg-bond0", kBond}};
};

TEST_F(Bond, IsMadeChangedAndDissolved)
{
    WriteFile(kScripts + "ifcfg-eth0.saved", "DEVICE=eth0\nIPADDR=10.");  // the remainder of an old copy
    ASSERT_EQ(Set(TAVO_NET_AGGR_ADAPTIVE, {"eth0", "eth1"}), 0);
    EXPECT_EQ(Files(), kBondFiles);
    EXPECT_EQ(NetworkCalls(), kStopStart);

    // As the kernel and the files have it: nothing to do, and no error either.
    KernelHas("balance-alb 6\n", "eth0 eth1\n");
    test::ForgetFault();
    EXPECT_EQ(Set(TAVO_NET_AGGR_ADAPTIVE, {"eth0", "eth1"}), 0);
    EXPECT_EQ(NetworkCalls(), kStopStart);
    EXPECT_EQ(TLIBErrGet(), ERR_SUCCESS);

    // Another mode keeps the address that the bond got meanwhile.
    std::string bond = kBond;
    bond.replace(bond.find(".10"), 3, ".99");
    WriteFile(kScripts + "ifcfg-bond0", bond);
    ASSERT_EQ(Set(TAVO_NET_AGGR_LACP, {"eth0", "eth1"}), 0);
    bond.replace(bond.find("mode"), bond.find("\"\n") - bond.find("mode"),
                 "mode=4 use_carrier=0 miimon=100 updelay=100 lacp_rate=fast");
    auto files = kBondFiles;
    files["ifcfg-bond0"] = bond;
    EXPECT_EQ(Files(), files);

    std::filesystem::remove(kCalls);
    ASSERT_EQ(Set(TAVO_NET_AGGR_NONE), 0);
    EXPECT_EQ(Files(), kPlainFiles);
    EXPECT_EQ(NetworkCalls(), kStopStart);
    EXPECT_THAT(log_.Texts(), IsEmpty());
}

TEST_F(Bond, AMemberThatLeavesGetsItsFileBack)
{
    ASSERT_EQ(Set(TAVO_NET_AGGR_BACKUP, {"eth0", "eth1"}), 0);
    ASSERT_EQ(Set(TAVO_NET_AGGR_BACKUP, {"eth0"}), 0);
    EXPECT_EQ(ReadFile(kScripts + "ifcfg-eth1"), kEth1);
    EXPECT_EQ(ReadFile(kScripts + "ifcfg-eth0"), kMember0);

    // Without its saved copy, too, it is a plain interface again.
    std::filesystem::remove(kScripts + "ifcfg-eth0.saved");
    ASSERT_EQ(Set(TAVO_NET_AGGR_NONE), 0);
    EXPECT_EQ(ReadFile(kScripts + "ifcfg-eth0"), "DEVICE=eth0\nONBOOT=yes\nBOOTPROTO=dhcp\n");
    EXPECT_FALSE(std::filesystem::exists(kScripts + "ifcfg-bond0"));
}

// A file cannot be written, the network does not start, or the start script dies while it stops the network.
TEST_F(Bond, IsTakenBackWhenItCannotBeMade)
{
    const auto cannot = [&](int code, const std::string &calls) {
        std::filesystem::remove(kCalls);
        log_.Clear();
        EXPECT_EQ(Set(TAVO_NET_AGGR_ADAPTIVE, {"eth0", "eth1"}), -1);
        EXPECT_EQ(LastFault(), (test::Fault{code, "net_link_aggr_set"}));
        EXPECT_EQ(NetworkCalls(), calls);
        EXPECT_EQ(ReadFile(kScripts + "ifcfg-eth0"), kEth0);
        EXPECT_EQ(ReadFile(kScripts + "ifcfg-eth1"), kEth1);
        EXPECT_FALSE(std::filesystem::exists(kScripts + "ifcfg-bond0"));
    };
    for (int failing = 0; failing < 3; ++failing) {
        Plain();
        renames_to_fail = failing;
        cannot(ERR_WRITE_FAILED, kStopStart);
        EXPECT_EQ(renames_to_fail, -1) << failing;
        EXPECT_EQ(log_.Lines().size(), 1u);
    }
    Plain();
    WriteFile("/var/standin/rc.network.status", "1");
    cannot(ERR_OP_FAILURE, std::string(kStopStart) + kStopStart);  // the old one is started
    EXPECT_EQ(Files(), kPlainFiles);
    WriteFile("/var/standin/rc.network.status", "0");
    WriteFile("/var/standin/rc.network.hook",
              "#!/bin/sh\n[ $1 = start ] || [ -e /tmp/once ] || { touch /tmp/once; kill -9 $PPID; }\n", 0755);
    cannot(ERR_OP_FAILURE, std::string("rc.network stop\n") + kStopStart);
    EXPECT_EQ(Files(), kPlainFiles);
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
    const TAVONETLINKAGGR rows[] = {
        test::Bond(4, {"eth0"}),         test::Bond(-1, {"eth0"}),         test::Bond(TAVO_NET_AGGR_LACP, {}),
        test::Bond(1, {"eth0", "eth0"}), test::Bond(1, {"eth0", "bond0"}), test::Bond(1, {"eth0", ""}),
        test::Bond(1, {"../../shadow"}),
    };
    for (const TAVONETLINKAGGR &row : rows) {
        EXPECT_EQ(TAVONetLinkAggrSet(&row), -1);
        EXPECT_EQ(LastFault(), (test::Fault{ERR_BAD_PARAMETERS, "net_link_aggr_set"}));
    }
    TAVONETLINKAGGR card = test::Bond(TAVO_NET_AGGR_BACKUP, {"eth1"});
    std::strcpy(card.szBond, "eth0");
    EXPECT_EQ(TAVONetLinkAggrSet(&card), -1);
    EXPECT_EQ(TLIBErrGet(), ERR_LINK_AGGR_TYPE) << "the card's file would be lost";
    EXPECT_EQ(Files(), kPlainFiles);
    EXPECT_EQ(NetworkCalls(), "");
}

TEST_F(Bond, IsReadFromTheKernel)
{
    TAVONETLINKAGGR record;
    ASSERT_EQ(TAVONetLinkAggrGet("bond0", &record), 0);
    EXPECT_EQ(record.nMode, TAVO_NET_AGGR_NONE);

    KernelHas("802.3ad 4\n", "eth0 eth1\n");
    ASSERT_EQ(TAVONetLinkAggrGet("bond0", &record), 0);
    EXPECT_EQ(record.nMode, TAVO_NET_AGGR_LACP);
    ASSERT_EQ(record.nMember, 2);
    EXPECT_STREQ(record.rgszMember[1], "eth1");

    test::List list = test::MakeList({});
    EXPECT_EQ(test::Moving(list, TAVONetLinkAggrEnum), 1);
    EXPECT_EQ(test::Moving(list, [](auto **addr) { return TAVONetLinkAggrPhyGet("bond0", addr); }), 2);
    EXPECT_THAT(test::Items(list.get()), ElementsAre("bond0", "eth0", "eth1"));

    KernelHas("balance-rr 0\n", "");
    EXPECT_EQ(TAVONetLinkAggrGet("bond0", &record), -1);
    EXPECT_EQ(TLIBErrGet(), ERR_LINK_AGGR_OPTION);
    EXPECT_EQ(log_.Take(), "net_link_aggr_get:# Non-supported bonding mode [balance-rr 0]");
}

TEST_F(Bond, MembersAreAddedOnceAndOnlyCards)
{
    TAVONETLINKAGGR record = test::Bond(TAVO_NET_AGGR_LACP, {"eth0"});
    EXPECT_EQ(TAVONetLinkAggrOptSlsaveAdd(&record, "eth1"), 0);
    EXPECT_EQ(TAVONetLinkAggrOptSlsaveAdd(&record, "eth1"), 0);
    EXPECT_EQ(record.nMember, 2);
    KernelHas("802.3ad 4\n", "");
    EXPECT_EQ(TAVONetLinkAggrOptSlsaveAdd(&record, "bond0"), -1);
    EXPECT_EQ(TLIBErrGet(), ERR_LINK_AGGR_TYPE);
    EXPECT_EQ(TAVONetLinkAggrOptSlsaveAdd(&record, "eth7"), -1);
    EXPECT_EQ(TLIBErrGet(), ERR_LINK_AGGR_TYPE);
    record.nMember = 1000000;
    EXPECT_EQ(TAVONetLinkAggrOptSlsaveAdd(&record, "eth1"), -1);
    EXPECT_EQ(TLIBErrGet(), ERR_BAD_PARAMETERS);
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
    Step();
    return result;
}
}
