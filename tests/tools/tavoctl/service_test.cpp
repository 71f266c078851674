// tavoctl service: the table, the statuses and the effects of the changing verbs, on stand-in daemons.
#include "tavo_lock.h"

#include "run_tavoctl.h"
#include "support/test.h"

#include <nlohmann/json.hpp>

#include <sys/mount.h>

namespace {

using nlohmann::json;
using test::Tavoctl;
using testing::MatchesRegex;

constexpr const char *kVolumes[] = {"/volume1", "/volume2"};

std::string LinkTarget(const char *link)
{
    std::error_code none;
    return std::filesystem::read_symlink(link, none);
}

// What start-up scripts were called since the test began, and how each ended.
std::string ScriptLog()
{
    return std::filesystem::exists("/var/standin/rc.log") ? test::ReadFile("/var/standin/rc.log") : "";
}

// The row of one service in the JSON table.
json Row(const std::string &service, const test::Words &options = {})
{
    test::Words words = {"service", "list", "--json"};
    words.insert(words.end(), options.begin(), options.end());
    for (const json &row : test::Facts(words)) {
        if (row.at("name") == service)
            return row;
    }
    return nullptr;
}

class TavoctlService : public testing::Test {
  protected:
    void SetUp() override
    {
        if (test::RootLacks("mount") || test::RootLacks("proc"))
            GTEST_SKIP() << "volumes cannot be mounted here";
        std::filesystem::remove("/var/standin/rc.log");
        for (const char *volume : kVolumes) {
            ::mkdir(volume, 0755);
            ASSERT_EQ(::mount("tmpfs", volume, "tmpfs", 0, volume == kVolumes[0] ? "size=4m" : "size=8m"), 0) << volume;
        }
    }

