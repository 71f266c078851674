// Services: two volumes, the web service bound to the first, and a pid file that names this process as its daemon.
#include "call.h"
#include "support/appliance_root.h"
#include "support/captured_log.h"
#include "support/container_text.h"
#include "support/scratch_dir.h"

#include <gtest/gtest.h>

#include <cerrno>
#include <cstring>
#include <filesystem>

#include <sys/mount.h>
#include <sys/stat.h>
#include <unistd.h>

namespace every_call {
namespace {

using test::MakeList;

constexpr const char *kVolumes[] = {"/volume1", "/volume2"};
constexpr const char *kPackages = "/usr/tavo/etc/rc.d/packages";

struct Services {
    Services()
    {
        const test::CapturedLog quiet;
        bool mounted = !test::RootLacks("mount");
        for (const char *volume : kVolumes) {
            ::mkdir(volume, 0755);
            mounted = mounted && ::mount("tmpfs", volume, "tmpfs", 0, "size=4m") == 0;
        }
        if (!mounted) {
            [] {
                GTEST_SKIP() << "volumes cannot be mounted here";
            }();
            return;
        }
        std::filesystem::create_directories("/var/run");
        test::WriteFile("/var/run/httpd-user.pid", std::to_string(::getpid()) + "\n");
        test::WriteFile("/usr/tavo/etc/download.conf", "download_enabled=yes\n");
        std::filesystem::create_directories(kPackages);
        test::WriteFile(std::string(kPackages) + "/10one.sh", "#!/bin/sh\n", 0755);
        EXPECT_EQ(TAVOServiceSet(1, kVolumes[0]), 0);
        EXPECT_EQ(TLIBFileSetKeyValue("/etc/tavoinfo.conf", "runweb", "yes", nullptr), 1);
        test::WriteFile("/volume1/web/page", "x");
    }
    ~Services()
    {
        for (const char *volume : kVolumes)
            ::umount2(volume, MNT_DETACH);
    }
};

const TAVOSERVICE *Row(const char *name)
{
    return TAVOServiceInfoGet(TAVOServiceIndexGet(name));
}

struct Found {
    TLIBSZLIST *list = MakeList({}).release();

