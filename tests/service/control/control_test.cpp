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

using test::LinkTarget;
using test::Services;
using test::WriteFile;
using testing::ElementsAre;

namespace {

using ServiceLookUps = test::Switched;
using NetService = test::Switched;
using ServiceStatus = test::Switched;

// The empty row that ends the table is a row: every look-up accepts it.
TEST_F(ServiceLookUps, RowsAndRefusals)
{
    TELL(TAVOServiceIndexGet("DB"));
    TELL(TAVOServiceIndexGet("db"));
    EXPECT_NE(TAVOServiceInfoGet(30), nullptr);
    TELL(TAVOServiceNameGet(30));
    TELL(TAVOServiceScriptGet(30));
    TELL(TAVOServiceKeyGet(30));
    TELL(TAVOServiceProcGet(30));
    TELL(TAVOServiceDaemonIDGet(30));
    TELL(*TAVOServiceShareIDGet(30));
    TELL(TAVOServiceActionSet(30, TAVO_SERVICE_START));
    std::string types;
    for (int id = 0; id <= 30; ++id)
        types += std::to_string(TAVOServiceTypeGet(id)) + " ";
    story_.Show("types", types);
    for (const char *name : {"web", "netbackup", "SURVEILLANCE", "photo", "Video", "music", "homes", ""}) {
        story_.Head(name);
        TELL(TAVOServiceDaemonGet(name));
    }
}

TEST_F(NetService, DrivesDaemonsInItsOwnOrder)
{
    TELL(TAVONetService(~TAVO_DAEMON_DATABASE, TAVO_DAEMON_START));
    TELL(test::IsUp(21));
    TELL(TAVONetService(TAVO_DAEMON_CRON, TAVO_DAEMON_STOP));
    EXPECT_TRUE(test::Eventually([] { return TAVOServiceStatusGet(21) == 0; }));
    EXPECT_EQ(rgslckList[0].nRef, 0) << "no lock is left";
    // A daemon that fails is missing in the answer; the others are still driven.
    WriteFile("/var/standin/S80samba.sh.status", "3\n");
    TELL(TAVONetService(TAVO_DAEMON_SMB | TAVO_DAEMON_CRON, TAVO_DAEMON_START));
    TELL(TAVONetService(TAVO_DAEMON_RESTORE, TAVO_DAEMON_START));
}

TEST_F(NetService, DrivesDaemonsOfTheDatabaseStackOnce)
{
    TELL(TAVONetService(TAVO_DAEMON_DATABASE, TAVO_DAEMON_START));
    TELL(TAVONetService(TAVO_DAEMON_DATABASE | TAVO_DAEMON_MEDIA | TAVO_DAEMON_PLAYER | TAVO_DAEMON_INDEX |
                            TAVO_DAEMON_DOWNLOAD | TAVO_DAEMON_SURVEILLANCE,
                        TAVO_DAEMON_START));
    TELL(TAVONetService(TAVO_DAEMON_DATABASE, TAVO_DAEMON_STOP));
}

TEST_F(NetService, RestartsTheWebServersAroundEachOther)
{
    const uint32_t both = TAVO_DAEMON_WEB_SYSTEM | TAVO_DAEMON_WEB_USER;
    TELL(TAVONetService(TAVO_DAEMON_WEB_SYSTEM, TAVO_DAEMON_START));  // the highest bit would make the result a failure
    for (const int operation : {TAVO_DAEMON_RESTART, TAVO_DAEMON_START, TAVO_DAEMON_STOP, TAVO_DAEMON_RELOAD})
        TELL(TAVONetService(both, operation));
    // The user's server fails alone; or it is stopped, and not started again.
    WriteFile("/var/standin/S97apache-user.sh.status", "3\n");
    TELL(TAVONetService(both, TAVO_DAEMON_RESTART));
    std::filesystem::remove("/var/standin/S97apache-user.sh.status");
    WriteFile("/var/standin/httpd-user.mode", "dies\n");
    TELL(TAVONetService(both, TAVO_DAEMON_RESTART));
}

TEST_F(NetService, ReloadsBySignal)
{
    // Without the system's web server, which is not asked together with the user's.
    const uint32_t mask = ~(TAVO_DAEMON_DATABASE | TAVO_DAEMON_WEB_SYSTEM);
    ASSERT_EQ(TLIBFileSetKeyValue("/etc/tavoinfo.conf", "runafp", "yes", nullptr), 1);
    TELL(TAVONetService(mask, TAVO_DAEMON_RELOAD));  // nothing runs
    ASSERT_GT(TAVONetService(mask & ~TAVO_DAEMON_NFS, TAVO_DAEMON_START), 0);
    TELL(TAVONetService(mask, TAVO_DAEMON_RELOAD));
    for (const char *daemon :
         {"httpd-user", "smbd", "nmbd", "afpd", "papd", "ftpd", "crond", "httpd-webdav", "dms", "iscsi_trgt"}) {
        const std::string log = std::string("/var/standin/") + daemon + ".log";
        EXPECT_TRUE(test::Eventually([&] { return test::ReadFile(log).find("signal 1\n") != std::string::npos; }))
            << daemon;
    }
    // The server reports itself running only while it is enabled.
    ASSERT_EQ(TLIBFileSetKeyValue("/etc/tavoinfo.conf", "runafp", "no", nullptr), 1);
    EXPECT_EQ(TAVONetService(TAVO_DAEMON_AFP, TAVO_DAEMON_RELOAD), 0);

    TELL(TAVONetService(TAVO_DAEMON_NFS, TAVO_DAEMON_RELOAD));  // the server does not run: nothing to export again
    TELL(TAVONetService(TAVO_DAEMON_NFS, TAVO_DAEMON_START));
    test::Scenario scenario;
    scenario.Expect({"/usr/sbin/exportfs", "-ra"}).Exits(0);
    TELL(TAVONetService(TAVO_DAEMON_NFS, TAVO_DAEMON_RELOAD));
}

// A reload trusts no pid file with anything but one number in it, and none that another user could have written: it
// would signal other processes, or all of them.
TEST_F(NetService, IgnoresHostilePidFiles)
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
            WriteFile(pid_file, text);
            expect_no_signal();
        }
        // Another user's file, and a link to one.
        WriteFile(pid_file, other + "\n");
        ASSERT_EQ(::chown(pid_file, 1000, 1000), 0);
        expect_no_signal();
        std::filesystem::remove(pid_file);
        ASSERT_EQ(::symlink("/tmp/elsewhere.pid", pid_file), 0);
        WriteFile("/tmp/elsewhere.pid", other + "\n");
        expect_no_signal();
        std::filesystem::remove(pid_file);
        ASSERT_EQ(::mkfifo(pid_file, 0600), 0);
        expect_no_signal();
        std::filesystem::remove(pid_file);
        EXPECT_THAT(test::ReadFile("/var/standin/" + name + ".log"), testing::Not(testing::HasSubstr("signal 1\n")));
    }
}

