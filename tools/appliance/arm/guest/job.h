// One program that the host wants run, with its limits, in a control group of its own.
#pragma once

#include "channel.h"

#include <string>
#include <vector>

namespace machine {

struct Job {
    std::vector<std::string> arguments;
    std::vector<std::string> environment;
    std::string directory = "/";
    double seconds = 0;    // 0: no limit
    long long memory = 0;  // bytes, 0: no limit
    bool fresh = false;    // in a throw-away copy of the root
    std::string layer;     // a folder that is mounted over that copy
    std::string host_at;   // where the host's folder is shown, too, in that copy
    std::string terminal;  // on the console, with this size ("rows columns")
};

struct Outcome {
    int status = 0;             // as wait() gives it
    int killed_for_memory = 0;  // processes of the job that the kernel killed because its memory was used up
    int left_behind = 0;        // processes that were still there when the program had ended
};

// The payload of a request: "name=value" strings, "--", the arguments; each ends in a NUL.
Job ParseJob(std::string_view payload);

// Runs the job, sends what it writes ('o', 'e') while it runs, and ends everything that it started. A 'K' of the host
// ends it early; what it was busy with then goes to 'e'.
Outcome RunJob(const Job &job, const Channel &host);

}  // namespace machine
