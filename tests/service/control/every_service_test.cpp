// Every service through every action, and with daemons that misbehave in every way: checks the key, the links, the
// share records, the scripts in their order and the processes.
#include "tavo_service.h"

#include "service_root.h"
#include "support/rounds.h"
#include "support/test.h"

using test::DaemonPid;

namespace {

using Texts = std::vector<std::string>;

// Expected result of an action when a daemon misbehaves.
enum Outcome { done = 0, failed = -1 };

struct Row {
    int id;
    Texts start, stop, restart;  // the scripts that run
    Texts daemons;               // that run when it is started
    Texts staying;               // and those that a stop leaves running; also others that it starts
    bool on_when_stopped;        // the status of a service that is enabled and stopped
    std::string daemon;          // the misbehaving one; empty: there is none
    Outcome dies, stubborn;      // starting when it dies at once; stopping when it does not end
    bool has_pid_file;           // the status looks there
};

void PrintTo(const Row &row, std::ostream *out)
{
    *out << row.id;
}

Texts Scripts(const Texts &names, const char *word)
{
    Texts calls;
    for (const std::string &name : names)
        calls.push_back(name + ".sh " + word);
    return calls;
}

// A service that is one script; its first daemon misbehaves, and then starting and stopping fail or not.
Row Plain(int id, const std::string &script, const Texts &daemons, Outcome failure, bool has_pid_file)
{
    return {id,
            Scripts({script}, "start"),
            Scripts({script}, "stop"),
            Scripts({script}, "restart"),
            daemons,
            {},
            false,
            daemons[0],
            failure,
            failure,
            has_pid_file};
}

// A service that is only its key and its data folder.
Row Bare(int id)
{
    return {id, {}, {}, {}, {}, {}, true, "", done, done, false};
}

Texts Reversed(Texts texts)
{
    std::reverse(texts.begin(), texts.end());
    return texts;
}

Texts Joined(Texts left, const Texts &right)
{
    left.insert(left.end(), right.begin(), right.end());
    return left;
}

// The indexing daemon is restarted after the scripts.
Texts IndexAfter(const Texts &names, const char *word)
{
    return Joined(Scripts(names, word), {"S66tavoindexd.sh restart"});
}

const Texts on_database = {"S82surveillance", "S99iTunes", "S86tavodms", "S66tavoindexd", "S25download", "S23tavologd"};

const Texts remote = {"S96tavorcd", "S96tavoaudiod"};

// Scripts of a service without daemon bits: a failure only if the script could not be run. ftp is stopped by its name,
// which succeeds once the signal was sent; audio has a second daemon; no record says which process surveillance is.
// clang-format off
const Row rows[] = {
    Plain(0, "S97apache-user", {"httpd-user"}, failed, true),
    Bare(1),
    {2, {}, {}, {}, {"rsyncd"}, {}, false, "rsyncd", failed, failed, true},
    Plain(3, "S25download", {"scheduler"}, failed, true),
    Plain(4, "S86tavodms", {"dms"}, failed, true),
    {5, IndexAfter(remote, "start"), IndexAfter(remote, "stop"), IndexAfter(remote, "restart"),
     {"tavorcd", "tavoaudiod"}, {"tavoindexd"}, false, "tavoaudiod", done, done, true},
    {6, IndexAfter({"S99iTunes"}, "start"), IndexAfter({"S99iTunes"}, "stop"), IndexAfter({"S99iTunes"}, "restart"),
     {"mt-daapd"}, {"tavoindexd"}, false, "mt-daapd", failed, failed, true},
    Plain(7, "S21mysql", {"mysqld"}, done, true),
    Plain(8, "S20pgsql", {"postgres"}, done, true),
    Plain(9, "S55lpd", {"lpd"}, failed, false),
    {10, {"S82surveillance.sh start"}, {"S82surveillance.sh stop"}, {"S82surveillance.sh restart"},
     {"ssd"}, {}, true, "ssd", failed, failed, false},
    Bare(11),
    {12, {"S99ftpd.sh start"}, {}, {"S99ftpd.sh restart"}, {"ftpd"}, {}, false, "ftpd", failed, done, false},
    {13, {"S03inetd.sh restart"}, {"S03inetd.sh restart"}, {"S03inetd.sh restart"},
     {"inetd"}, {"inetd"}, true, "inetd", done, done, false},
    Plain(14, "S95sshd", {"sshd"}, done, true),
    Plain(15, "S83nfsd", {"nfsd"}, failed, false),
    Plain(16, "S81atalk", {"afpd", "papd"}, failed, true),
    Plain(17, "S80samba", {"smbd", "nmbd"}, done, true),
    Bare(18),
    {19, {"S97apache-sys.sh restart"}, {"S97apache-sys.sh restart"}, {"S97apache-sys.sh restart"},
     {"httpd-sys"}, {"httpd-sys"}, true, "httpd-sys", failed, failed, false},
    Plain(20, "S78iscsitrg", {"iscsi_trgt"}, failed, true),
    Plain(21, "S04crond", {"crond"}, failed, false),
    {22, Joined({"S21mysql.sh start", "S20pgsql.sh start"}, Reversed(Scripts(on_database, "start"))),
     Joined(Scripts(on_database, "stop"), {"S20pgsql.sh stop", "S21mysql.sh stop"}),
     Joined(Joined(Scripts(on_database, "stop"), {"S20pgsql.sh restart", "S21mysql.sh restart"}),
            Reversed(Scripts(on_database, "start"))),
     {"mysqld", "postgres", "tavologd", "scheduler", "tavoindexd", "dms", "mt-daapd", "ssd"},
     {}, false, "dms", failed, failed, false},
    Plain(23, "S77tavomkthumbd", {"mkthumbd"}, failed, true),
    Plain(24, "S66tavoindexd", {"tavoindexd"}, failed, true),
    Plain(25, "S88tavomkflvd", {"tavomkflvd"}, failed, true),
    {26, {}, {}, {}, {}, {}, false, "", failed, failed, false},
    Plain(27, "S99mDNS", {"mDNSResponder"}, failed, true),
    Plain(28, "S96tavorcd", {"tavorcd"}, failed, true),
    Plain(29, "S23tavologd", {"tavologd"}, failed, true),
};
// clang-format on

constexpr int kDatabases = 22;
constexpr int kRestore = 26;

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