    ~Found() { TLIBSzListFree(list); }
};

// An action handler, and a status handler.
#define ACTION(name, row) CALL(name, kAnswers, { run(f, Row(row), int{TAVO_SERVICE_ENABLE}); })
#define STATUS(name, row) CALL(name, kAnswers, { run(f, Row(row)); })

}  // namespace

Family ServiceFamily()
{
    return {
        "Services",
        {
            CALL(TAVONetService, kAnswers, { run(f, TAVO_DAEMON_CRON | TAVO_DAEMON_MDNS, int{TAVO_DAEMON_START}); }),
            ACTION(TAVOServiceAFP, "afp"),
            STATUS(TAVOServiceAFPStatus, "afp"),
            CALL(TAVOServiceActionSet, kSteps, { run(f, 0, int{TAVO_SERVICE_ENABLE}); }),
            ACTION(TAVOServiceAudio, "audio"),
            CALL(TAVOServiceDaemonGet, 0, { run(f, "photo"); }),
            CALL(TAVOServiceDaemonIDGet, 0, { run(f, 0); }),
            CALL(TAVOServiceDataSearch, kAnswers,
                 {
                     char volume[52] = "";
                     run(f, 1, volume, 52);
                 }),
            CALL(TAVOServiceDisableSet, 0, { run(f, 1); }),
            CALL(TAVOServiceEnableGet, kAnswers, { run(f, 4); }),
            STATUS(TAVOServiceFTPStatus, "ftp"),
            CALL(TAVOServiceGetAll, kAnswers,
                 {
                     Found found;
                     run(f, &found.list);
                 }),
            CALL(TAVOServiceGetbyVolume, kAnswers,
                 {
                     Found found;
                     run(f, kVolumes[0], &found.list);
                 }),
            ACTION(TAVOServiceHTTPS, "https"),
            CALL(TAVOServiceIndexGet, 0, { run(f, "DB"); }),
            CALL(TAVOServiceInfoGet, 0, { run(f, 0); }),
            CALL(TAVOServiceIsOnVolume, kAnswers, { run(f, 1, kVolumes[0]); }),
            CALL(TAVOServiceKeyGet, 0, { run(f, 0); }),
            CALL(TAVOServiceLinkRemove, 0, { run(f, 1); }),
            CALL(TAVOServiceLinkSet, 0, { run(f, 1, "/volume2/web"); }),
            CALL(TAVOServiceNameGet, 0, { run(f, 0); }),
            ACTION(TAVOServiceNetBkp, "netbkp"),
            CALL(TAVOServiceNewVolumeDecide, kAnswers,
                 {
                     char volume[52] = "";
                     run(f, 2, volume, 52);
                 }),
            CALL(TAVOServiceOnOffALL, kAnswers, { run(f, 0); }),
            STATUS(TAVOServicePrinterStatus, "printer"),
            CALL(TAVOServiceProcGet, 0, { run(f, 0); }),
            CALL(TAVOServiceRemove, 0, { run(f, 1, 0); }),
            CALL(TAVOServiceRemoveAll, kAnswers, { run(f, 0); }),
            CALL(TAVOServiceRemovebyID, 0, { run(f, 0, 0); }),
            CALL(TAVOServiceRemovebyInfo, 0, { run(f, Row("web"), 0); }),
            CALL(TAVOServiceRemovebyVolume, kAnswers, { run(f, kVolumes[0], 0); }),
            CALL(TAVOServiceRestartfromVolumeNone, kAnswers, { run(f); }),
            CALL(TAVOServiceRestore, kAnswers, { run(f, kVolumes[0]); }),
            ACTION(TAVOServiceSAMBA, "samba"),
            ACTION(TAVOServiceSSH, "ssh"),
            STATUS(TAVOServiceSSHStatus, "ssh"),
            CALL(TAVOServiceSTDAction, 0, { run(f, Row("photo"), int{TAVO_SERVICE_ENABLE}); }),
            CALL(TAVOServiceSTDStatus, kAnswers, { run(f, Row("web")); }),
            CALL(TAVOServiceScriptGet, 0, { run(f, 0); }),
            CALL(TAVOServiceSet, 0, { run(f, 2, kVolumes[1]); }),
            CALL(TAVOServiceSettingGet, kAnswers,
                 {
                     TAVOSERVICESHARE share = {};
                     run(f, 1, &share);
                 }),
            CALL(TAVOServiceShareCreate, 0, { run(f, 2, kVolumes[1]); }),
            CALL(TAVOServiceShareGen, 0,
                 {
                     char path[128] = "";
                     run(f, 1, kVolumes[1], path, 128);
                     run.Show(path);
                 }),
            CALL(TAVOServiceShareIDGet, 0, { run(f, 0); }),
            CALL(TAVOServiceShareIsEmpty, 0, { run(f, 1); }),
            CALL(TAVOServiceShareRemove, 0, { run(f, 1, 0); }),
            CALL(TAVOServiceShareUpdate, 0, { run(f, 1, kVolumes[1]); }),
            CALL(TAVOServiceStatusGet, kAnswers, { run(f, 0); }),
            ACTION(TAVOServiceTelnet, "telnet"),
            STATUS(TAVOServiceTelnetStatus, "telnet"),
            CALL(TAVOServiceThirdPartyAll, kAnswers, { run(f, "start"); }),
            CALL(TAVOServiceTypeGet, 0, { run(f, 0); }),
            CALL(TAVOServiceUserHome, kAnswers | kHolds, { run(f, Row("userhome"), int{TAVO_SERVICE_ENABLE}); }),
            CALL(TAVOServiceVolumeChange, 0, { run(f, 2, kVolumes[1]); }),
            CALL(TAVOServiceVolumeGetbyLink, kAnswers,
                 {
                     char volume[52] = "";
                     char path[52] = "";
                     run(f, "/var/services/web", volume, 52, path, 52);
                     run.Show(volume);
                 }),
            CALL(TAVOServiceVolumeGetbyShare, 0,
                 {
                     char volume[52] = "";
                     run(f, "web", volume, 52);
                     run.Show(volume);
                 }),
            ACTION(TAVOServiceiTunes, "itunes"),
            STATUS(TAVOServiceiTunesStatus, "itunes"),
        },
        [] { return std::make_shared<Services>(); },
        {"/etc", "/usr/tavo/etc", "/var/services", "/volume1", "/volume2"},
    };
}

}  // namespace every_call
