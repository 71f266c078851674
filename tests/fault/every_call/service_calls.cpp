// Services: two volumes, the web service bound to the first, and a pid file that names this process as its daemon.
#include "arguments.h"
#include "support/test.h"

#include <sys/mount.h>

namespace every_call {
namespace {

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

// An action handler, and a status handler.
#define HANDLER(name, row) CALL(name, kAnswers, Row(row), int{TAVO_SERVICE_ENABLE})
#define STATUS(name, row)  CALL(name, kAnswers, Row(row))

}  // namespace

Family ServiceFamily()
{
    return {
        "Services",
        {
            CALL(TAVONetService, kAnswers, TAVO_DAEMON_CRON | TAVO_DAEMON_MDNS, int{TAVO_DAEMON_START}),
            HANDLER(TAVOServiceAFP, "afp"),
            STATUS(TAVOServiceAFPStatus, "afp"),
            CALL(TAVOServiceActionSet, kSteps, 0, int{TAVO_SERVICE_ENABLE}),
            HANDLER(TAVOServiceAudio, "audio"),
            CALL(TAVOServiceDaemonGet, 0, "photo"),
            CALL(TAVOServiceDaemonIDGet, 0, 0),
            CALL(TAVOServiceDataSearch, kAnswers, 1, Text<52>(), 52),
            CALL(TAVOServiceDisableSet, 0, 1),
            CALL(TAVOServiceEnableGet, kAnswers, 4),
            STATUS(TAVOServiceFTPStatus, "ftp"),
            CALL(TAVOServiceGetAll, kAnswers, ListOf({})),
            CALL(TAVOServiceGetbyVolume, kAnswers, kVolumes[0], ListOf({})),
            HANDLER(TAVOServiceHTTPS, "https"),
            CALL(TAVOServiceIndexGet, 0, "DB"),
            CALL(TAVOServiceInfoGet, 0, 0),
            CALL(TAVOServiceIsOnVolume, kAnswers, 1, kVolumes[0]),
            CALL(TAVOServiceKeyGet, 0, 0),
            CALL(TAVOServiceLinkRemove, 0, 1),
            CALL(TAVOServiceLinkSet, 0, 1, "/volume2/web"),
            CALL(TAVOServiceNameGet, 0, 0),
            HANDLER(TAVOServiceNetBkp, "netbkp"),
            CALL(TAVOServiceNewVolumeDecide, kAnswers, 2, Text<52>(), 52),
            CALL(TAVOServiceOnOffALL, kAnswers, 0),
            STATUS(TAVOServicePrinterStatus, "printer"),
            CALL(TAVOServiceProcGet, 0, 0),
            CALL(TAVOServiceRemove, 0, 1, 0),
            CALL(TAVOServiceRemoveAll, kAnswers, 0),
            CALL(TAVOServiceRemovebyID, 0, 0, 0),
            CALL(TAVOServiceRemovebyInfo, 0, Row("web"), 0),
            CALL(TAVOServiceRemovebyVolume, kAnswers, kVolumes[0], 0),
            CALL(TAVOServiceRestartfromVolumeNone, kAnswers),
            CALL(TAVOServiceRestore, kAnswers, kVolumes[0]),
            HANDLER(TAVOServiceSAMBA, "samba"),
            HANDLER(TAVOServiceSSH, "ssh"),
            STATUS(TAVOServiceSSHStatus, "ssh"),
            CALL(TAVOServiceSTDAction, 0, Row("photo"), int{TAVO_SERVICE_ENABLE}),
            CALL(TAVOServiceSTDStatus, kAnswers, Row("web")),
            CALL(TAVOServiceScriptGet, 0, 0),
            CALL(TAVOServiceSet, 0, 2, kVolumes[1]),
            CALL(TAVOServiceSettingGet, kAnswers, 1, Var<TAVOSERVICESHARE>()),
            CALL(TAVOServiceShareCreate, 0, 2, kVolumes[1]),
            CALL(TAVOServiceShareGen, 0, 1, kVolumes[1], Text<128>(), 128),
            CALL(TAVOServiceShareIDGet, 0, 0),
            CALL(TAVOServiceShareIsEmpty, 0, 1),
            CALL(TAVOServiceShareRemove, 0, 1, 0),
            CALL(TAVOServiceShareUpdate, 0, 1, kVolumes[1]),
            CALL(TAVOServiceStatusGet, kAnswers, 0),
            HANDLER(TAVOServiceTelnet, "telnet"),
            STATUS(TAVOServiceTelnetStatus, "telnet"),
            CALL(TAVOServiceThirdPartyAll, kAnswers, "start"),
            CALL(TAVOServiceTypeGet, 0, 0),
            CALL(TAVOServiceUserHome, kAnswers | kHolds, Row("userhome"), int{TAVO_SERVICE_ENABLE}),
            CALL(TAVOServiceVolumeChange, 0, 2, kVolumes[1]),
            CALL(TAVOServiceVolumeGetbyLink, kAnswers, "/var/services/web", Text<52>(), 52, Text<52>(), 52),
            CALL(TAVOServiceVolumeGetbyShare, 0, "web", Text<52>(), 52),
            HANDLER(TAVOServiceiTunes, "itunes"),
            STATUS(TAVOServiceiTunesStatus, "itunes"),
        },
        [] { return std::make_shared<Services>(); },
        {"/etc", "/usr/tavo/etc", "/var/services", "/volume1", "/volume2"},
    };
}

}  // namespace every_call