// Start scripts run under the dispatcher's locks: one that takes them waits for its own time-out, and no longer.
TEST_F(NetService, ScriptThatLocksFailsInTime)
{
    WriteFile("/var/standin/S04crond.sh.hook", "#!/bin/sh\nexec tavoctl service status samba\n", 0755);
    const time_t before = ::time(nullptr);
    EXPECT_EQ(TAVONetService(TAVO_DAEMON_CRON | TAVO_DAEMON_MDNS, TAVO_DAEMON_START),
              static_cast<int>(TAVO_DAEMON_MDNS))
        << "those that follow are driven all the same";
    EXPECT_GE(::time(nullptr) - before, 4);
    EXPECT_LE(::time(nullptr) - before, 60);
    std::filesystem::remove("/var/standin/S04crond.sh.hook");
    EXPECT_EQ(TAVONetService(TAVO_DAEMON_CRON, TAVO_DAEMON_START), static_cast<int>(TAVO_DAEMON_CRON));
}

TEST_F(NetService, TwoProcessesNeverInterleave)
{
    for (const char *script : {"S04crond.sh", "S99mDNS.sh"})
        WriteFile(std::string("/var/standin/") + script + ".hook", "#!/bin/sh\nsleep 0.03\n", 0755);
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
    TELL(TAVOServiceActionSet(4, TAVO_SERVICE_ENABLE));
    TELL(TAVOServiceActionSet(7, TAVO_SERVICE_ENABLE));
    TELL(TAVOServiceActionSet(3, TAVO_SERVICE_ENABLE));
    TELL(Folder(7));  // the database folders stand one level deeper
    TELL(Answer(TAVOServiceVolumeGetbyShare, "photo"));
    TELL(Answer(TAVOServiceVolumeGetbyShare, "nobody"));
    // The media server still needs the photos: disabling the photo service leaves them bound.
    TELL(TAVOServiceActionSet(1, TAVO_SERVICE_ENABLE));
    TELL(TAVOServiceActionSet(1, TAVO_SERVICE_DISABLE));

    std::filesystem::remove("/usr/tavo/etc/share.conf");
    std::filesystem::create_directory("/usr/tavo/etc/share.conf");
    TELL(Answer(TAVOServiceVolumeGetbyShare, "photo"));
}

