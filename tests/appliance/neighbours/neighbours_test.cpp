// How the library asks and signals the rest of the appliance: expansion units, daemons, Samba's settings, domain accounts.
#include "tavo_appliance.h"
#include "tavo_proc.h"

#include "support/device_tree.h"
#include "support/owned_container.h"
#include "support/story.h"
#include "support/test.h"

namespace {

volatile sig_atomic_t last_signal = 0;

class Neighbours : public testing::Test {
  protected:
    void SetUp() override
    {
        if (test::RootForm().empty())
            GTEST_SKIP() << "only in an appliance root";
    }

    void Port(int number, const std::string &device, const std::string &speed)
    {
        tree_.Put("/sys/class/ata_device/dev" + std::to_string(number) + ".0/class", device + "\n");
        if (!speed.empty())
            tree_.Put("/sys/class/ata_link/link" + std::to_string(number) + "/sata_spd", speed + "\n");
    }

    void ListUnits()
    {
        TAVOEBOX *units = nullptr;
        const int count = TELL(TAVOEBoxInfoEnum(&units));
        for (int i = 0; i < count; ++i) {
            const TAVOEBOX &unit = units[i];
            story_.Show("unit " + std::to_string(unit.iUnit) + " at port " + std::to_string(unit.iPort),
                        std::vector<std::string>(unit.rgszDisk, unit.rgszDisk + unit.nDisk));
            TELL(TAVOEBoxIsPoweron(&units[i]));
        }
        std::free(units);
    }

    test::DeviceTree tree_;
    test::CapturedLog log_;
    test::Story story_{TEST_GOLDEN, {test::LogOf(log_)}, {"/usr/tavo/etc/smb.conf"}};
};

TEST_F(Neighbours, ExpansionUnitsComeFromThePorts)
{
    tree_.Put("/etc.defaults/tavoinfo.conf", "supportebox=no\n");
    Port(1, "pmp", "3.0 Gbps");
    ListUnits();
    tree_.Put("/etc.defaults/tavoinfo.conf", "supportebox=YES\n");
    Port(2, "ata", "3.0 Gbps");
    Port(4, "pmp", "<unknown>");
    Port(5, "pmp", "");
    for (const char *disk : {"sda", "sdaa", "sdab", "sdae", "sdaf", "sdba", "sdbe", "sdcc", "sddd"})
        tree_.Put("/sys/block/" + std::string(disk) + "/size", "1\n");
    ListUnits();
    for (const int port : {-1, 0, 1, 2, 3, 4, 5, 99})
        TELL(TAVOEBoxDevIs(port));
    tree_.Remove("/sys/class/ata_device");
    ListUnits();
}

TEST_F(Neighbours, DaemonsGetTheirSignals)
{
    std::signal(SIGUSR1, [](int signal) { last_signal = signal; });
    const struct {
        const char *name;
        int (*tell)(int signal);
    } rows[] = {{"scemd", TLIBScemdNotify}, {"scheduler", TAVOSchedulerHup}};
    for (const auto &row : rows) {
        const std::string pid_file = std::string("/var/run/") + row.name + ".pid";
        story_.Head(row.name);
        TELL(row.tell(SIGUSR1));
        story_.Show("signal", int{last_signal});
        test::WriteFile(pid_file, std::to_string(::getpid()) + "\n");
        TELL(row.tell(SIGUSR1));
        story_.Show("signal", int{std::exchange(last_signal, 0)});
        TELL(row.tell(999));
        std::filesystem::remove(pid_file);
    }
    std::signal(SIGUSR1, SIG_DFL);
}

TEST_F(Neighbours, TheBackupServerIsStartedOnceAndStopped)
{
    if (::access("/proc/self/stat", F_OK) != 0)
        GTEST_SKIP() << "needs /proc";
    const auto operate = [&](int operation) {
        TELL(TAVONetBkpService(operation));
        const pid_t pid = TLIBReadPidFile("/var/run/rsyncd.pid");
        story_.Show("running", TLIBProcAliveByPidFile("/var/run/rsyncd.pid"));
        return pid;
    };
    constexpr int stop = 1, start = 2, restart = 3, reload = 4;
    operate(stop);
    operate(reload);
    const pid_t first = operate(start);
    EXPECT_EQ(operate(start), first);
    EXPECT_EQ(operate(reload), first);
    EXPECT_NE(operate(restart), first);
    operate(stop);
    operate(restart);
    operate(stop);
    operate(5);
}

TEST_F(Neighbours, SambasListsFollowTheAccounts)
{
    const char *const path = "/usr/tavo/etc/smb.conf";
    const test::Owned<TLIBSZHASH> names =
        test::HashOf({{"ALICE", "al"}, {"BOB", ""}, {"@STAFF", "the staff"}, {"MÜLLER", "Möller"}});
    std::filesystem::remove(path);
    TELL(TAVOUserModifySmbConf(names));
    test::WriteFile(path, "[web]\nvalid users = alice, Bob, @staff, müller, carol\nread list = staff, @alice\n");
    TELL(TAVOUserModifySmbConf(names));
    TELL(TAVOUserModifySmbConf(names));
    std::filesystem::remove(path);
    std::filesystem::create_directory(path);
    TELL(TAVOUserModifySmbConf(names));
    std::filesystem::remove(path);
}

TEST_F(Neighbours, DomainUsersAreThoseWithADomain)
{
    const char *const path = "/usr/tavo/etc/duser_used";
    test::Owned<TLIBSZLIST> users = test::ListOf({});
    std::filesystem::remove(path);
    TELL(TAVOPushDUserUsed(users));
    test::WriteFile(path, "DOM\\joe\nnot one\n\nDOM\\ann");
    TELL(TAVOPushDUserUsed(users));
    story_.Show("users", test::Items(users));
    std::filesystem::remove(path);
    std::filesystem::create_directory(path);
    TELL(TAVOPushDUserUsed(users));
    std::filesystem::remove(path);
}

}  // namespace
