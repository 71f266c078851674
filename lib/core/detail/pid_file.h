// Pid files, and signals to the processes that they name.
//
// Root signals what a pid file says, and some pid files live in /tmp. So a file that somebody else could have written is
// believed only about that somebody's own processes.
#ifndef TAVO_CORE_DETAIL_PID_FILE_H
#define TAVO_CORE_DETAIL_PID_FILE_H

#include <optional>
#include <string_view>

#include <sys/types.h>

namespace tavo {

// The process id on the first line of the text, blanks around it allowed; 0 when there is no number from 1 to `largest`.
pid_t ParsePid(std::string_view text, pid_t largest) noexcept;

// The process id in a pid file; 0 when it holds none or is not to be believed; empty with errno when it cannot be opened.
std::optional<pid_t> ReadPidFile(const char *path) noexcept;

enum class PidSignal {
    sent,
    no_pid,  // no file, or no number in it
    failed,  // with errno
};

// Sends the signal to the very process that the file was checked against, even if its pid is reused meanwhile. Signal 0
// only tests.
PidSignal SignalByPidFile(const char *path, int signal) noexcept;

}  // namespace tavo

#endif