// A server finds its folders when it starts.
TEST_F(Services, FoldersAreBoundInOrderBeforeTheServerStarts)
{
    WriteFile("/var/standin/S86tavodms.sh.hook",
              "#!/bin/sh\ngrep '^\\[' /usr/tavo/etc/share.conf >/volume1/bound\n"
              "for link in music video photo; do readlink /var/services/$link >>/volume1/bound; done\n",
              0755);
    TELL(TAVOServiceActionSet(4, TAVO_SERVICE_ENABLE));
}

// A failure is logged in one line and ends the action.
TEST_F(Services, LogsEachFailedStepOfAnAction)
{
    WriteFile("/volume2/web", "no folder");
    TELL(TAVOServiceActionSet(0, TAVO_SERVICE_ENABLE));
    std::filesystem::remove("/volume2/web");
    // The daemon fails after the key has been written.
    WriteFile("/var/standin/S97apache-user.sh.status", "3\n");
    TELL(TAVOServiceActionSet(0, TAVO_SERVICE_ENABLE));
    std::filesystem::remove("/var/standin/S97apache-user.sh.status");

    // A script of its own may fail, but not die.
    for (const int id : {13, 14}) {
        const std::string script = id == 13 ? "/var/standin/S03inetd.sh" : "/var/standin/S95sshd.sh";
        WriteFile(script + ".hook", "#!/bin/sh\nkill -9 $PPID\n", 0755);
        TELL(TAVOServiceActionSet(id, TAVO_SERVICE_START));
        WriteFile(script + ".status", "3\n");
        std::filesystem::remove(script + ".hook");
        TELL(TAVOServiceActionSet(id, TAVO_SERVICE_START));
    }

    std::filesystem::remove("/var/services/web");
    ASSERT_EQ(::mkdir("/var/services/web", 0755), 0);
    TELL(TAVOServiceActionSet(0, TAVO_SERVICE_DISABLE));  // it is disabled nevertheless

    std::filesystem::rename("/etc/tavoinfo.conf", "/etc/tavoinfo.conf.away");
    ASSERT_EQ(::mkdir("/etc/tavoinfo.conf", 0755), 0);
    TELL(TAVOServiceActionSet(17, TAVO_SERVICE_DISABLE));
    TELL(TAVOServiceActionSet(13, TAVO_SERVICE_DISABLE));
    std::filesystem::remove("/etc/tavoinfo.conf");
    std::filesystem::rename("/etc/tavoinfo.conf.away", "/etc/tavoinfo.conf");
}

// A folder at the path of an unmounted volume is on the system's disk.
TEST_F(Services, TheDataAndThenTheRoomDecideTheVolume)
{
    TELL(TAVOServiceSet(1, "/volume1"));
    TELL(Answer(TAVOServiceNewVolumeDecide, 1));  // where the data is
    std::filesystem::remove_all("/volume1/web");
    TELL(Answer(TAVOServiceNewVolumeDecide, 1));  // the roomiest

    std::filesystem::create_directory("/volume7");
    TELL(TAVOServiceSet(1, "/volume7"));  // callers bind before they mount
    TELL(Answer(TAVOServiceNewVolumeDecide, 1));
    std::filesystem::remove_all("/volume7");

    // Full to its last byte, or read-only, a volume has no room.
    for (const char *volume : {"/volume2", "/volume1"}) {
        ASSERT_EQ(::mount(nullptr, volume, nullptr, MS_REMOUNT | MS_RDONLY, nullptr), 0);
        TELL(Answer(TAVOServiceNewVolumeDecide, 1));
    }
    for (const char *volume : {"/volume1", "/volume2"})
        ::umount2(volume, MNT_DETACH);
    TELL(Answer(TAVOServiceNewVolumeDecide, 1));
    TELL(TAVOServiceActionSet(0, TAVO_SERVICE_ENABLE));  // nothing is switched
}

