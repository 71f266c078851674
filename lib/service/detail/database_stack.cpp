// Drives the database servers and the daemons that use them.
#include "service/detail/database_stack.h"

#include "tavo_service.h"

#include "service/detail/daemon_control.h"

#include <iterator>

namespace tavo {
namespace {

// The daemons that use the databases, in the order in which they are stopped.
constexpr uint32_t kOnDatabase[] = {TAVO_DAEMON_SURVEILLANCE, TAVO_DAEMON_PLAYER,   TAVO_DAEMON_MEDIA,
                                    TAVO_DAEMON_INDEX,        TAVO_DAEMON_DOWNLOAD, TAVO_DAEMON_LOG};

// Each step runs even when an earlier one failed: a half stopped stack is useless.
bool StopOnDatabase()
{
    bool done = true;
    for (const uint32_t daemon : kOnDatabase)
        done = ControlDaemon(daemon, TAVO_DAEMON_STOP) && done;
    return done;
}

bool StartOnDatabase()
{
    bool done = true;
    for (auto daemon = std::rbegin(kOnDatabase); daemon != std::rend(kOnDatabase); ++daemon)
        done = ControlDaemon(*daemon, TAVO_DAEMON_START) && done;
    return done;
}

}  // namespace

bool ControlDatabaseStack(int operation)
{
    bool done = true;
    switch (operation) {
    case TAVO_DAEMON_STOP:
        done = StopOnDatabase();
        done = ControlPostgres(operation) && done;
        return ControlMysql(operation) && done;
    case TAVO_DAEMON_START:
        done = ControlMysql(operation);
        done = ControlPostgres(operation) && done;
        return StartOnDatabase() && done;
    case TAVO_DAEMON_RESTART:
        done = StopOnDatabase();
        done = ControlPostgres(operation) && done;
        done = ControlMysql(operation) && done;
        return StartOnDatabase() && done;
    default:
        return false;  // the database servers have nothing to reload
    }
}

}  // namespace tavo
