// Stops, starts, restarts or reloads the network-backup server.
#include "tavo_appliance.h"
#include "tavo_proc.h"

#include "appliance/detail/daemon_signal.h"
#include "core/detail/fault.h"
#include "core/detail/keep_fault.h"

#include <csignal>

#include <unistd.h>

namespace {

// The operations, numbered as in the daemon dispatcher.
enum { kStop = 1, kStart, kRestart, kReload };

constexpr const char *kPidFile = "/var/run/rsyncd.pid";
constexpr const char *kServer = "/usr/bin/rsync";
constexpr const char *kOptions = "--config=/usr/tavo/etc/rsyncd.conf";

constexpr int kStopMilliseconds = 5000;
constexpr int kLookMilliseconds = 20;

// Stopping a stopped server succeeds. A running one is waited for: a new server refuses to start beside it.
bool Stop()
{
    if (!tavo::SignalDaemon(kPidFile, SIGTERM))
        return false;
    const tavo::KeepFault keep;
    for (int waited = 0; TLIBProcAliveByPidFile(kPidFile); waited += kLookMilliseconds) {
        if (waited >= kStopMilliseconds)
            return false;
        ::usleep(kLookMilliseconds * 1000);
    }
    return true;
}

bool Start()
{
    const tavo::KeepFault keep;
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
        done = TLIBProcAliveByPidFile(kPidFile);  // it reads its configuration again for every connection
        break;
    default:
        return Fail(ERR_BAD_PARAMETERS);
    }
    return done ? 0 : Fail(ERR_OP_FAILURE);
}
