// Runs the command that stops, starts, restarts or reloads one daemon of the dispatcher.
#include "service/detail/daemon_control.h"

#include "tavo_appliance.h"
#include "tavo_proc.h"
#include "tavo_service.h"

#include "core/detail/pid_file.h"
#include "core/detail/run_command.h"
#include "service/detail/process_named.h"
#include "service/detail/service_table.h"

#include <csignal>
#include <cstring>

#define RC_D "/usr/tavo/etc/rc.d/"

namespace tavo {
namespace {

constexpr int kAfpService = 16;

// The commands put the text of a pid file on a command line, so it must be one plain number before they run: "-1" would
// signal every process of the appliance.
bool RunIfPidFileIsSound(const char *pid_file, const char *command)
{
    return ReadPidFile(pid_file).value_or(0) > 0 && RunCommand(command) == 0;
}

bool ReloadAfp()
{
    if (TAVOServiceAFPStatus(&service_table[kAfpService]) != 1)
        return false;
    const bool told =
        RunIfPidFileIsSound("/var/run/afpd.pid", "/bin/kill -1 `cat /var/run/afpd.pid ` > /dev/null 2>&1");
    // The printing half of AFP has no pid file of its own; where no printer is shared it does not run.
    TLIBExec("/usr/bin/killall", "-HUP", "papd", nullptr);
    return told;
}

bool ReloadSmb()
{
    const bool names = TLIBProcSignalByPidFile("/var/run/nmbd.pid", SIGHUP) == 0;
    const bool files = TLIBProcSignalByPidFile("/var/run/smbd.pid", SIGHUP) == 0;
    return names && files;
}

bool ReloadFtp()
{
    return RunCommand("/usr/bin/killall -HUP ftpd > /dev/null 2>&1") == 0;
}

// The script's stop waits for open transfers; the dispatcher ends them. Stopping a stopped server succeeds.
bool StopFtp()
{
    return TLIBExec("/usr/bin/killall", "ftpd", nullptr) == 0 || !IsProcessNamed("ftpd");
}

bool ReloadWebUser()
{
    return RunIfPidFileIsSound("/var/run/httpd-user.pid", "/bin/kill -HUP `cat /var/run/httpd-user.pid`");
}

bool ReloadWebSystem()
{
    return RunIfPidFileIsSound("/var/run/httpd-sys.pid", "/bin/kill -HUP `cat /var/run/httpd-sys.pid`");
}

bool ReloadWebdav()
{
    return RunIfPidFileIsSound("/var/run/httpd-webdav.pid", "/bin/kill -1 `cat /var/run/httpd-webdav.pid`");
}

// The server is in the kernel; only the export table can be read again.
bool ReloadNfs()
{
    return IsProcessNamed("[nfsd]") && TLIBExec("/usr/sbin/exportfs", "-ra", nullptr) == 0;
}

struct Daemon {
    uint32_t bit;
    const char *script;  // NULL: none
    bool (*reload)();    // NULL: a hang-up to the process of its service row
    bool (*stop)();      // NULL: the script
};

// clang-format off
constexpr Daemon kDaemons[] = {
    {TAVO_DAEMON_AFP,          RC_D "S81atalk.sh",         ReloadAfp,       nullptr},
    {TAVO_DAEMON_MEDIA,        RC_D "S86tavodms.sh",       nullptr,         nullptr},
    {TAVO_DAEMON_SMB,          RC_D "S80samba.sh",         ReloadSmb,       nullptr},
    {TAVO_DAEMON_CRON,         RC_D "S04crond.sh",         nullptr,         nullptr},
    {TAVO_DAEMON_FTP,          RC_D "S99ftpd.sh",          ReloadFtp,       StopFtp},
    {TAVO_DAEMON_WEB_USER,     RC_D "S97apache-user.sh",   ReloadWebUser,   nullptr},
    {TAVO_DAEMON_THUMBNAIL,    RC_D "S77tavomkthumbd.sh",  nullptr,         nullptr},
    {TAVO_DAEMON_DOWNLOAD,     RC_D "S25download.sh",      nullptr,         nullptr},
    {TAVO_DAEMON_PRINTER,      RC_D "S55lpd.sh",           nullptr,         nullptr},
    {TAVO_DAEMON_PLAYER,       RC_D "S99iTunes.sh",        nullptr,         nullptr},
    {TAVO_DAEMON_INDEX,        RC_D "S66tavoindexd.sh",    nullptr,         nullptr},
    {TAVO_DAEMON_SURVEILLANCE, RC_D "S82surveillance.sh",  nullptr,         nullptr},
    {TAVO_DAEMON_VIDEO,        RC_D "S88tavomkflvd.sh",    nullptr,         nullptr},
    {TAVO_DAEMON_NFS,          RC_D "S83nfsd.sh",          ReloadNfs,       nullptr},
    {TAVO_DAEMON_MDNS,         RC_D "S99mDNS.sh",          nullptr,         nullptr},
    {TAVO_DAEMON_REMOTE,       RC_D "S96tavorcd.sh",       nullptr,         nullptr},
    {TAVO_DAEMON_LOG,          RC_D "S23tavologd.sh",      nullptr,         nullptr},
    {TAVO_DAEMON_ISCSI,        RC_D "S78iscsitrg.sh",      nullptr,         nullptr},
    {TAVO_DAEMON_AUDIO,        RC_D "S96tavoaudiod.sh",    nullptr,         nullptr},
    {TAVO_DAEMON_WEBDAV,       RC_D "S97apache-webdav.sh", ReloadWebdav,    nullptr},
    {TAVO_DAEMON_WEB_SYSTEM,   RC_D "S97apache-sys.sh",    ReloadWebSystem, nullptr},
};
// clang-format on

bool RunScript(const char *script, int operation)
{
    const char *const word = operation == TAVO_DAEMON_STOP    ? "stop"
                             : operation == TAVO_DAEMON_START ? "start"
                                                              : "restart";
    return TLIBExec(script, word, nullptr) == 0;
}

bool HangUp(uint32_t bit)
{
    for (const TAVOSERVICE &service : service_table) {
        if (service.fDaemon != bit || !service.szProc)
            continue;
        if (std::strchr(service.szProc, '/'))
            return TLIBProcSignalByPidFile(service.szProc, SIGHUP) == 0;
        return TLIBExec("/usr/bin/killall", "-HUP", service.szProc, nullptr) == 0;
    }
    return false;
}

}  // namespace

bool ControlDaemon(uint32_t bit, int operation)
{
    if (bit == TAVO_DAEMON_NETBKP)
        return TAVONetBkpService(operation) == 0;
    for (const Daemon &daemon : kDaemons) {
        if (daemon.bit != bit)
            continue;
        if (operation == TAVO_DAEMON_RELOAD)
            return daemon.reload ? daemon.reload() : HangUp(bit);
        if (operation == TAVO_DAEMON_STOP && daemon.stop)
            return daemon.stop();
        return RunScript(daemon.script, operation);
    }
    return false;
}

bool ControlPostgres(int operation)
{
    return RunScript(RC_D "S20pgsql.sh", operation);
}

bool ControlMysql(int operation)
{
    return RunScript(RC_D "S21mysql.sh", operation);
}

}  // namespace tavo
