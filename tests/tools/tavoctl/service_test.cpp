// tavoctl service: the table, the statuses and the effects of the changing verbs, on stand-in daemons.
#include "tavo_lock.h"

#include "command_story.h"
#include "support/test.h"

#include <sys/mount.h>

namespace {

using test::Tavoctl;
using testing::MatchesRegex;

constexpr const char *kVolumes[] = {"/volume1", "/volume2"};

// Everything about services but their processes and times.
const test::Words kTable = {"service", "list", "--output", "name,enabled,running,shares,volumes,bound"};

// What the links of the data folders point at, and what start-up scripts were called and how each ended.
struct ServiceStory : test::CommandStory {
    ServiceStory() : CommandStory({"/var/services", "/var/standin/rc.log"})
    {
        Mask("2[0-9]{3}-[0-9]{2}-[0-9]{2} [0-9]{2}:[0-9]{2}:[0-9]{2}[+-][0-9]{2}:[0-9]{2}", "TIME");
        Mask("pid(\"?): +[0-9]+", "pid$1: PID");
    }
};

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
    for (const auto &[service, file] : {std::pair("media", "/var/run/dms.pid"), {"ftp", "/var/standin/ftpd.pid"}})
        EXPECT_EQ(test::Facts({"service", "status", "--json", service}).at("pid").dump() + "\n", test::ReadFile(file));
    ServiceStory story;
    // The data are on the roomier volume.
    story.Run({{"service", "status", "--json", "media"}, {"service", "status", "--json", "ftp"}, kTable});
    // Enabled and not running are two things.
    story.Run({{"service", "stop", "media"},
               {"service", "status", "--json", "media"},
               kTable,
               {"service", "list", "--volume", "/volume2"},
               {"service", "list", "--volume", "/volume1"},
               {"service", "list", "--volume", "elsewhere"}});
}

TEST_F(TavoctlService, ListsMissingServicesOnlyWithAll)
{
    ASSERT_EQ(Tavoctl({"conf", "set", "--defaults", "supportsurveillance", "no"}).status, 0);
    ServiceStory story;
    story.Run({kTable, {"service", "list", "--all", "--output", "name"}});
    ASSERT_EQ(Tavoctl({"conf", "set", "--defaults", "supportsurveillance", "yes"}).status, 0);
}

TEST_F(TavoctlService, StatusGivesThreeWhenItIsNotRunning)
{
    ServiceStory story;
    story.Run(
        {{"service", "status", "web"}, {"service", "enable", "--wait", "30", "web"}, {"service", "status", "web"}});
    // It runs, and its data is away.
    ASSERT_EQ(::umount2("/volume2", MNT_DETACH), 0);
    story.Run({{"service", "status", "--json", "web"}, {"service", "status", "nothing"}});
}

TEST_F(TavoctlService, DryRunShowsFoldersAndBindsNothing)
{
    ASSERT_EQ(::mkdir("/volume2/video", 0755), 0);
    ServiceStory story;
    story.Run({{"service", "enable", "--dry-run", "--json", "media"}, {"service", "status", "media"}});
    EXPECT_FALSE(std::filesystem::exists("/volume2/music"));
}

TEST_F(TavoctlService, SwitchesInTheOrderOfTheCommandLine)
{
    ServiceStory story;
    story.Run({{"service", "start", "crond", "nothing"},  // names are looked up before anything is switched
               {"service", "start", "ssh", "crond"},
               {"service", "restart", "crond", "ssh"},
               {"service", "stop", "ssh"}});
}

TEST_F(TavoctlService, ADaemonThatDiesIsNoticedWhenAskedTo)
{
    ServiceStory story;
    test::WriteFile("/var/standin/httpd-user.mode", "dies\n");
    // Its script fails, but the key was set before.
    story.Run({{"service", "enable", "web"}, {"service", "list", "--output", "name,enabled"}});
    test::WriteFile("/var/standin/httpd-user.mode", "garbage\n");
    story.Run({{"service", "start", "web"}, {"service", "start", "--wait", "1", "web"}});
    std::filesystem::remove("/var/standin/httpd-user.mode");
    story.Run({"service", "restart", "--wait", "30", "web"});
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
    ServiceStory story;
    story.Run({{"service", "reload", "crond"},  // which does not run
               {"service", "reload", "--dry-run", "crond"},
               {"service", "disable", "--dry-run", "--json", "web"},
               {"service", "reload", "photo"}});
    Tavoctl({"service", "disable", "samba"});
}

TEST_F(TavoctlService, VolumeBindsTheFoldersAndRestoreFindsThemAgain)
{
    ServiceStory story;
    story.Run({{"service", "enable", "--wait", "30", "web"},
               {"service", "volume", "--dry-run", "--json", "web", "1"},
               {"service", "enable", "--json", "web"},  // it is enabled and runs
               {"service", "volume", "web", "1"},
               {"service", "volume", "web", "/volume7"},  // not mounted
               {"service", "volume", "ftp", "/volume1"},  // it keeps no data
               {"service", "restore", "/volume7"},
               {"service", "stop", "web"}});
    // The volume is unmounted and comes back; meanwhile the link was removed.
    ASSERT_EQ(::unlink("/var/services/web"), 0);
    story.Run({{"service", "restore", "--dry-run", "/volume1"},
               {"service", "restore", "/volume1"},
               {"service", "status", "web"}});
    // It is gone for good: another one takes its place, but no service starts without its data unasked.
    ASSERT_EQ(::umount2("/volume1", MNT_DETACH), 0);
    story.Run({{"service", "enable", "web"},
               {"service", "enable", "--dry-run", "web"},
               {"service", "enable", "--force", "web"},
               {"service", "volume", "--force", "web", "/volume1"}});
    std::filesystem::remove_all("/volume1/web");
    story.Run(test::Words{"service", "restore"});
}

TEST_F(TavoctlService, ReportsABusyDispatcher)
{
    ASSERT_EQ(ErrTLIBFileLock(TAVO_LOCK_TAVOINFO | TAVO_LOCK_EXCLUSIVE | TAVO_LOCK_NONBLOCKING, 0), 0);
    ServiceStory story;
    // What can be said is said.
    story.Run({{"service", "reload", "crond"}, {"service", "status", "web"}, kTable});
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
