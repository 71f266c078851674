// Signals to daemons of the appliance that may or may not run.
#ifndef TAVO_APPLIANCE_DETAIL_DAEMON_SIGNAL_H
#define TAVO_APPLIANCE_DETAIL_DAEMON_SIGNAL_H

namespace tavo {

// True when the signal was sent, and when no such daemon runs. Leaves the error state alone.
bool SignalDaemon(const char *pid_file, int signal);

}  // namespace tavo

#endif
