// The exception of a verb that fails, and the exit statuses.
#ifndef TAVOCTL_FAILURE_H
#define TAVOCTL_FAILURE_H

#include <optional>
#include <string>

namespace tavoctl {

// Scripts rely on these.
enum ExitStatus : int {
    exit_done = 0,
    exit_failed = 1,
    exit_usage = 2,      // the command line or an argument is wrong, whichever layer noticed
    exit_not_found = 3,  // the object is not there
    exit_busy = 4,       // another program holds a lock or a device: trying again may help
    exit_denied = 5,     // permission denied: only root may do it
};

// The status of `lock run` for a program that it could not run, as in shells.
enum ProgramStatus : int {
    exit_cannot_execute = 126,
    exit_no_such_program = 127,
    exit_by_signal = 128,  // plus the number of the signal that ended the program
};

struct Failure {
    std::string attempted;    // completes "cannot ..."
    std::string reason = {};  // the cause, when no code says it
    std::string hint = {};    // empty: what the code usually calls for
    int code = 0;             // of the library; 0: the failure is tavoctl's own
    std::string module = {};  // where in the library; empty: not there
    int line = 0;
    std::optional<int> status = {};  // unless the code decides
    std::string path = {};           // the file that could not be opened, where it is known

    void AddHint(const std::string &further) { hint += (hint.empty() ? "" : "; ") + further; }
    int Status() const;
    std::string Hint() const;
    std::string Text(bool verbose) const;  // one line, safe for a terminal; verbose: also where in the library
    std::string Json() const;              // all of the facts
};

// The failure that the library has just reported.
Failure LibraryFailure(std::string attempted, std::string hint = {});

// The hint of a failure for which the library sets no code.
inline constexpr char log_hint[] = "look at the system log";

// Throws the library's failure unless the condition, the success of a call, holds.
void Must(bool condition, const std::string &attempted, const std::string &hint = {});

// The hint for one code of the library, and for the others.
struct HintFor {
    int code;
    const char *hint;
    const char *otherwise = "";
};
void Must(bool condition, const std::string &attempted, const HintFor &hint);

// Throw a Failure when the condition holds: something that the library would not notice, an argument that tavoctl itself
// refuses, an object that another program uses.
void FailIf(bool condition, const std::string &attempted, const std::string &reason, const std::string &hint = {},
            int status = exit_failed);
void RefuseIf(bool condition, const std::string &attempted, const std::string &reason, const std::string &hint = {});
void BusyIf(bool condition, const std::string &attempted, const std::string &reason, const std::string &hint = {});

// A failed system call, by its errno.
Failure SystemFailure(std::string attempted, int error);

// An object that another program uses.
Failure BusyFailure(std::string attempted, std::string reason, std::string hint = {});

// The same failure, as a lack of permission if that is its cause: the library reports a lock or file that may not be
// opened like one that another program holds.
Failure WithPermissions(Failure failure);

// An argument that tavoctl itself refuses.
Failure UsageFailure(std::string attempted, std::string reason, std::string hint = {});

// Something that was looked for and is not there, with a reason or with the library's code for that.
Failure Absent(std::string attempted, std::string reason, std::string hint = {});
Failure NotFound(std::string attempted, int code, std::string hint = {});

// A line on standard error about what is done nevertheless, or left out.
void Warn(const std::string &text);

}  // namespace tavoctl

#endif
