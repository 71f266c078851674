// Answers the host inside the virtual appliance: takes one job after the other, gives back output and exit status.
// usage: agent   (started by init)
//
// The host sends 'S' (the time in seconds; random bytes follow) once after each start or wake-up, answered by 'W',
// 'R' (a job), 'K' (end
// the job) and 'Q' (no more jobs). The agent sends 'H' when it is ready, 'o' and 'e' with what the job writes, and 'X'
// with its outcome.
#include "channel.h"
#include "job.h"

#include <csignal>
#include <cstdio>
#include <cstdlib>
#include <ctime>
#include <fstream>

#include <sys/prctl.h>
#include <unistd.h>

using namespace machine;

namespace {

bool WakeUp(const std::string &payload)
{
    timespec now{};
    now.tv_sec = static_cast<time_t>(atoll(payload.c_str()));
    clock_settime(CLOCK_REALTIME, &now);
    // Every machine that wakes from one saved state would draw the same random numbers.
    std::ofstream("/dev/urandom", std::ios::binary) << payload;
    return system("/usr/lib/tavo-machine/wake") == 0;
}

}  // namespace

int main()
{
    prctl(PR_SET_CHILD_SUBREAPER, 1);
    sigset_t child_signal;
    sigemptyset(&child_signal);
    sigaddset(&child_signal, SIGCHLD);
    sigprocmask(SIG_BLOCK, &child_signal, nullptr);
    const Channel host("/dev/port-agent");
    host.Send('H', "");
    for (;;) {
        const Frame frame = host.Receive();
        if (frame.type == 'S') {
            host.Send('W', WakeUp(frame.payload) ? "ready" : "no shares");
        } else if (frame.type == 'R') {
            const Job job = ParseJob(frame.payload);
            const Outcome outcome = RunJob(job, host);
            if (job.fresh)
                (void)!system("/usr/lib/tavo-machine/reset");
            char text[80];
            snprintf(text, sizeof text, "status=%d killed_for_memory=%d left_behind=%d", outcome.status,
                     outcome.killed_for_memory, outcome.left_behind);
            host.Send('X', text);
        } else if (frame.type == 'Q') {
            return 0;
        }
    }
}