    void ExpectBound(bool bound) const
    {
        for (const int32_t *id = TAVOServiceShareIDGet(row.id); *id != TAVO_SERVICE_SHARE_END; ++id) {
            TAVOSERVICESHARE share;
            ASSERT_EQ(TAVOServiceSettingGet(*id, &share), bound);
            const std::string folder = std::string("/volume2/") + share.szShareName;
            EXPECT_EQ(test::LinkTarget(share.szLink), bound ? folder : "");
            EXPECT_TRUE(std::filesystem::is_directory(folder)) << "data is never deleted unasked";
            char volume[52];
            EXPECT_EQ(TAVOServiceVolumeGetbyShare(share.szShareName, volume, sizeof volume), bound ? 9 : 0);
        }
    }

    void ExpectRunning() const
    {
        for (const std::string &daemon : row.daemons)
            EXPECT_TRUE(test::Runs(daemon)) << daemon;
        EXPECT_TRUE(IsOn());
    }

    void ExpectStopped() const
    {
        for (const std::string &daemon : row.daemons) {
            if (std::find(row.staying.begin(), row.staying.end(), daemon) == row.staying.end()) {
                EXPECT_TRUE(test::HasEnded(daemon)) << daemon;
            }
        }
        for (const std::string &daemon : row.staying)
            EXPECT_TRUE(test::Runs(daemon)) << daemon;
    }

    const Row &row = GetParam();
    const char *const key = TAVOServiceKeyGet(row.id);
};

class WithDaemon : public Every {};
class WithPidFile : public Every {};

TEST_P(Every, Action)
{
    const std::string settings = test::ReadFile("/etc/tavoinfo.conf");
    test::ScriptCalls();
    if (row.id == kRestore) {
        for (const int action : {TAVO_SERVICE_ENABLE, TAVO_SERVICE_DISABLE, TAVO_SERVICE_RESTART})
            EXPECT_EQ(test::FaultOf(Act(action)), (test::Fault{ERR_SERVICE_STD_ACTION, "service_action_set"}))
                << "it has no command";
        return;
    }
    if (key) {
        EXPECT_EQ(Act(TAVO_SERVICE_KEY_YES), 0);
        EXPECT_EQ(test::Setting(key), "yes");
        EXPECT_EQ(Act(TAVO_SERVICE_KEY_NO), 0);
        EXPECT_EQ(test::Setting(key), "no");
        EXPECT_EQ(TAVOServiceStatusGet(row.id), 0);
        EXPECT_THAT(test::ScriptCalls(), testing::IsEmpty()) << "the key alone";
    }
    const auto expect = [&](int action, const Texts &scripts, const char *value, bool running) {
        SCOPED_TRACE(action);
        EXPECT_EQ(Act(action), 0);
        EXPECT_EQ(test::ScriptCalls(), scripts);
        running ? ExpectRunning() : ExpectStopped();
        if (key) {
            EXPECT_EQ(test::Setting(key), value);
            ExpectBound(value == std::string("yes"));
        }
    };
    expect(TAVO_SERVICE_ENABLE, row.start, "yes", true);
    expect(TAVO_SERVICE_STOP, row.stop, "yes", false);
    EXPECT_TRUE(test::Eventually([&] { return TAVOServiceStatusGet(row.id) == row.on_when_stopped; }));
    expect(TAVO_SERVICE_START, row.start, "yes", true);
    std::map<std::string, pid_t> before;
    for (const std::string &daemon : row.daemons)
        before[daemon] = DaemonPid(daemon);
    expect(TAVO_SERVICE_RESTART, row.restart, "yes", true);
    for (const std::string &daemon : row.daemons)
        EXPECT_NE(DaemonPid(daemon), before[daemon]) << daemon;
    expect(TAVO_SERVICE_DISABLE, row.stop, "no", false);
    EXPECT_TRUE(test::Eventually([&] { return TAVOServiceStatusGet(row.id) == 0; })) << "whatever still runs";

    for (const int action : key ? std::vector{-1, 7} : std::vector{-1, 5, 6, 7}) {
        log_.Clear();
        EXPECT_EQ(test::FaultOf(Act(action)).code, ERR_BAD_PARAMETERS) << action;
        if (!key) {
            EXPECT_THAT(log_.Texts(), testing::ElementsAre(testing::MatchesRegex(
                                          "service_action_set:[0-9]+ Illegal action with Daemon " +
                                          std::string(TAVOServiceNameGet(row.id)))));
        }
    }
    EXPECT_THAT(test::ScriptCalls(), testing::IsEmpty());
    if (!key) {
        EXPECT_EQ(test::ReadFile("/etc/tavoinfo.conf"), settings);
    }
}

