// Runs the command that stops, starts, restarts or reloads one daemon of the dispatcher.
#ifndef TAVO_SERVICE_DETAIL_DAEMON_CONTROL_H
#define TAVO_SERVICE_DETAIL_DAEMON_CONTROL_H

#include <cstdint>

namespace tavo {

// `daemon` is one bit of TAVO_DAEMON_*, `operation` one of TAVO_DAEMON_STOP to TAVO_DAEMON_RELOAD. True when the
// command ran and succeeded; false also for a daemon without a command for the operation.
bool ControlDaemon(uint32_t daemon, int operation);

// The database servers, which only the database stack drives.
bool ControlPostgres(int operation);
bool ControlMysql(int operation);

}  // namespace tavo

#endif
