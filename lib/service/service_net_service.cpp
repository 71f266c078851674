// Stops, starts, restarts or reloads a set of daemons, in an order that their dependencies allow.
#include "tavo_service.h"

#include "core/detail/guard.h"
#include "core/detail/lock_hold.h"
#include "core/detail/log.h"
#include "service/detail/daemon_control.h"

#include <iterator>

namespace {

// The locks of the settings file, of Samba and of the Apple files, exclusively, because start scripts write these
// files. So a start script must not call a function that takes one of these locks: it would wait for its time-out and
// fail.
constexpr unsigned kServiceLock =
    TAVO_LOCK_TAVOINFO | TAVO_LOCK_SMB | TAVO_LOCK_APPLE | TAVO_LOCK_EXCLUSIVE | TAVO_LOCK_NONBLOCKING;
constexpr int kLockSeconds = 5;

constexpr uint32_t kBothWebs = TAVO_DAEMON_WEB_USER | TAVO_DAEMON_WEB_SYSTEM;

// The highest bit would make the result negative, which callers take for a failure.
constexpr int kWebSystemDone = 0x40000000;

// The daemons that use the databases, in the order in which they are stopped.
constexpr uint32_t kOnDatabase[] = {TAVO_DAEMON_SURVEILLANCE, TAVO_DAEMON_PLAYER,   TAVO_DAEMON_MEDIA,
                                    TAVO_DAEMON_INDEX,        TAVO_DAEMON_DOWNLOAD, TAVO_DAEMON_LOG};

// The daemons that the stack drives are not driven a second time for their own bits.
constexpr uint32_t kInsideStack =
    TAVO_DAEMON_MEDIA | TAVO_DAEMON_PLAYER | TAVO_DAEMON_INDEX | TAVO_DAEMON_DOWNLOAD | TAVO_DAEMON_SURVEILLANCE;

constexpr uint32_t kBeforeStack[] = {TAVO_DAEMON_AFP,    TAVO_DAEMON_SMB,   TAVO_DAEMON_FTP,    TAVO_DAEMON_MEDIA,
                                     TAVO_DAEMON_REMOTE, TAVO_DAEMON_AUDIO, TAVO_DAEMON_PLAYER, TAVO_DAEMON_INDEX};
constexpr uint32_t kAfterWebs[] = {TAVO_DAEMON_WEBDAV,       TAVO_DAEMON_DOWNLOAD,  TAVO_DAEMON_PRINTER,
                                   TAVO_DAEMON_CRON,         TAVO_DAEMON_THUMBNAIL, TAVO_DAEMON_VIDEO,
                                   TAVO_DAEMON_SURVEILLANCE, TAVO_DAEMON_NFS,       TAVO_DAEMON_RESTORE,
                                   TAVO_DAEMON_MDNS,         TAVO_DAEMON_LOG,       TAVO_DAEMON_ISCSI};

// Each step runs even when an earlier one failed: a half stopped stack is useless.
bool StopOnDatabase()
{
    bool done = true;
    for (const uint32_t daemon : kOnDatabase)
        done = tavo::ControlDaemon(daemon, TAVO_DAEMON_STOP) && done;
    return done;
}

bool StartOnDatabase()
{
    bool done = true;
    for (auto daemon = std::rbegin(kOnDatabase); daemon != std::rend(kOnDatabase); ++daemon)
        done = tavo::ControlDaemon(*daemon, TAVO_DAEMON_START) && done;
    return done;
}

bool ControlDatabaseStack(int operation)
{
    bool done = true;
    switch (operation) {
    case TAVO_DAEMON_STOP:
        done = StopOnDatabase();
        done = tavo::ControlPostgres(operation) && done;
        return tavo::ControlMysql(operation) && done;
    case TAVO_DAEMON_START:
        done = tavo::ControlMysql(operation);
        done = tavo::ControlPostgres(operation) && done;
        return StartOnDatabase() && done;
    case TAVO_DAEMON_RESTART:
        done = StopOnDatabase();
        done = tavo::ControlPostgres(operation) && done;
        done = tavo::ControlMysql(operation) && done;
        return StartOnDatabase() && done;
    default:
        return false;  // the database servers have nothing to reload
    }
}

class Dispatch {
  public:
    Dispatch(uint32_t mask, int operation) : mask_(mask), operation_(operation) {}

    int Run()
    {
        const bool stack = mask_ & TAVO_DAEMON_DATABASE;
        if (stack)
            mask_ &= ~kInsideStack;
        for (const uint32_t daemon : kBeforeStack)
            One(daemon);
        if (stack && ControlDatabaseStack(operation_))
            done_ |= TAVO_DAEMON_DATABASE;
        One(TAVO_DAEMON_NETBKP);
        if ((mask_ & kBothWebs) == kBothWebs) {
            BothWebs();
        } else {
            One(TAVO_DAEMON_WEB_SYSTEM);
            One(TAVO_DAEMON_WEB_USER);
        }
        for (const uint32_t daemon : kAfterWebs)
            One(daemon);
        return done_;
    }

  private:
    void One(uint32_t daemon)
    {
        if (mask_ & daemon)
            Note(daemon, tavo::ControlDaemon(daemon, operation_));
    }

    // The two servers share a port range and modules, so the user's is stopped while the system's restarts. A caller
    // that asks for both gets this for every operation. The management pages themselves come from the system's server,
    // so it is stopped only when it is asked for alone.
    void BothWebs()
    {
        const bool stopped = tavo::ControlDaemon(TAVO_DAEMON_WEB_USER, TAVO_DAEMON_STOP);
        Note(TAVO_DAEMON_WEB_SYSTEM, tavo::ControlDaemon(TAVO_DAEMON_WEB_SYSTEM, TAVO_DAEMON_RESTART));
        const bool started = tavo::ControlDaemon(TAVO_DAEMON_WEB_USER, TAVO_DAEMON_START);
        Note(TAVO_DAEMON_WEB_USER, stopped && started);
    }

    void Note(uint32_t daemon, bool success)
    {
        if (success)
            done_ |= daemon == TAVO_DAEMON_WEB_SYSTEM ? kWebSystemDone : static_cast<int>(daemon);
    }

    uint32_t mask_;
    int operation_;
    int done_ = 0;
};

}  // namespace

extern "C" int TAVONetService(uint32_t fDaemon, int operation)
{
    if (fDaemon == 0 || operation < TAVO_DAEMON_STOP || operation > TAVO_DAEMON_RELOAD) {
        LogError("%s(%d):  bad parameter");
        return Fail(ERR_BAD_PARAMETERS);
    }
    const tavo::LockHold lock(kServiceLock, kLockSeconds);
    if (!lock) {
        LogError("%s(%d): lock failed");
        return -1;  // the lock's own code is kept
    }
    return Guard([&] { return Dispatch(fDaemon, operation).Run(); });
}
