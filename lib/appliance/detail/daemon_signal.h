// Signals to daemons of the appliance that may or may not run.
#ifndef TAVO_APPLIANCE_DETAIL_DAEMON_SIGNAL_H
#define TAVO_APPLIANCE_DETAIL_DAEMON_SIGNAL_H

namespace tavo {

// True when it was sent, and when there is nobody to send it to. Leaves the error state alone.
bool SignalDaemon(const char *pid_file, int signal);

}  // namespace tavo

#endif
