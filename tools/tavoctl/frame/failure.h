// What a verb throws when it cannot do what was asked.
#ifndef TAVOCTL_FAILURE_H
#define TAVOCTL_FAILURE_H

#include "frame/exit_status.h"

#include <optional>
#include <string>

namespace tavoctl {

struct Failure {
    std::string attempted;    // completes "cannot ..."
    std::string reason = {};  // what is wrong, when no code says it
    std::string hint = {};    // empty: what the code usually calls for
    int code = 0;             // of the library; 0: the failure is tavoctl's own
    std::string module = {};  // where in the library; empty: not there
    int line = 0;
    std::optional<int> status = {};  // unless the code decides

    int Status() const;
    std::string Hint() const;
    std::string Text() const;  // one line, safe for a terminal
    std::string Json() const;  // the same facts
};

// The failure that the library has just reported.
Failure LibraryFailure(std::string attempted, std::string hint = {});

// The hint of a failure for which the library sets no code.
inline constexpr char log_hint[] = "look at the system log";

// An argument that tavoctl itself refuses.
Failure UsageFailure(std::string attempted, std::string reason, std::string hint = {});

// Something that was looked for and is not there; code is the library's name for that.
Failure NotFound(std::string attempted, int code, std::string hint = {});

}  // namespace tavoctl

#endif