// The key is written before the daemon is started: such a service is enabled and does not run.
TEST_P(WithDaemon, DiesAtOnce)
{
    test::WriteFile("/var/standin/" + row.daemon + ".mode", "dies\n");
    EXPECT_EQ(Act(key ? TAVO_SERVICE_ENABLE : TAVO_SERVICE_START), row.dies);
    if (row.dies == failed) {
        EXPECT_EQ(test::LastFault().code, ERR_SERVICE_STD_ACTION);
    }
    EXPECT_EQ(DaemonPid(row.daemon), 0);
    EXPECT_EQ(TAVOServiceStatusGet(row.id), key && row.on_when_stopped && row.id != 13);
    if (key) {
        EXPECT_EQ(test::Setting(key), "yes");
        ExpectBound(true);
    }
}

TEST_P(WithDaemon, DoesNotEnd)
{
    ASSERT_EQ(Act(key ? TAVO_SERVICE_ENABLE : TAVO_SERVICE_START), 0);
    ASSERT_TRUE(IsOn());
    ASSERT_EQ(Act(TAVO_SERVICE_STOP), 0);
    test::WriteFile("/var/standin/" + row.daemon + ".mode", "stubborn\n");
    ASSERT_EQ(Act(TAVO_SERVICE_START), 0);
    ASSERT_TRUE(IsOn());
    const pid_t before = DaemonPid(row.daemon);

    EXPECT_EQ(Act(TAVO_SERVICE_STOP), row.stubborn);
    if (row.stubborn == failed) {
        EXPECT_EQ(test::LastFault().code, ERR_SERVICE_STD_ACTION);
    }
    EXPECT_EQ(DaemonPid(row.daemon), before) << "it was asked, and not killed";
    EXPECT_TRUE(IsOn()) << "so it is still on";
}

// A pid file that does not name the daemon, whatever it contains, counts as none, and one that comes late is waited for.
TEST_P(WithPidFile, CountsOnlyItsOwn)
{
    for (const char *mode : {"garbage", "stale", "nopid", "late"}) {
        SCOPED_TRACE(mode);
        test::WriteFile("/var/standin/" + row.daemon + ".mode", mode);
        EXPECT_EQ(Act(key ? TAVO_SERVICE_ENABLE : TAVO_SERVICE_START), 0);
        EXPECT_TRUE(test::Runs(row.daemon));
        if (mode == std::string("late")) {
            EXPECT_TRUE(test::IsUp(row.id));
        } else {
            EXPECT_EQ(TAVOServiceStatusGet(row.id), 0);
        }
        std::filesystem::remove(TAVOServiceProcGet(row.id));
        test::ResetStandins();
    }
}

template <class Wanted>
std::vector<Row> Those(Wanted wanted)
{
    std::vector<Row> those;
    std::copy_if(std::begin(rows), std::end(rows), std::back_inserter(those), wanted);
    return those;
}

std::string Name(const testing::TestParamInfo<Row> &info)
{
    return TAVOServiceNameGet(info.param.id);
}

INSTANTIATE_TEST_SUITE_P(Of, Every, testing::ValuesIn(rows), Name);
INSTANTIATE_TEST_SUITE_P(Every, WithDaemon,
                         testing::ValuesIn(Those([](const Row &row) { return !row.daemon.empty(); })), Name);
INSTANTIATE_TEST_SUITE_P(Every, WithPidFile, testing::ValuesIn(Those([](const Row &row) { return row.has_pid_file; })),
                         Name);

TEST(EveryService, IsInTheTable)
{
    ASSERT_EQ(std::size(rows), 30u);
    for (int id = 0; id < 30; ++id)
        EXPECT_EQ(rows[id].id, id);
}

}  // namespace