    void TearDown() override
    {
        Tavoctl({"service", "disable", "media", "web", "ftp", "ssh"});
        Tavoctl({"service", "stop", "crond"});
        for (const char *volume : kVolumes)
            ::umount2(volume, MNT_DETACH);
    }
};

TEST_F(TavoctlService, ListShowsWhatIsEnabledAndWhatRuns)
{
    ASSERT_EQ(Tavoctl({"service", "enable", "--wait", "30", "media", "ftp"}).status, 0);
    const json media = Row("media");
    EXPECT_EQ(media.at("enabled"), true);
    EXPECT_EQ(media.at("running"), true);
    EXPECT_EQ(media.at("pid").dump() + "\n", test::ReadFile("/var/run/dms.pid"));
    EXPECT_THAT(media.at("since").get<std::string>(),
                MatchesRegex("2[0-9]{3}-[0-9]{2}-[0-9]{2} [0-9]{2}:[0-9]{2}:[0-9]{2}[+-][0-9]{2}:[0-9]{2}"));
    EXPECT_EQ(media.at("shares"), (json{"music", "video", "photo"}));
    EXPECT_EQ(media.at("volumes"), json{"/volume2"}) << "the roomier one";
    EXPECT_EQ(media.at("bound"), true);

    const json ftp = Row("ftp");
    EXPECT_EQ(ftp.at("pid").dump() + "\n", test::ReadFile("/var/standin/ftpd.pid")) << "found by its name";
    EXPECT_EQ(ftp.at("bound"), nullptr);
    EXPECT_EQ(ftp.at("shares"), json::array());

    // Enabled and not running are two things.
    ASSERT_EQ(Tavoctl({"service", "stop", "media"}).status, 0);
    EXPECT_EQ(Row("media").at("enabled"), true);
    EXPECT_EQ(Row("media").at("running"), false);
    EXPECT_EQ(Row("media").at("since"), nullptr);
    EXPECT_EQ(Row("DB").at("running"), nullptr) << "it is not a process";
    EXPECT_EQ(Row("crond").at("enabled"), nullptr) << "it has no key";

    EXPECT_EQ(Row("media", {"--volume", "/volume2"}).at("name"), "media");
    EXPECT_EQ(Row("ftp", {"--volume", "/volume2"}), nullptr);
    EXPECT_EQ(Row("media", {"--volume", "/volume1"}), nullptr);
    EXPECT_EQ(Tavoctl({"service", "list", "--volume", "elsewhere"}).status, 2);
    EXPECT_THAT(Tavoctl({"service", "list"}).out,
                MatchesRegex("NAME +ENABLED +RUNNING +PID +SINCE +SHARES +VOLUMES +BOUND\n(.|\n)*"
                             "\nmedia +yes +no +- +- +music,video,photo +/volume2 +yes\n(.|\n)*"));
}

TEST_F(TavoctlService, ListsMissingServicesOnlyWithAll)
{
    ASSERT_EQ(Tavoctl({"conf", "set", "--defaults", "supportsurveillance", "no"}).status, 0);
    EXPECT_EQ(Row("surveillance"), nullptr);
    EXPECT_EQ(Row("surveillance", {"--all"}).at("name"), "surveillance");
    EXPECT_EQ(test::Facts({"service", "list", "--all", "--json"}).size(), 30u);
    ASSERT_EQ(Tavoctl({"conf", "set", "--defaults", "supportsurveillance", "yes"}).status, 0);
}

TEST_F(TavoctlService, StatusGivesThreeWhenItIsNotRunning)
{
    const test::Ran off = Tavoctl({"service", "status", "web"});
    EXPECT_EQ(off.status, 3);
    EXPECT_THAT(off.out, testing::HasSubstr("running:  no\n"));
    EXPECT_EQ(off.err, "");
    ASSERT_EQ(Tavoctl({"service", "enable", "--wait", "30", "web"}).status, 0);
    EXPECT_EQ(Tavoctl({"service", "status", "web"}).status, 0);

    // It runs, and its data is away.
    ASSERT_EQ(::umount2("/volume2", MNT_DETACH), 0);
    const test::Ran adrift = Tavoctl({"service", "status", "--json", "web"});
    EXPECT_EQ(adrift.status, 0);
    EXPECT_EQ(test::Facts(adrift).at("on"), false);
    EXPECT_EQ(test::Facts(adrift).at("bound"), false);
    EXPECT_EQ(test::Facts(adrift).at("volumes"), json{"/volume2"});

    test::IsRefused({"service", "status", "nothing"}, "cannot find the service nothing: there is none of that name", 3);
}

TEST_F(TavoctlService, DryRunShowsFoldersAndBindsNothing)
{
    ASSERT_EQ(::mkdir("/volume2/video", 0755), 0);
    const test::Ran ran = Tavoctl({"service", "enable", "--dry-run", "--json", "media"});
    EXPECT_EQ(ran.status, 0);
    std::vector<std::string> changes;
    const json facts = test::Facts(ran);
    for (const json &change : facts.at("changes"))
        changes.push_back(change.at("object").get<std::string>() + " " + change.at("column").get<std::string>() + " " +
                          change.at("old").dump());
    EXPECT_THAT(changes, testing::ElementsAre("service media enabled false", "service media running false",
                                              "service media bound false", "/volume2/music folder false",
                                              "/volume2/photo folder false"));
    EXPECT_FALSE(std::filesystem::exists("/volume2/music"));
    EXPECT_EQ(LinkTarget("/var/services/video"), "");
    EXPECT_EQ(Row("media").at("enabled"), false);
    EXPECT_EQ(ScriptLog(), "");
}

TEST_F(TavoctlService, SwitchesInTheOrderOfTheCommandLine)
{
    // Names are looked up before anything is switched.
    EXPECT_EQ(Tavoctl({"service", "start", "crond", "nothing"}).status, 3);
    EXPECT_EQ(ScriptLog(), "");
    ASSERT_EQ(Tavoctl({"service", "start", "ssh", "crond"}).status, 0);
    ASSERT_EQ(Tavoctl({"service", "restart", "crond", "ssh"}).status, 0);
    ASSERT_EQ(Tavoctl({"service", "stop", "ssh"}).status, 0);
    EXPECT_EQ(ScriptLog(), "S95sshd.sh start\nS95sshd.sh start = 0\n"
                           "S04crond.sh start\nS04crond.sh start = 0\n"
                           "S04crond.sh restart\nS04crond.sh restart = 0\n"
                           "S95sshd.sh restart\nS95sshd.sh restart = 0\n"
                           "S95sshd.sh stop\nS95sshd.sh stop = 0\n");
}

TEST_F(TavoctlService, ADaemonThatDiesIsNoticedWhenAskedTo)
{
    test::WriteFile("/var/standin/httpd-user.mode", "dies\n");
    EXPECT_EQ(Tavoctl({"service", "enable", "web"}).status, 1) << "its script fails";
    EXPECT_EQ(Row("web").at("enabled"), true) << "the key was set before";
    test::WriteFile("/var/standin/httpd-user.mode", "garbage\n");
    EXPECT_EQ(Tavoctl({"service", "start", "web"}).status, 0);
    test::IsRefused({"service", "start", "--wait", "1", "web"}, "it is not running after 1 s", 1);
    std::filesystem::remove("/var/standin/httpd-user.mode");
    EXPECT_EQ(Tavoctl({"service", "restart", "--wait", "30", "web"}).status, 0);
}

TEST_F(TavoctlService, ReloadSignalsOrSaysWhyNot)
{
    ASSERT_EQ(Tavoctl({"service", "enable", "--wait", "30", "web", "samba"}).status, 0);
    EXPECT_EQ(Tavoctl({"service", "reload", "web", "samba"}).status, 0);
    for (const char *daemon : {"httpd-user", "smbd", "nmbd"}) {
        const std::string log = std::string("/var/standin/") + daemon + ".log";
        EXPECT_TRUE(test::Eventually([&] { return test::ReadFile(log).find("signal 1\n") != std::string::npos; }))
            << daemon;
    }
    EXPECT_EQ(Tavoctl({"service", "reload", "crond"}).status, 3) << "it does not run";
    EXPECT_EQ(Tavoctl({"service", "reload", "--dry-run", "crond"}).status, 0);
    EXPECT_EQ(test::Facts({"service", "disable", "--dry-run", "--json", "web"}).at("changes").size(), 3u)
        << "enabled, running and bound";
    test::IsRefused({"service", "reload", "photo"}, "it has no daemon that could reload", 1);
    Tavoctl({"service", "disable", "samba"});
}

TEST_F(TavoctlService, VolumeBindsTheFoldersAndRestoreFindsThemAgain)
{
    ASSERT_EQ(Tavoctl({"service", "enable", "--wait", "30", "web"}).status, 0);
    EXPECT_EQ(test::Facts({"service", "volume", "--dry-run", "--json", "web", "1"}),
              (json{{"changed", true},
                    {"dry_run", true},
                    {"changes",
                     {{{"object", "/var/services/web"},
                       {"column", "target"},
                       {"old", "/volume2/web"},
                       {"new", "/volume1/web"}}}}}));
    EXPECT_EQ(test::Facts({"service", "enable", "--json", "web"}).at("changed"), false) << "it is enabled and runs";
    EXPECT_EQ(LinkTarget("/var/services/web"), "/volume2/web");
    EXPECT_EQ(Tavoctl({"service", "volume", "web", "1"}).status, 0);
    EXPECT_EQ(LinkTarget("/var/services/web"), "/volume1/web");
    EXPECT_THAT(ScriptLog(), testing::HasSubstr("S97apache-user.sh restart"));

    EXPECT_EQ(Tavoctl({"service", "volume", "web", "/volume7"}).status, 3) << "not mounted";
    EXPECT_EQ(Tavoctl({"service", "volume", "ftp", "/volume1"}).status, 2) << "it keeps no data";
    EXPECT_EQ(Tavoctl({"service", "restore", "/volume7"}).status, 3);

    // The volume is unmounted and comes back; meanwhile the link was removed.
    ASSERT_EQ(Tavoctl({"service", "stop", "web"}).status, 0);
    ASSERT_EQ(::unlink("/var/services/web"), 0);
    EXPECT_EQ(Tavoctl({"service", "restore", "--dry-run", "/volume1"}).status, 0);
    EXPECT_EQ(LinkTarget("/var/services/web"), "");
    EXPECT_EQ(Tavoctl({"service", "restore", "/volume1"}).status, 0);
    EXPECT_EQ(LinkTarget("/var/services/web"), "/volume1/web");
    EXPECT_EQ(Tavoctl({"service", "status", "web"}).status, 0);

    // It is gone for good: another one takes its place, but no service starts without its data unasked.
    ASSERT_EQ(::umount2("/volume1", MNT_DETACH), 0);
    test::IsRefused({"service", "enable", "web"}, "the data of web is on /volume1, which is not mounted", 3);
    EXPECT_EQ(Tavoctl({"service", "enable", "--dry-run", "web"}).status, 3);
    EXPECT_EQ(LinkTarget("/var/services/web"), "/volume1/web");
    EXPECT_EQ(Tavoctl({"service", "enable", "--force", "web"}).status, 0);
    EXPECT_EQ(LinkTarget("/var/services/web"), "/volume2/web");
    EXPECT_EQ(Tavoctl({"service", "volume", "--force", "web", "/volume1"}).status, 0);
    EXPECT_EQ(LinkTarget("/var/services/web"), "/volume1/web");
    std::filesystem::remove_all("/volume1/web");
    EXPECT_EQ(Tavoctl({"service", "restore"}).status, 0);
    EXPECT_EQ(LinkTarget("/var/services/web"), "/volume2/web");
}

TEST_F(TavoctlService, ReportsABusyDispatcher)
{
    ASSERT_EQ(ErrTLIBFileLock(TAVO_LOCK_TAVOINFO | TAVO_LOCK_EXCLUSIVE | TAVO_LOCK_NONBLOCKING, 0), 0);
    EXPECT_EQ(Tavoctl({"service", "reload", "crond"}).status, 4);
    EXPECT_EQ(Tavoctl({"service", "status", "web"}).status, 4);
    const json photo = Row("photo");
    EXPECT_EQ(photo.at("enabled"), false) << "what can be said is said";
    EXPECT_EQ(photo.at("running"), nullptr);
    EXPECT_EQ(ErrTLIBFileUnlock(TAVO_LOCK_TAVOINFO), 0);
}

TEST_F(TavoctlService, WatchPrintsWhenSomethingHasChanged)
{
    test::RunningTavoctl watching({"service", "list", "--watch", "--interval", "1"});
    ::sleep(2);
    ASSERT_EQ(Tavoctl({"service", "start", "--wait", "30", "crond"}).status, 0);
    ::sleep(3);
    ASSERT_EQ(::kill(watching.Pid(), SIGTERM), 0);
    const test::Ran ran = watching.Wait();
    EXPECT_EQ(ran.status, 0);
    EXPECT_THAT(ran.out, MatchesRegex("NAME(.|\n)*crond +- +no (.|\n)*\n\nNAME(.|\n)*crond +- +yes +[0-9]+ (.|\n)*"));

    if (test::RootLacks("pts"))
        return;
    const test::Ran seen = test::TavoctlAtTerminal(
        {"lock", "run", "apple", "--", "timeout", "-s", "TERM", "2", "tavoctl", "service", "list", "--watch"});
    EXPECT_THAT(seen.out, testing::HasSubstr("\x1b[H\x1b[JNAME"));
}

}  // namespace