TEST_F(Services, AVolumeGoesAndComesBack)
{
    TELL(TAVOServiceActionSet(0, TAVO_SERVICE_ENABLE));
    TELL(test::IsUp(0));
    ASSERT_EQ(::umount2("/volume2", MNT_DETACH), 0);
    TELL(TAVOServiceStatusGet(0));
    TELL(Folder(1));
    TELL(TAVOServiceIsOnVolume(1, "/volume2"));  // that is where it belongs
    TELL(TAVOServiceIsOnVolume(1, "/volume1"));

    ASSERT_TRUE(Mount("/volume2") && ::mkdir("/volume2/web", 0755) == 0);
    ASSERT_EQ(::mkdir("/volume2/photo", 0755), 0);  // of a service that is off
    TELL(Answer(TAVOServiceDataSearch, 1));
    TELL(TAVOServiceRestore("/volume1"));  // none has a folder there
    TELL(TAVOServiceRestore("/volume2"));
    TELL(test::IsUp(0));
    ASSERT_EQ(TAVOServiceActionSet(0, TAVO_SERVICE_STOP), 0);
    WriteFile("/var/standin/httpd-user.mode", "dies\n");
    TELL(TAVOServiceRestore("/volume2"));  // bound, but not started
    TELL(TAVOServiceRemovebyVolume("/volume2", 0));
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
TEST_F(ServiceStatus, DoesNotCountTheDead)
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
    WriteFile("/var/run/tavologd.pid", std::to_string(daemon) + "\n");
    EXPECT_EQ(TAVOServiceStatusGet(29), 0) << "found by its pid file";
    EXPECT_EQ(::waitpid(daemon, nullptr, 0), daemon);
}

// The links' folder is open to everybody on some appliances: a file in place of a link may be a trap.
TEST_F(Services, OnlyALinkIsReplaced)
{
    std::filesystem::create_directories("/var/services/web");
    WriteFile("/var/services/web/precious", "x");
    TELL(TAVOServiceLinkSet(1, "/volume1/web"));
    TELL(TAVOServiceLinkRemove(1));
    EXPECT_EQ(test::ReadFile("/var/services/web/precious"), "x");

    // No link can be below a file, so there is none to remove.
    std::filesystem::rename("/var/services", "/var/services.kept");
    WriteFile("/var/services", "");
    for (const mode_t left : {S_IFLNK, S_IFREG}) {
        test::FillStack(left);
        EXPECT_EQ(TAVOServiceLinkRemove(1), 0);
    }
    std::filesystem::remove("/var/services");
    std::filesystem::rename("/var/services.kept", "/var/services");

    ASSERT_EQ(::mkdir("/volume1/elsewhere", 0755), 0);
    ASSERT_EQ(::symlink("/volume1/elsewhere", "/volume1/photo"), 0);
    TELL(TAVOServiceShareCreate(2, "/volume1"));  // a link of another user is not a data folder

    ASSERT_EQ(TAVOServiceSet(5, "/volume1"), 0);
    ASSERT_EQ(::symlink("/volume1/elsewhere", "/volume1/video/link"), 0);
    WriteFile("/volume1/elsewhere/kept", "x");
    TELL(TAVOServiceRemove(5, 1));
    EXPECT_EQ(test::ReadFile("/volume1/elsewhere/kept"), "x");
}

// A folder that another enabled service uses stays bound, for a caller's copy of the row as for the row itself.
TEST_F(Services, SharedFoldersAreReleasedByTheLast)
{
    ASSERT_EQ(TAVOServiceActionSet(5, TAVO_SERVICE_ENABLE), 0);
    ASSERT_EQ(TAVOServiceActionSet(6, TAVO_SERVICE_ENABLE), 0);
    const TAVOSERVICE audio = *TAVOServiceInfoGet(5);
    TELL(TAVOServiceRemovebyInfo(&audio, 0));
    TELL(TAVOServiceActionSet(6, TAVO_SERVICE_KEY_NO));
    TELL(TAVOServiceRemovebyInfo(&audio, 0));
}

