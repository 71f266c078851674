// Every service through every action, and with daemons that misbehave in every way: the golden files have the scripts in
// their order, the settings, the links and the share records.
#include "tavo_service.h"

#include "service_root.h"
#include "support/rounds.h"
#include "support/test.h"

using test::DaemonPid;

namespace {

using Texts = std::vector<std::string>;

struct Row {
    int id;
    Texts daemons = {};  // that run when it is started; the first one misbehaves
    Texts staying = {};  // those that a stop leaves running; also others that it starts
};

void PrintTo(const Row &row, std::ostream *out)
{
    *out << row.id;
}

const Row rows[] = {
    {0, {"httpd-user"}},
    {1},
    {2, {"rsyncd"}},
    {3, {"scheduler"}},
    {4, {"dms"}},
    {5, {"tavoaudiod", "tavorcd"}, {"tavoindexd"}},
    {6, {"mt-daapd"}, {"tavoindexd"}},
    {7, {"mysqld"}},
    {8, {"postgres"}},
    {9, {"lpd"}},
    {10, {"ssd"}},
    {11},
    {12, {"ftpd"}},
    {13, {"inetd"}, {"inetd"}},
    {14, {"sshd"}},
    {15, {"nfsd"}},
    {16, {"afpd", "papd"}},
    {17, {"smbd", "nmbd"}},
    {18},
    {19, {"httpd-sys"}, {"httpd-sys"}},
    {20, {"iscsi_trgt"}},
    {21, {"crond"}},
    {22, {"dms", "mysqld", "postgres", "tavologd", "scheduler", "tavoindexd", "mt-daapd", "ssd"}},
    {23, {"mkthumbd"}},
    {24, {"tavoindexd"}},
    {25, {"tavomkflvd"}},
    {26},
    {27, {"mDNSResponder"}},
    {28, {"tavorcd"}},
    {29, {"tavologd"}},
};

constexpr int kDatabases = 22;

class Every : public test::Services, public testing::WithParamInterface<Row> {
  protected:
    void SetUp() override
    {
        if (test::Stride() > 1 && row.id % 4 != 1)
            GTEST_SKIP() << "every fourth service: each takes long here";
        Services::SetUp();
        if (IsSkipped())
            return;
        // The spooler's folder is bound when the first printer is shared.
        if (row.id == 9) {
            ASSERT_EQ(TAVOServiceSet(8, "/volume2"), 0);
        }
    }

    int Act(int action) const { return TAVOServiceActionSet(row.id, action); }

    // The stack of databases is several services and has no status of its own.
    bool IsOn() const { return row.id == kDatabases || test::IsUp(row.id); }

    // The action, and its daemons when they have followed.
    void Tell(const char *name, int action, bool runs)
    {
        story_.Head(name);
        TELL(Act(action));
        for (const std::string &daemon : runs ? row.daemons : row.staying)
            EXPECT_TRUE(test::Runs(daemon)) << name << daemon;
        for (const std::string &daemon : row.daemons) {
            if (!runs && std::find(row.staying.begin(), row.staying.end(), daemon) == row.staying.end()) {
                EXPECT_TRUE(test::HasEnded(daemon)) << name << daemon;
            }
        }
        if (runs && !row.daemons.empty()) {
            EXPECT_TRUE(IsOn()) << name;
        }
    }

    const Row &row = GetParam();
    const int start = TAVOServiceKeyGet(row.id) ? TAVO_SERVICE_ENABLE : TAVO_SERVICE_START;
};

class WithDaemon : public Every {};
class WithPidFile : public Every {};

TEST_P(Every, Action)
{
    for (const int action : {int{TAVO_SERVICE_KEY_YES}, int{TAVO_SERVICE_KEY_NO}, -1, 7}) {
        story_.Head("action " + std::to_string(action));
        TELL(Act(action));
        TELL(TAVOServiceStatusGet(row.id));
    }
    Tell("enable", TAVO_SERVICE_ENABLE, true);
    Tell("stop", TAVO_SERVICE_STOP, row.daemons == row.staying);
    TELL(TAVOServiceStatusGet(row.id));
    Tell("start", TAVO_SERVICE_START, true);
    std::map<std::string, pid_t> before;
    for (const std::string &daemon : row.daemons)
        before[daemon] = DaemonPid(daemon);
    Tell("restart", TAVO_SERVICE_RESTART, true);
    for (const std::string &daemon : row.daemons)
        EXPECT_NE(DaemonPid(daemon), before[daemon]) << daemon;
    Tell("disable", TAVO_SERVICE_DISABLE, false);
    TELL(TAVOServiceStatusGet(row.id));  // whatever still runs
}

// The key is written before the daemon is started: such a service is enabled and does not run.
TEST_P(WithDaemon, DiesAtOnceOrDoesNotEnd)
{
    const std::string &daemon = row.daemons[0];
    const std::string mode = "/var/standin/" + daemon + ".mode";
    test::WriteFile(mode, "dies\n");
    TELL(Act(start));
    EXPECT_EQ(DaemonPid(daemon), 0);
    TELL(TAVOServiceStatusGet(row.id));
    test::ResetStandins();

    test::WriteFile(mode, "stubborn\n");
    ASSERT_EQ(Act(start), 0);
    ASSERT_TRUE(IsOn());
    const pid_t before = DaemonPid(daemon);
    TELL(Act(TAVO_SERVICE_STOP));
    EXPECT_EQ(DaemonPid(daemon), before) << "it was asked, and not killed";
    EXPECT_TRUE(IsOn()) << "so it is still on";
}

// A pid file that does not name the daemon, whatever it contains, counts as none, and one that comes late is waited for.
TEST_P(WithPidFile, CountsOnlyItsOwn)
{
    for (const char *mode : {"garbage", "stale", "nopid", "late"}) {
        SCOPED_TRACE(mode);
        test::WriteFile("/var/standin/" + row.daemons[0] + ".mode", mode);
        EXPECT_EQ(Act(start), 0);
        EXPECT_TRUE(test::Runs(row.daemons[0]));
        if (mode == std::string("late")) {
            EXPECT_TRUE(test::IsUp(row.id));
        } else {
            EXPECT_EQ(TAVOServiceStatusGet(row.id), 0);
        }
        std::filesystem::remove(TAVOServiceProcGet(row.id));
        test::ResetStandins();
    }
}

std::vector<Row> WithDaemons(bool pid_file)
{
    std::vector<Row> those;
    for (const Row &row : rows) {
        const char *const proc = TAVOServiceProcGet(row.id);
        if (!row.daemons.empty() && (!pid_file || (proc && std::strchr(proc, '/'))))
            those.push_back(row);
    }
    return those;
}

std::string Name(const testing::TestParamInfo<Row> &info)
{
    return TAVOServiceNameGet(info.param.id);
}

INSTANTIATE_TEST_SUITE_P(Of, Every, testing::ValuesIn(rows), Name);
INSTANTIATE_TEST_SUITE_P(Every, WithDaemon, testing::ValuesIn(WithDaemons(false)), Name);
INSTANTIATE_TEST_SUITE_P(Every, WithPidFile, testing::ValuesIn(WithDaemons(true)), Name);

TEST(EveryService, IsInTheTable)
{
    ASSERT_EQ(std::size(rows), 30u);
    for (int id = 0; id < 30; ++id)
        EXPECT_EQ(rows[id].id, id);
}

}  // namespace
