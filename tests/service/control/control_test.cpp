// Switches services for real: stand-in daemons start, write pid files and end; /var/standin/rc.log lists every script
// call.
#include "tavo_file.h"
#include "tavo_lock.h"
#include "tavo_service.h"

#include "service_root.h"
#include "support/own_child.h"
#include "support/scenario.h"
#include "support/stale_stack.h"
#include "support/test.h"

#include <pwd.h>
#include <sys/mount.h>
#include <sys/prctl.h>

using test::Fault;
using test::FaultOf;
using test::LinkTarget;
using test::ScriptCalls;
using test::Services;
using test::Setting;
using testing::ElementsAre;
using testing::IsEmpty;

namespace {

TEST(ServiceLookUps, RowsAndRefusals)
{
    EXPECT_EQ(TAVOServiceIndexGet("DB"), 22);
    test::ForgetFault();
    EXPECT_EQ(TAVOServiceIndexGet("db"), -1);
    EXPECT_EQ(TLIBErrGet(), ERR_SUCCESS) << "an unknown name is an answer";
    // The empty row that ends the table is a row: every look-up accepts it.
    test::ForgetFault();
    ASSERT_NE(TAVOServiceInfoGet(30), nullptr);
    EXPECT_EQ(TAVOServiceNameGet(30), nullptr);
    EXPECT_EQ(TAVOServiceScriptGet(30), nullptr);
    EXPECT_EQ(TAVOServiceKeyGet(30), nullptr);
    EXPECT_EQ(TAVOServiceProcGet(30), nullptr);
    EXPECT_EQ(TAVOServiceDaemonIDGet(30), 0);
    EXPECT_EQ(TAVOServiceShareIDGet(30)[0], TAVO_SERVICE_SHARE_END);
    EXPECT_EQ(TAVOServiceTypeGet(30), -1);
    EXPECT_EQ(TLIBErrGet(), ERR_SUCCESS);
    EXPECT_EQ(FaultOf(TAVOServiceActionSet(30, TAVO_SERVICE_START)), (Fault{ERR_SERVICE_ACTION, "service_action_set"}));

    const std::pair<int, int> types[] = {{9, 0}, {4, 0}, {12, 1}, {13, 1}, {18, 2}, {19, 2}, {21, 3}, {26, 3}};
    for (const auto &[id, type] : types)
        EXPECT_EQ(TAVOServiceTypeGet(id), type) << id;
    const std::pair<const char *, int> masks[] = {{"web", 0x40},
                                                  {"netbackup", 0x100},
                                                  {"SURVEILLANCE", 0x2000},
                                                  {"photo", 0x5082},
                                                  {"Video", 0x1802},
                                                  {"music", 0x241802},
                                                  {"homes", 0},
                                                  {"", -1}};
    for (const auto &[name, mask] : masks)
        EXPECT_EQ(TAVOServiceDaemonGet(name), mask) << name;
}

TEST(NetService, DrivesDaemonsInItsOwnOrder)
{
    test::CapturedLog log;
    const uint32_t mask = TAVO_DAEMON_NFS | TAVO_DAEMON_CRON | TAVO_DAEMON_SMB | TAVO_DAEMON_AFP | TAVO_DAEMON_INDEX |
                          TAVO_DAEMON_MDNS | TAVO_DAEMON_DOWNLOAD | TAVO_DAEMON_MEDIA;
    EXPECT_EQ(TAVONetService(mask, TAVO_DAEMON_START), static_cast<int>(mask));
    EXPECT_THAT(ScriptCalls(),
                ElementsAre("S81atalk.sh start", "S80samba.sh start", "S86tavodms.sh start", "S66tavoindexd.sh start",
                            "S25download.sh start", "S04crond.sh start", "S83nfsd.sh start", "S99mDNS.sh start"));
    EXPECT_TRUE(test::IsUp(21)) << "cron";
    EXPECT_EQ(TAVONetService(TAVO_DAEMON_CRON, TAVO_DAEMON_STOP), static_cast<int>(TAVO_DAEMON_CRON));
    EXPECT_TRUE(test::Eventually([] { return TAVOServiceStatusGet(21) == 0; }));
    EXPECT_EQ(rgslckList[0].nRef, 0) << "no lock is left";

    // A daemon that fails is missing in the answer; the others are still driven.
    test::WriteFile("/var/standin/S80samba.sh.status", "3\n");
    EXPECT_EQ(TAVONetService(TAVO_DAEMON_SMB | TAVO_DAEMON_CRON, TAVO_DAEMON_START),
              static_cast<int>(TAVO_DAEMON_CRON));
    EXPECT_EQ(TAVONetService(TAVO_DAEMON_RESTORE, TAVO_DAEMON_START), 0) << "it has no command";
}

TEST(NetService, DrivesDaemonsOfTheDatabaseStackOnce)
{
    const int stack = TAVO_DAEMON_DATABASE;
    EXPECT_EQ(TAVONetService(stack, TAVO_DAEMON_START), stack);
    const std::vector<std::string> alone = ScriptCalls();
    EXPECT_EQ(TAVONetService(stack | TAVO_DAEMON_MEDIA | TAVO_DAEMON_PLAYER | TAVO_DAEMON_INDEX | TAVO_DAEMON_DOWNLOAD |
                                 TAVO_DAEMON_SURVEILLANCE,
                             TAVO_DAEMON_START),
              stack);
    EXPECT_EQ(ScriptCalls(), alone);
    EXPECT_EQ(TAVONetService(stack, TAVO_DAEMON_STOP), stack);
}

TEST(NetService, RestartsTheWebServersAroundEachOther)
{
    EXPECT_EQ(TAVONetService(TAVO_DAEMON_WEB_SYSTEM, TAVO_DAEMON_START), 0x40000000)
        << "the highest bit would make the result a failure";
    EXPECT_THAT(ScriptCalls(), ElementsAre("S97apache-sys.sh start"));
    for (const int operation : {TAVO_DAEMON_RESTART, TAVO_DAEMON_START, TAVO_DAEMON_STOP, TAVO_DAEMON_RELOAD}) {
        EXPECT_EQ(TAVONetService(TAVO_DAEMON_WEB_SYSTEM | TAVO_DAEMON_WEB_USER, operation), 0x40000040);
        EXPECT_THAT(ScriptCalls(),
                    ElementsAre("S97apache-user.sh stop", "S97apache-sys.sh restart", "S97apache-user.sh start"))
            << operation;
    }
    test::WriteFile("/var/standin/S97apache-user.sh.status", "3\n");
    EXPECT_EQ(TAVONetService(TAVO_DAEMON_WEB_SYSTEM | TAVO_DAEMON_WEB_USER, TAVO_DAEMON_RESTART), 0x40000000)
        << "the user's server fails alone";
    std::filesystem::remove("/var/standin/S97apache-user.sh.status");
    test::WriteFile("/var/standin/httpd-user.mode", "dies\n");
    EXPECT_EQ(TAVONetService(TAVO_DAEMON_WEB_SYSTEM | TAVO_DAEMON_WEB_USER, TAVO_DAEMON_RESTART), 0x40000000)
        << "stopped, and not started again";
}

TEST(NetService, ReloadsBySignal)
{
    const int mask = TAVO_DAEMON_WEB_USER | TAVO_DAEMON_SMB | TAVO_DAEMON_AFP | TAVO_DAEMON_FTP | TAVO_DAEMON_CRON |
                     TAVO_DAEMON_WEBDAV | TAVO_DAEMON_MEDIA | TAVO_DAEMON_ISCSI;
    ASSERT_EQ(TLIBFileSetKeyValue("/etc/tavoinfo.conf", "runafp", "yes", nullptr), 1);
    EXPECT_EQ(TAVONetService(mask, TAVO_DAEMON_RELOAD), 0) << "nothing runs";
    ASSERT_EQ(TAVONetService(mask, TAVO_DAEMON_START), mask);
    EXPECT_EQ(TAVONetService(mask, TAVO_DAEMON_RELOAD), mask);
    for (const char *daemon :
         {"httpd-user", "smbd", "nmbd", "afpd", "papd", "ftpd", "crond", "httpd-webdav", "dms", "iscsi_trgt"}) {
        const std::string log = std::string("/var/standin/") + daemon + ".log";
        EXPECT_TRUE(test::Eventually([&] { return test::ReadFile(log).find("signal 1\n") != std::string::npos; }))
            << daemon;
    }
    // The server reports itself running only while it is enabled.
    ASSERT_EQ(TLIBFileSetKeyValue("/etc/tavoinfo.conf", "runafp", "no", nullptr), 1);
    EXPECT_EQ(TAVONetService(TAVO_DAEMON_AFP, TAVO_DAEMON_RELOAD), 0);

    EXPECT_EQ(TAVONetService(TAVO_DAEMON_NFS, TAVO_DAEMON_RELOAD), 0) << "there is no server to re-export for";
    ASSERT_EQ(TAVONetService(TAVO_DAEMON_NFS, TAVO_DAEMON_START), static_cast<int>(TAVO_DAEMON_NFS));
    ScriptCalls();
    test::Scenario scenario;
    scenario.Expect({"/usr/sbin/exportfs", "-ra"}).Exits(0);
    EXPECT_EQ(TAVONetService(TAVO_DAEMON_NFS, TAVO_DAEMON_RELOAD), static_cast<int>(TAVO_DAEMON_NFS));
    EXPECT_THAT(ScriptCalls(), IsEmpty());
}

// A reload trusts no pid file with anything but one number in it, and none that another user could have written: it
// would signal other processes, or all of them.
TEST(NetService, IgnoresHostilePidFiles)
{
    const std::pair<uint32_t, std::string> rows[] = {
        {TAVO_DAEMON_AFP, "afpd"},
        {TAVO_DAEMON_SMB, "smbd"},
        {TAVO_DAEMON_WEB_USER, "httpd-user"},
        {TAVO_DAEMON_WEB_SYSTEM, "httpd-sys"},
        {TAVO_DAEMON_WEBDAV, "httpd-webdav"},
        {TAVO_DAEMON_MEDIA, "dms"},
        {TAVO_DAEMON_NETBKP, "rsyncd"},
    };
    // A hang-up would end it.
    const test::OwnChild bystander([] {
        ::signal(SIGHUP, SIG_DFL);
        ::pause();
    });
    const std::string other = std::to_string(bystander.Pid());
    ASSERT_EQ(TLIBFileSetKeyValue("/etc/tavoinfo.conf", "runafp", "yes", nullptr), 1);
    for (const auto &[daemon, name] : rows) {
        SCOPED_TRACE(name);
        const std::string pid_path = "/var/run/" + name + ".pid";
        const char *const pid_file = pid_path.c_str();
        ASSERT_GT(TAVONetService(daemon, TAVO_DAEMON_START), 0);
        const auto expect_no_signal = [&, mask = daemon] {
            EXPECT_EQ(TAVONetService(mask, TAVO_DAEMON_RELOAD), 0);
            EXPECT_EQ(::waitpid(bystander.Pid(), nullptr, WNOHANG), 0);
        };
        for (const std::string &text : {std::string("-1\n"), other + " 1\n", other + " " + other, std::string("0\n"),
                                        "-" + other, std::string(4096, '9'), other + "; reboot", std::string()}) {
            test::WriteFile(pid_file, text);
            expect_no_signal();
        }
        // Another user's file, and a link to one.
        test::WriteFile(pid_file, other + "\n");
        ASSERT_EQ(::chown(pid_file, 1000, 1000), 0);
        expect_no_signal();
        std::filesystem::remove(pid_file);
        ASSERT_EQ(::symlink("/tmp/elsewhere.pid", pid_file), 0);
        test::WriteFile("/tmp/elsewhere.pid", other + "\n");
        expect_no_signal();
        std::filesystem::remove(pid_file);
        ASSERT_EQ(::mkfifo(pid_file, 0600), 0);
        expect_no_signal();
        std::filesystem::remove(pid_file);
        EXPECT_THAT(test::ReadFile("/var/standin/" + name + ".log"), testing::Not(testing::HasSubstr("signal 1\n")));
    }
}

// Start scripts run under the dispatcher's locks: one that takes them waits for its own time-out, and no longer.
TEST(NetService, ScriptThatLocksFailsInTime)
{
    test::WriteFile("/var/standin/S04crond.sh.hook", "#!/bin/sh\nexec tavoctl service status samba\n", 0755);
    const time_t before = ::time(nullptr);
    EXPECT_EQ(TAVONetService(TAVO_DAEMON_CRON | TAVO_DAEMON_MDNS, TAVO_DAEMON_START),
              static_cast<int>(TAVO_DAEMON_MDNS))
        << "those that follow are driven all the same";
    EXPECT_GE(::time(nullptr) - before, 4);
    EXPECT_LE(::time(nullptr) - before, 60);
    std::filesystem::remove("/var/standin/S04crond.sh.hook");
    EXPECT_EQ(TAVONetService(TAVO_DAEMON_CRON, TAVO_DAEMON_START), static_cast<int>(TAVO_DAEMON_CRON));
}

TEST(NetService, TwoProcessesNeverInterleave)
{
    for (const char *script : {"S04crond.sh", "S99mDNS.sh"})
        test::WriteFile(std::string("/var/standin/") + script + ".hook", "#!/bin/sh\nsleep 0.03\n", 0755);
    const auto work = [] {
        ErrTLIBFileCloseLock();
        bool done = true;
        for (int round = 0; round < 4; ++round)
            done = TAVONetService(TAVO_DAEMON_CRON | TAVO_DAEMON_MDNS, TAVO_DAEMON_RESTART) > 0 && done;
        ::_exit(!done);
    };
    test::OwnChild children[] = {test::OwnChild(work), test::OwnChild(work)};
    for (test::OwnChild &child : children)
        EXPECT_EQ(child.Status(), 0);
    const std::vector<std::string> events = test::ScriptEvents();
    ASSERT_EQ(events.size(), 32u);
    for (long i = 0; i < 32; i += 4) {
        EXPECT_THAT(std::vector(events.begin() + i, events.begin() + i + 4),
                    ElementsAre("S04crond.sh restart", "S04crond.sh restart = 0", "S99mDNS.sh restart",
                                "S99mDNS.sh restart = 0"));
    }
}

TEST_F(Services, DataFoldersAreBoundInOrderAndNamedByTheirRule)
{
    ASSERT_EQ(TAVOServiceActionSet(4, TAVO_SERVICE_ENABLE), 0);
    ASSERT_EQ(TAVOServiceActionSet(7, TAVO_SERVICE_ENABLE), 0);
    EXPECT_EQ(LinkTarget("/var/services/mysql"), "/volume2/@database/mysql");
    ASSERT_EQ(TAVOServiceActionSet(3, TAVO_SERVICE_ENABLE), 0);
    EXPECT_EQ(LinkTarget("/var/services/download"), "/volume2/@download");

    TAVOSERVICESHARE share;
    ASSERT_EQ(TAVOServiceSettingGet(7, &share), 1);
    EXPECT_STREQ(share.szShareName, "@database/mysql");
    EXPECT_STREQ(share.szVolumePath, "/volume2") << "the database folders stand one level deeper";
    EXPECT_EQ(share.fOnVolume, 1);
    EXPECT_EQ(share.fSupported, 1);
    EXPECT_EQ(share.fSpecialVolume, 0);

    char volume[52];
    EXPECT_EQ(TAVOServiceVolumeGetbyShare("photo", volume, sizeof volume), 9);
    EXPECT_STREQ(volume, "/volume2");
    EXPECT_EQ(TAVOServiceVolumeGetbyShare("nobody", volume, sizeof volume), 0);
    EXPECT_EQ(test::LastFault(), (Fault{ERR_NO_SUCH_SHARE, "service_volume_getby_share"}));

    // The media server still needs the photos: disabling the photo service leaves them bound.
    ASSERT_EQ(TAVOServiceActionSet(1, TAVO_SERVICE_ENABLE), 0);
    ASSERT_EQ(TAVOServiceActionSet(1, TAVO_SERVICE_DISABLE), 0);
    EXPECT_EQ(LinkTarget("/var/services/photo"), "/volume2/photo");

    std::filesystem::remove("/usr/tavo/etc/share.conf");
    std::filesystem::create_directory("/usr/tavo/etc/share.conf");
    EXPECT_EQ(TAVOServiceVolumeGetbyShare("photo", volume, sizeof volume), -1) << "it cannot be read";
}

// A server finds its folders when it starts.
TEST_F(Services, FoldersAreBoundInOrderBeforeTheServerStarts)
{
    test::WriteFile("/var/standin/S86tavodms.sh.hook",
                    "#!/bin/sh\ngrep '^\\[' /usr/tavo/etc/share.conf >/tmp/bound\n"
                    "for link in music video photo; do readlink /var/services/$link >>/tmp/bound; done\n",
                    0755);
    ASSERT_EQ(TAVOServiceActionSet(4, TAVO_SERVICE_ENABLE), 0);
    EXPECT_EQ(test::ReadFile("/tmp/bound"),
              "[music]\n[video]\n[photo]\n/volume2/music\n/volume2/video\n/volume2/photo\n");
}

// A failure is logged in one line and ends the action.
TEST_F(Services, LogsEachFailedStepOfAnAction)
{
    const auto expect = [&](int code, const char *text) {
        EXPECT_EQ(TLIBErrGet(), code) << text;
        EXPECT_THAT(log_.Texts(),
                    testing::Contains(testing::MatchesRegex("service_std_action:[0-9]+ " + std::string(text))));
        log_.Clear();
    };

    test::WriteFile("/volume2/web", "no folder");
    EXPECT_EQ(TAVOServiceActionSet(0, TAVO_SERVICE_ENABLE), -1);
    expect(ERR_MKDIR_FAILED, "Failed to set service web's share: volume = /volume2");
    EXPECT_EQ(Setting("runweb"), "no");
    std::filesystem::remove("/volume2/web");

    // The daemon fails after the key has been written.
    test::WriteFile("/var/standin/S97apache-user.sh.status", "3\n");
    EXPECT_EQ(TAVOServiceActionSet(0, TAVO_SERVICE_ENABLE), -1);
    expect(ERR_SERVICE_STD_ACTION, "TAVONetService failed with id=64");
    EXPECT_EQ(Setting("runweb"), "yes");
    std::filesystem::remove("/var/standin/S97apache-user.sh.status");

    test::WriteFile("/var/standin/S95sshd.sh.hook", "#!/bin/sh\nkill -9 $PPID\n", 0755);
    EXPECT_EQ(TAVOServiceActionSet(14, TAVO_SERVICE_START), -1);
    expect(ERR_SERVICE_STD_ACTION, "TLIBExec failed with script=/usr/tavo/etc/rc.d/S95sshd.sh");
    test::WriteFile("/var/standin/S95sshd.sh.status", "3\n");
    std::filesystem::remove("/var/standin/S95sshd.sh.hook");
    EXPECT_EQ(TAVOServiceActionSet(14, TAVO_SERVICE_START), 0) << "a script of its own may fail";

    std::filesystem::remove("/var/services/web");
    ASSERT_EQ(::mkdir("/var/services/web", 0755), 0);
    EXPECT_EQ(TAVOServiceActionSet(0, TAVO_SERVICE_DISABLE), -1);
    expect(ERR_SERVICE_REMOVE, "Failed to remove share of service web");
    EXPECT_EQ(Setting("runweb"), "no") << "it is disabled all the same";

    std::filesystem::rename("/etc/tavoinfo.conf", "/etc/tavoinfo.conf.away");
    ASSERT_EQ(::mkdir("/etc/tavoinfo.conf", 0755), 0);
    ScriptCalls();
    EXPECT_EQ(TAVOServiceActionSet(17, TAVO_SERVICE_DISABLE), -1);
    expect(TLIBErrGet(), "TAVOINFOSetKeyValue failed with key=runsamba");
    EXPECT_THAT(ScriptCalls(), IsEmpty());
    std::filesystem::remove("/etc/tavoinfo.conf");
    std::filesystem::rename("/etc/tavoinfo.conf.away", "/etc/tavoinfo.conf");
}

TEST_F(Services, TheOldVolumeIsKeptAndAFullDeskHasNone)
{
    char volume[52];
    ASSERT_EQ(TAVOServiceSet(1, "/volume1"), 0);
    EXPECT_EQ(TAVOServiceNewVolumeDecide(1, volume, sizeof volume), 1) << "where the data lies";
    EXPECT_STREQ(volume, "/volume1");
    std::filesystem::remove_all("/volume1/web");
    EXPECT_EQ(TAVOServiceNewVolumeDecide(1, volume, sizeof volume), 2) << "the roomiest";

    for (const char *path : {"/volume1", "/volume2"})
        ::umount2(path, MNT_DETACH);
    test::ForgetFault();
    EXPECT_EQ(TAVOServiceNewVolumeDecide(1, volume, sizeof volume), 0);
    EXPECT_EQ(test::LastFault(), (Fault{ERR_NO_SERVICE_VOLUME, "service_new_volume_decide"}));
    ScriptCalls();
    EXPECT_EQ(TAVOServiceActionSet(0, TAVO_SERVICE_ENABLE), -1);
    EXPECT_EQ(Setting("runweb"), "no") << "nothing was switched";
    EXPECT_THAT(ScriptCalls(), IsEmpty());
}

// A folder at the path of an unmounted volume is on the system's disk.
TEST_F(Services, AnUnmountedVolumeIsNeverChosenAndIsLoggedWhenNamed)
{
    std::filesystem::create_directory("/volume7");
    test::ForgetFault();
    EXPECT_EQ(TAVOServiceSet(1, "/volume7"), 0) << "callers bind before they mount";
    EXPECT_EQ(TLIBErrGet(), ERR_SUCCESS);
    EXPECT_THAT(log_.Texts(), testing::Contains(testing::MatchesRegex(
                                  "service_set:[0-9]+ /volume7 is not mounted: /volume7/web is on the system disk")));

    char volume[52];
    ASSERT_EQ(LinkTarget("/var/services/web"), "/volume7/web");
    EXPECT_EQ(TAVOServiceNewVolumeDecide(1, volume, sizeof volume), 2);
    EXPECT_STREQ(volume, "/volume2");
    std::filesystem::remove_all("/volume7");
}

TEST_F(Services, AVolumeGoesAndComesBack)
{
    ASSERT_EQ(TAVOServiceActionSet(0, TAVO_SERVICE_ENABLE), 0);
    ASSERT_TRUE(test::IsUp(0));
    ASSERT_EQ(::umount2("/volume2", MNT_DETACH), 0);
    EXPECT_EQ(TAVOServiceStatusGet(0), 0) << "its data is away";
    TAVOSERVICESHARE share;
    EXPECT_EQ(TAVOServiceSettingGet(1, &share), 0);
    EXPECT_EQ(TAVOServiceIsOnVolume(1, "/volume2"), 1) << "that is where it belongs";
    EXPECT_EQ(TAVOServiceIsOnVolume(1, "/volume1"), 0);

    ASSERT_EQ(::mount("tmpfs", "/volume2", "tmpfs", 0, "size=8m"), 0);
    ASSERT_EQ(::mkdir("/volume2/web", 0755), 0);
    char volume[52];
    EXPECT_EQ(TAVOServiceDataSearch(1, volume, sizeof volume), 2);
    ScriptCalls();
    log_.Clear();
    EXPECT_EQ(TAVOServiceRestore("/volume1"), 0);
    EXPECT_THAT(ScriptCalls(), IsEmpty()) << "none has a folder there";
    EXPECT_EQ(TAVOServiceRestore("/volume2"), 1);
    EXPECT_THAT(ScriptCalls(), ElementsAre("S97apache-user.sh start"));
    EXPECT_TRUE(test::IsUp(0));
    EXPECT_THAT(log_.Texts(), IsEmpty());
    ASSERT_EQ(TAVOServiceActionSet(0, TAVO_SERVICE_STOP), 0);
    test::WriteFile("/var/standin/httpd-user.mode", "dies\n");
    EXPECT_EQ(TAVOServiceRestore("/volume2"), 1) << "bound, but not started";
    EXPECT_THAT(log_.Texts(),
                testing::Contains(testing::MatchesRegex("service_restore:[0-9]+ Failed to start service web")));
    EXPECT_EQ(Setting("runweb"), "yes");

    EXPECT_EQ(TAVOServiceRemovebyVolume("/volume2", 0), 0);
    EXPECT_EQ(LinkTarget("/var/services/web"), "");
    EXPECT_TRUE(std::filesystem::exists("/volume2/web"));
}

// A share that was not recorded yet is added. After a success the error state still holds the caller's own code.
TEST_F(Services, SuccessLeavesTheErrorStateAlone)
{
    for (const int id : {0, 1, 3, 7, 8, 10, 11}) {
        TLIBErrSet(ERR_ACCESS_DENIED);
        EXPECT_EQ(TAVOServiceActionSet(id, TAVO_SERVICE_ENABLE), 0) << id;
        EXPECT_THAT(TLIBErrGet(), testing::AnyOf(ERR_ACCESS_DENIED, ERR_SUCCESS)) << id;
    }
}

// A zombie keeps its pid until its parent asks for the status: it is not a running daemon.
TEST(ServiceStatus, DoesNotCountTheDead)
{
    if (test::RootLacks("proc"))
        GTEST_SKIP() << "no /proc here";
    const pid_t daemon = ::fork();
    if (daemon == 0) {
        ::prctl(PR_SET_NAME, "crond");
        ::_exit(0);
    }
    siginfo_t info;
    ASSERT_EQ(::waitid(P_PID, static_cast<id_t>(daemon), &info, WEXITED | WNOWAIT), 0);
    EXPECT_EQ(TAVOServiceStatusGet(21), 0) << "found by its name";
    test::WriteFile("/var/run/tavologd.pid", std::to_string(daemon) + "\n");
    EXPECT_EQ(TAVOServiceStatusGet(29), 0) << "found by its pid file";
    EXPECT_EQ(::waitpid(daemon, nullptr, 0), daemon);
}

// The links' folder is open to everybody on some appliances: a file in place of a link may be a trap.
TEST_F(Services, OnlyALinkIsReplaced)
{
    std::filesystem::create_directories("/var/services");
    ASSERT_EQ(::mkdir("/var/services/web", 0755), 0);
    test::WriteFile("/var/services/web/precious", "x");
    EXPECT_EQ(FaultOf(TAVOServiceLinkSet(1, "/volume1/web")), (Fault{ERR_UNKNOWN, "service_volume_getby_link"}));
    EXPECT_EQ(FaultOf(TAVOServiceLinkRemove(1)), (Fault{ERR_REMOVE_FAILED, "service_link_remove"}));
    EXPECT_EQ(test::ReadFile("/var/services/web/precious"), "x");

    // No link can be below a file, so there is none to remove.
    std::filesystem::rename("/var/services", "/var/services.kept");
    test::WriteFile("/var/services", "");
    for (const mode_t left : {S_IFLNK, S_IFREG}) {
        test::FillStack(left);
        EXPECT_EQ(TAVOServiceLinkRemove(1), 0);
    }
    std::filesystem::remove("/var/services");
    std::filesystem::rename("/var/services.kept", "/var/services");

    ASSERT_EQ(::mkdir("/volume1/elsewhere", 0755), 0);
    ASSERT_EQ(::symlink("/volume1/elsewhere", "/volume1/photo"), 0);
    EXPECT_EQ(FaultOf(TAVOServiceShareCreate(2, "/volume1")), (Fault{ERR_MKDIR_FAILED, "service_share_create"}))
        << "a link of another user is not a data folder";

    ASSERT_EQ(TAVOServiceSet(5, "/volume1"), 0);
    ASSERT_EQ(::symlink("/volume1/elsewhere", "/volume1/video/link"), 0);
    test::WriteFile("/volume1/elsewhere/kept", "x");
    EXPECT_EQ(TAVOServiceRemove(5, 1), 0);
    EXPECT_FALSE(std::filesystem::exists("/volume1/video"));
    EXPECT_EQ(test::ReadFile("/volume1/elsewhere/kept"), "x");
}

// A folder that another enabled service uses stays bound, for a caller's copy of the row as for the row itself.
TEST_F(Services, SharedFoldersAreReleasedByTheLast)
{
    ASSERT_EQ(TAVOServiceActionSet(5, TAVO_SERVICE_ENABLE), 0);
    ASSERT_EQ(TAVOServiceActionSet(6, TAVO_SERVICE_ENABLE), 0);
    const TAVOSERVICE audio = *TAVOServiceInfoGet(5);
    EXPECT_EQ(TAVOServiceRemovebyInfo(&audio, 0), 0);
    EXPECT_EQ(LinkTarget("/var/services/music"), "/volume2/music") << "the other plays on";
    ASSERT_EQ(TAVOServiceActionSet(6, TAVO_SERVICE_KEY_NO), 0);
    EXPECT_EQ(TAVOServiceRemovebyInfo(&audio, 0), 0);
    EXPECT_EQ(LinkTarget("/var/services/music"), "");
}

TEST_F(Services, TheRecordHasTheCapabilityAndTheFolder)
{
    const struct {
        int id;
        const char *key, *value;
        int supported;
    } cases[] = {
        {1, "supportweb", "YES", 1},
        {1, "supportweb", "no", 0},
        {1, "supportweb", "yes, very much", 0},
        {3, "netbkp", "yes", 1},  // this key has no "support" prefix
        {9, "supportsurveillance", "no", 0},
    };
    TAVOSERVICESHARE share;
    for (const auto &row : cases) {
        ASSERT_EQ(TLIBFileSetKeyValue("/etc.defaults/tavoinfo.conf", row.key, row.value, nullptr), 1);
        ASSERT_EQ(TAVOServiceSettingGet(row.id, &share), 0);
        EXPECT_EQ(share.fSupported, row.supported) << row.key << "=" << row.value;
    }
    // Any one of a folder's keys is enough; some folders need none.
    for (const char *key : {"supportmediaservice", "support_audio", "supportitunes"})
        ASSERT_EQ(TLIBFileSetKeyValue("/etc.defaults/tavoinfo.conf", key, "no", nullptr), 1);
    TAVOServiceSettingGet(6, &share);
    EXPECT_EQ(share.fSupported, 0);
    ASSERT_EQ(TLIBFileSetKeyValue("/etc.defaults/tavoinfo.conf", "supportitunes", "yes", nullptr), 1);
    TAVOServiceSettingGet(6, &share);
    EXPECT_EQ(share.fSupported, 1);
    for (const int id : {8, 10, 11}) {
        TAVOServiceSettingGet(id, &share);
        EXPECT_EQ(share.fSupported, 1) << id;
    }

    // A link that leads outside the volumes is logged and not a failure; one to a remote volume is special.
    ASSERT_EQ(TAVOServiceLinkSet(1, "/nowhere/web"), 0);
    log_.Clear();
    TLIBErrSet(ERR_OPEN_FAILED);
    EXPECT_EQ(TAVOServiceSettingGet(1, &share), 0);
    EXPECT_EQ(TLIBErrGet(), ERR_SUCCESS) << "a link that leads anywhere clears the error";
    EXPECT_THAT(log_.Texts(), testing::ElementsAre(testing::MatchesRegex(
                                  "service_setting_get:[0-9]+ Failed to check volume type: path=\\[/nowhere\\], "
                                  "tavoerr=0x6000")));
    EXPECT_STREQ(share.szVolume, "/nowhere/web");
    EXPECT_STREQ(share.szVolumePath, "/nowhere");
    EXPECT_EQ(share.fOnVolume, 0);
    ::umount2("/volume1", MNT_DETACH);
    ASSERT_EQ(::mount("server:/export", "/volume1", "tmpfs", 0, nullptr), 0);
    ASSERT_EQ(TAVOServiceSet(1, "/volume1"), 0);
    EXPECT_EQ(TAVOServiceSettingGet(1, &share), 1);
    EXPECT_EQ(share.fOnVolume, 1);
    EXPECT_EQ(share.fSpecialVolume, 1);
}

TEST_F(Services, UserHomesAreCreatedOnceForEveryUser)
{
    ASSERT_EQ(::mkdir("/volume2/homes", 0755), 0);
    test::WriteFile("/volume2/homes/guest", "no folder");
    ASSERT_EQ(TAVOServiceActionSet(11, TAVO_SERVICE_ENABLE), 0);
    struct stat st;
    ASSERT_EQ(::stat("/var/services/homes/admin", &st), 0);
    EXPECT_EQ(st.st_mode & 07777, 0700u);
    EXPECT_EQ(st.st_uid, ::getpwnam("admin")->pw_uid);
    EXPECT_EQ(test::ReadFile("/volume2/homes/guest"), "no folder") << "whatever has the name stays";
    test::WriteFile("/volume2/homes/admin/diary", "x");
    ASSERT_EQ(TAVOServiceActionSet(11, TAVO_SERVICE_DISABLE), 0);
    ASSERT_EQ(TAVOServiceActionSet(11, TAVO_SERVICE_ENABLE), 0);
    EXPECT_EQ(test::ReadFile("/var/services/homes/admin/diary"), "x");
}

TEST_F(Services, AMissingLinkFolderIsCreated)
{
    std::filesystem::remove_all("/var/services");
    ::umask(022);
    ASSERT_EQ(TAVOServiceLinkSet(1, "/volume1/web"), 0);
    EXPECT_EQ(LinkTarget("/var/services/web"), "/volume1/web");
    struct stat st;
    ASSERT_EQ(::stat("/var/services", &st), 0);
    EXPECT_EQ(st.st_mode & 07777, 0755u);

    // Anything but a directory is replaced; a link to a directory counts as one.
    std::filesystem::remove_all("/var/services");
    test::WriteFile("/var/services", "a file");
    ASSERT_EQ(TAVOServiceLinkSet(1, "/volume1/web"), 0);
    std::filesystem::remove_all("/var/services");
    ASSERT_EQ(::mkdir("/volume1/links", 0755), 0);
    ASSERT_EQ(::symlink("/volume1/links", "/var/services"), 0);
    ASSERT_EQ(TAVOServiceLinkSet(1, "/volume1/web"), 0);
    EXPECT_EQ(LinkTarget("/volume1/links/web"), "/volume1/web");
    std::filesystem::remove("/var/services");

    log_.Clear();
    ASSERT_EQ(::mount("tmpfs", "/var", "tmpfs", MS_RDONLY, nullptr), 0);
    EXPECT_EQ(FaultOf(TAVOServiceLinkSet(1, "/volume1/web")), (Fault{ERR_MKDIR_FAILED, "service_link_set"}));
    ::umount2("/var", MNT_DETACH);
    EXPECT_THAT(log_.Texts(), testing::ElementsAre(testing::MatchesRegex(
                                  "service_link_set\\([0-9]+\\)Failed to mkdir : /var/services")));

    ASSERT_EQ(::mount("tmpfs", "/var", "tmpfs", 0, "nr_inodes=1"), 0);
    EXPECT_EQ(FaultOf(TAVOServiceLinkSet(1, "/volume1/web")), (Fault{ERR_NOT_ENOUGH_SPACE, "service_link_set"}));
    ::umount2("/var", MNT_DETACH);

    log_.Clear();
    EXPECT_EQ(FaultOf(TAVOServiceLinkSet(12, "/volume1/web")), (Fault{ERR_BAD_PARAMETERS, "service_setting_get"}));
    EXPECT_THAT(log_.Texts(), testing::ElementsAre(testing::MatchesRegex(
                                  "service_link_set\\([0-9]+\\)\\[D00\\] Failed to get service info : id = 12")));
}

// A status asks the settings for a plain "no"; any other value, or none, is a yes.
TEST(ServiceSTDStatus, IsEnabledUnlessTheKeySaysNo)
{
    const struct {
        const char *value;
        int on;
    } cases[] = {{"yes", 1}, {"no", 0}, {"NO", 1}, {"maybe", 1}, {nullptr, 1}};
    for (const auto &[value, on] : cases) {
        if (value) {
            ASSERT_EQ(TLIBFileSetKeyValue("/etc/tavoinfo.conf", "runfiledeck", value, nullptr), 1);
        } else {
            ASSERT_EQ(TLIBFileRemoveKey("/etc/tavoinfo.conf", "runfiledeck"), 1);
        }
        test::ForgetFault();
        EXPECT_EQ(TAVOServiceStatusGet(18), on) << (value ? value : "not there");
        EXPECT_EQ(TLIBErrGet(), ERR_SUCCESS);
    }

    // While another program holds the lock, the answer is unknown.
    {
        const test::OwnChild holder([] {
            ErrTLIBFileCloseLock();
            ErrTLIBFileLock(TAVO_LOCK_TAVOINFO | TAVO_LOCK_EXCLUSIVE, 0);
            test::WriteFile("/tmp/held", "");
            ::pause();
        });
        ASSERT_TRUE(test::Eventually([] { return std::filesystem::exists("/tmp/held"); }));
        EXPECT_EQ(TAVOServiceStatusGet(18), 0);
        EXPECT_EQ(TLIBErrGet(), ERR_LOCK_FAILED);
    }
    EXPECT_EQ(TAVOServiceStatusGet(18), 1);
}

TEST(ServiceVolumeGetbyLink, FollowsAndRefuses)
{
    const test::ScratchDir dir;
    char volume[52];
    char path[52];
    const std::string link = dir / "link";
    const auto follow = [&] {
        return TAVOServiceVolumeGetbyLink(link.c_str(), volume, sizeof volume, path, sizeof path);
    };

    test::ForgetFault();
    EXPECT_EQ(follow(), 0) << "no link";
    EXPECT_EQ(TLIBErrGet(), ERR_SUCCESS);
    ASSERT_EQ(::symlink("/nowhere/web", link.c_str()), 0);
    EXPECT_EQ(follow(), 0);
    EXPECT_STREQ(volume, "/nowhere/web");
    EXPECT_STREQ(path, "/nowhere");

    ::unlink(link.c_str());
    ASSERT_EQ(::mkdir((dir / "folder").c_str(), 0755), 0);
    ASSERT_EQ(::symlink("folder", link.c_str()), 0);
    EXPECT_EQ(follow(), 1) << "from wherever it is asked for";
    EXPECT_STREQ(volume, "folder");

    ::unlink(link.c_str());
    ASSERT_EQ(::symlink(("/" + std::string(60, 'x')).c_str(), link.c_str()), 0);
    EXPECT_EQ(FaultOf(follow()), (Fault{ERR_UNKNOWN, "service_volume_getby_link"}))
        << "cut, it would name another folder";
    EXPECT_STREQ(volume, "");
    ::unlink(link.c_str());
    test::WriteFile(link, "a file");
    EXPECT_EQ(FaultOf(follow()), (Fault{ERR_UNKNOWN, "service_volume_getby_link"}));
}

TEST(ServiceEnableGet, TakesYesInAnyCase)
{
    const struct {
        const char *value;
        int enabled;
    } rows[] = {{"yes", 1}, {"YES", 1}, {"no", 0}, {"1", 0}, {"yes and more", 0}};
    for (const auto &row : rows) {
        ASSERT_EQ(TLIBFileSetKeyValue("/etc/tavoinfo.conf", "runweb", row.value, nullptr), 1);
        EXPECT_EQ(TAVOServiceEnableGet(1), row.enabled) << row.value;
    }
    EXPECT_EQ(TAVOServiceEnableGet(8), 0) << "the spooler has no key";

    // The download scheduler has its own settings.
    test::CapturedLog log;
    ASSERT_EQ(TLIBFileSetKeyValue("/etc/tavoinfo.conf", "download_enabled", "yes", nullptr), 1);
    EXPECT_EQ(TAVOServiceEnableGet(4), 0);
    EXPECT_THAT(log.Texts(), testing::ElementsAre(testing::MatchesRegex(
                                 "service_enable_get\\([0-9]+\\)\\[900\\] Failed to get info of download deck")));
    // A scheduler that has never been configured has no such key.
    test::WriteFile("/usr/tavo/etc/download.conf", "other=yes\n");
    test::ForgetFault();
    test::FillStack("yes");
    EXPECT_EQ(TAVOServiceEnableGet(4), 0);
    EXPECT_EQ(TLIBErrGet(), ERR_SUCCESS);
    test::WriteFile("/usr/tavo/etc/download.conf", "download_enabled=Yes\n");
    EXPECT_EQ(TAVOServiceEnableGet(4), 1);
}

}  // namespace
