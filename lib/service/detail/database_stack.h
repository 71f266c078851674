// Drives the database servers and the daemons that use them.
#ifndef TAVO_SERVICE_DETAIL_DATABASE_STACK_H
#define TAVO_SERVICE_DETAIL_DATABASE_STACK_H

namespace tavo {

// `operation` is TAVO_DAEMON_STOP, _START or _RESTART; false for a reload, and when a step failed.
bool ControlDatabaseStack(int operation);

}  // namespace tavo

#endif
