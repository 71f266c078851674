// Pid files, and signals to the processes that they name.
//
// Root signals the process that a pid file names, and some pid files are in /tmp. So a file that another user could
// have written is believed only about that user's own processes.
#ifndef TAVO_CORE_DETAIL_PID_FILE_H
#define TAVO_CORE_DETAIL_PID_FILE_H

#include <optional>
#include <string_view>

#include <sys/types.h>

namespace tavo {

// Parses the process id on the first line of the text, with optional blanks around it; 0 without a number from 1 to
// `largest`.
pid_t ParsePid(std::string_view text, pid_t largest) noexcept;

// Reads the process id in a pid file; 0 when it holds none or is not trusted; empty with errno when it cannot be
// opened.
std::optional<pid_t> ReadPidFile(const char *path) noexcept;

enum class PidSignal {
    sent,
    no_pid,  // no file, or no number in it
    failed,  // with errno
};

// Sends the signal to exactly the process that the file was checked against, even if its pid is reused meanwhile.
// Signal 0 only tests.
PidSignal SignalByPidFile(const char *path, int signal) noexcept;

}  // namespace tavo

#endif
