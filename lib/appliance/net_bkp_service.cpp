// Stops, starts, restarts or reloads the network-backup server.
#include "tavo_appliance.h"

#include "tavo_proc.h"

#include "appliance/detail/daemon_signal.h"
#include "core/detail/fault.h"

#include <csignal>

namespace {

// The operations, numbered as callers of the daemon dispatcher know them.
enum { kStop = 1, kStart, kRestart, kReload };

constexpr const char *kPidFile = "/var/run/rsyncd.pid";
constexpr const char *kServer = "/usr/bin/rsync";
constexpr const char *kOptions = "--config=/usr/tavo/etc/rsyncd.conf";

// A server that does not run is stopped.
bool Stop()
{
    return tavo::SignalDaemon(kPidFile, SIGTERM);
}

bool Start()
{
    return TLIBProcAliveByPidFile(kPidFile) || TLIBExec(kServer, "--daemon", kOptions, nullptr) == 0;
}

}  // namespace

extern "C" int TAVONetBkpService(int operation)
{
    bool done = false;
    switch (operation) {
    case kStop:
        done = Stop();
        break;
    case kStart:
        done = Start();
        break;
    case kRestart:
        done = Stop() && TLIBExec(kServer, "--daemon", kOptions, nullptr) == 0;
        break;
    case kReload:
        done = TLIBProcAliveByPidFile(kPidFile);  // it reads its configuration anew for every connection
        break;
    default:
        return Fail(ERR_BAD_PARAMETERS);
    }
    return done ? 0 : Fail(ERR_OP_FAILURE);
}