TEST_F(Services, TheRecordHasTheCapabilityAndTheFolder)
{
    const struct {
        int id;
        const char *key, *value;
    } rows[] = {
        {1, "supportweb", "YES"},
        {1, "supportweb", "no"},
        {1, "supportweb", "yes, very much"},
        {3, "netbkp", "yes"},  // this key has no "support" prefix
        {9, "supportsurveillance", "no"},
        {6, "supportmediaservice", "no"},  // any one of a folder's keys is enough
        {6, "support_audio", "no"},
        {6, "supportitunes", "no"},
        {6, "supportitunes", "yes"},
    };
    for (const auto &row : rows) {
        ASSERT_EQ(TLIBFileSetKeyValue("/etc.defaults/tavoinfo.conf", row.key, row.value, nullptr), 1);
        story_.Head(std::string(row.key) + "=" + row.value);
        TELL(Folder(row.id));
    }
    for (int id = 1; id < TAVO_SERVICE_SHARE_END; ++id)
        TELL(Folder(id));

    // A link that leads outside the volumes is logged and not a failure; one to a remote volume is special.
    ASSERT_EQ(TAVOServiceLinkSet(1, "/nowhere/web"), 0);
    TELL(Folder(1));
    TLIBErrSet(ERR_OPEN_FAILED);
    Folder(1);
    EXPECT_EQ(TLIBErrGet(), ERR_SUCCESS) << "a link that leads anywhere clears the error";
    ::umount2("/volume1", MNT_DETACH);
    ASSERT_EQ(::mount("server:/export", "/volume1", "tmpfs", 0, nullptr), 0);
    TELL(TAVOServiceSet(1, "/volume1"));
    TELL(Folder(1));
}

TEST_F(Services, UserHomesAreCreatedOnceForEveryUser)
{
    ASSERT_EQ(::mkdir("/volume2/homes", 0755), 0);
    WriteFile("/volume2/homes/guest", "no folder");
    TELL(TAVOServiceActionSet(11, TAVO_SERVICE_ENABLE));
    struct stat st;
    ASSERT_EQ(::stat("/var/services/homes/admin", &st), 0);
    EXPECT_EQ(st.st_mode & 07777, 0700u);
    EXPECT_EQ(st.st_uid, ::getpwnam("admin")->pw_uid);
    EXPECT_EQ(test::ReadFile("/volume2/homes/guest"), "no folder") << "whatever has the name stays";
    WriteFile("/volume2/homes/admin/diary", "x");
    TELL(TAVOServiceActionSet(11, TAVO_SERVICE_DISABLE));
    TELL(TAVOServiceActionSet(11, TAVO_SERVICE_ENABLE));
    EXPECT_EQ(test::ReadFile("/var/services/homes/admin/diary"), "x");
    std::filesystem::remove_all("/volume2/homes/admin");
    ASSERT_EQ(::mount(nullptr, "/volume2", nullptr, MS_REMOUNT | MS_RDONLY, nullptr), 0);
    TELL(TAVOServiceUserHome(TAVOServiceInfoGet(11), TAVO_SERVICE_ENABLE));
}

