// Drives daemons in an order that their dependencies allow.
#include "service/detail/daemon_order.h"

#include "tavo_service.h"

#include "service/detail/daemon_control.h"
#include "service/detail/database_stack.h"

namespace tavo {
namespace {

constexpr uint32_t kBothWebs = TAVO_DAEMON_WEB_USER | TAVO_DAEMON_WEB_SYSTEM;

// In the result, in place of the highest bit.
constexpr int kWebSystemDone = 0x40000000;

// The daemons that the stack drives are not driven a second time for their own bits.
constexpr uint32_t kInsideStack =
    TAVO_DAEMON_MEDIA | TAVO_DAEMON_PLAYER | TAVO_DAEMON_INDEX | TAVO_DAEMON_DOWNLOAD | TAVO_DAEMON_SURVEILLANCE;

constexpr uint32_t kBeforeStack[] = {TAVO_DAEMON_AFP,    TAVO_DAEMON_SMB,   TAVO_DAEMON_FTP,    TAVO_DAEMON_MEDIA,
                                     TAVO_DAEMON_REMOTE, TAVO_DAEMON_AUDIO, TAVO_DAEMON_PLAYER, TAVO_DAEMON_INDEX};
constexpr uint32_t kAfterWebs[] = {TAVO_DAEMON_WEBDAV,       TAVO_DAEMON_DOWNLOAD,  TAVO_DAEMON_PRINTER,
                                   TAVO_DAEMON_CRON,         TAVO_DAEMON_THUMBNAIL, TAVO_DAEMON_VIDEO,
                                   TAVO_DAEMON_SURVEILLANCE, TAVO_DAEMON_NFS,       TAVO_DAEMON_RESTORE,
                                   TAVO_DAEMON_MDNS,         TAVO_DAEMON_LOG,       TAVO_DAEMON_ISCSI};

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
            Note(daemon, ControlDaemon(daemon, operation_));
    }

    // The two servers share a port range and modules, so the user's is stopped while the system's restarts. A caller
    // that asks for both gets this for every operation. The management pages themselves come from the system's server,
    // so it is stopped only when it is asked for alone.
    void BothWebs()
    {
        const bool stopped = ControlDaemon(TAVO_DAEMON_WEB_USER, TAVO_DAEMON_STOP);
        Note(TAVO_DAEMON_WEB_SYSTEM, ControlDaemon(TAVO_DAEMON_WEB_SYSTEM, TAVO_DAEMON_RESTART));
        const bool started = ControlDaemon(TAVO_DAEMON_WEB_USER, TAVO_DAEMON_START);
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

int DriveInOrder(uint32_t mask, int operation)
{
    return Dispatch(mask, operation).Run();
}

}  // namespace tavo