TEST_F(Services, AMissingLinkFolderIsCreated)
{
    std::filesystem::remove_all("/var/services");
    ::umask(022);
    TELL(TAVOServiceLinkSet(1, "/volume1/web"));
    struct stat st;
    ASSERT_EQ(::stat("/var/services", &st), 0);
    EXPECT_EQ(st.st_mode & 07777, 0755u);

    // Anything but a directory is replaced; a link to a directory counts as one.
    std::filesystem::remove_all("/var/services");
    WriteFile("/var/services", "a file");
    TELL(TAVOServiceLinkSet(1, "/volume1/web"));
    std::filesystem::remove_all("/var/services");
    ASSERT_EQ(::mkdir("/volume1/links", 0755), 0);
    ASSERT_EQ(::symlink("/volume1/links", "/var/services"), 0);
    TELL(TAVOServiceLinkSet(1, "/volume1/web"));
    EXPECT_EQ(LinkTarget("/volume1/links/web"), "/volume1/web");
    std::filesystem::remove("/var/services");

    // A disk that cannot be written, and one that is full.
    ASSERT_EQ(::mount("tmpfs", "/var", "tmpfs", MS_RDONLY, nullptr), 0);
    TELL(TAVOServiceLinkSet(1, "/volume1/web"));
    ::umount2("/var", MNT_DETACH);
    ASSERT_EQ(::mount("tmpfs", "/var", "tmpfs", 0, "nr_inodes=1"), 0);
    TELL(TAVOServiceLinkSet(1, "/volume1/web"));
    ::umount2("/var", MNT_DETACH);
    TELL(TAVOServiceLinkSet(12, "/volume1/web"));
}

// A status asks the settings for a plain "no"; any other value, or none, is a yes.
TEST_F(ServiceStatus, IsEnabledUnlessTheKeySaysNo)
{
    for (const char *value : {"yes", "no", "NO", "maybe"}) {
        ASSERT_EQ(TLIBFileSetKeyValue("/etc/tavoinfo.conf", "runfiledeck", value, nullptr), 1);
        story_.Head(value);
        TELL(TAVOServiceStatusGet(18));
    }
    ASSERT_EQ(TLIBFileRemoveKey("/etc/tavoinfo.conf", "runfiledeck"), 1);
    TELL(TAVOServiceStatusGet(18));

    // While another program holds the lock, the answer is unknown.
    {
        const test::OwnChild holder([] {
            ErrTLIBFileCloseLock();
            ErrTLIBFileLock(TAVO_LOCK_TAVOINFO | TAVO_LOCK_EXCLUSIVE, 0);
            WriteFile("/tmp/held", "");
            ::pause();
        });
        ASSERT_TRUE(test::Eventually([] { return std::filesystem::exists("/tmp/held"); }));
        TELL(TAVOServiceStatusGet(18));
    }
    TELL(TAVOServiceStatusGet(18));
}

TEST_F(ServiceLookUps, FollowALink)
{
    const char *const link = "/tmp/link";
    std::filesystem::create_directory("/tmp/folder");
    const std::vector<std::string> targets = {"",  // none
                                              "/nowhere/web",
                                              "folder",
                                              "/volume1/@database/mysql",
                                              "/web",
                                              "/",
                                              "/" + std::string(50, 'x'),
                                              "/" + std::string(51, 'x')};  // cut, it would name another folder
    char volume[52], path[52];
    for (const std::string &target : targets) {
        std::filesystem::remove(link);
        if (!target.empty())
            std::filesystem::create_symlink(target, link);
        story_.Head(target);
        TELL(TAVOServiceVolumeGetbyLink(link, volume, sizeof volume, path, sizeof path));
        story_.Show("volume", volume);
        story_.Show("path", path);
    }
    std::filesystem::remove(link);
    WriteFile(link, "a file");
    TELL(TAVOServiceVolumeGetbyLink(link, volume, sizeof volume, path, sizeof path));
}

TEST_F(ServiceLookUps, EnabledIsYesInAnyCase)
{
    for (const char *value : {"yes", "YES", "no", "1", "yes and more"}) {
        ASSERT_EQ(TLIBFileSetKeyValue("/etc/tavoinfo.conf", "runweb", value, nullptr), 1);
        story_.Head(value);
        TELL(TAVOServiceEnableGet(1));
    }
    TELL(TAVOServiceEnableGet(8));  // the spooler has no key

    // The download scheduler has its own settings. One that has never been configured has no such key.
    ASSERT_EQ(TLIBFileSetKeyValue("/etc/tavoinfo.conf", "download_enabled", "yes", nullptr), 1);
    TELL(TAVOServiceEnableGet(4));
    for (const std::string line : {"other=yes", "download_enabled=Yes"}) {
        WriteFile("/usr/tavo/etc/download.conf", line + "\n");
        test::FillStack("yes");
        story_.Head(line);
        TELL(TAVOServiceEnableGet(4));
    }
}

}  // namespace
