// tavoctl watch: one line for each thing that happens.
#include "events/event.h"
#include "families.h"
#include "frame/program_run.h"
#include "frame/text.h"

#include <algorithm>
#include <cerrno>
#include <csignal>
#include <ctime>
#include <iostream>

namespace tavoctl {
namespace {

struct TimedEvent {
    std::string time;
    Event what;
};

constexpr Column<TimedEvent> event_columns[] = {
    {"time", field<&TimedEvent::time>, "in UTC"},
    {"event", [](const TimedEvent &e) { return e.what.event; }},
    {"object", [](const TimedEvent &e) { return e.what.object; }, "disk, array, folder, interface or service"},
    {"detail", [](const TimedEvent &e) { return Maybe(e.what.detail); }},
};

std::string Now()
{
    const std::time_t now = std::time(nullptr);
    std::tm parts = {};
    ::gmtime_r(&now, &parts);
    char text[32];
    std::strftime(text, sizeof text, "%Y-%m-%dT%H:%M:%SZ", &parts);
    return text;
}

// Requests to end come only while the program waits, so that none is missed and no event is half reported.
class Requests {
  public:
    Requests()
    {
        struct sigaction action = {};
        action.sa_handler = [](int) { asked_ = 1; };
        sigset_t blocked;
        ::sigemptyset(&blocked);
        for (const int number : {SIGINT, SIGTERM}) {
            ::sigaction(number, &action, nullptr);
            ::sigaddset(&blocked, number);
        }
        ::sigprocmask(SIG_BLOCK, &blocked, &while_waiting_);
    }
    const sigset_t &WhileWaiting() const { return while_waiting_; }
    // A program gets the signals that this one got from its caller, and is asked to end together with it.
    void Run(const std::vector<std::string> &words) const
    {
        sigset_t blocked;
        ::sigprocmask(SIG_SETMASK, &while_waiting_, &blocked);
        const int status = RunInForeground(words);
        ::sigprocmask(SIG_SETMASK, &blocked, nullptr);
        if (status != 0)
            Warn(words[0] + " ended with status " + std::to_string(status));
    }
    // One that came while something was ready still waits to be delivered.
    static bool Asked()
    {
        sigset_t pending;
        return asked_ != 0 || (::sigpending(&pending) == 0 &&
                               (::sigismember(&pending, SIGINT) == 1 || ::sigismember(&pending, SIGTERM) == 1));
    }

  private:
    static inline volatile std::sig_atomic_t asked_ = 0;
    sigset_t while_waiting_;
};

// False when there is nothing more to wait for.
bool Wait(const std::vector<Source> &sources, const Requests &requests)
{
    std::vector<pollfd> wanted;
    int patience = -1;
    for (const Source &source : sources) {
        const std::vector<pollfd> own = source->Wanted();
        wanted.insert(wanted.end(), own.begin(), own.end());
        if (const int limit = source->Patience(); limit >= 0)
            patience = patience < 0 ? limit : std::min(patience, limit);
    }
    const timespec limit = {patience / 1000, patience % 1000 * 1'000'000L};
    const int ready = ::ppoll(wanted.data(), wanted.size(), patience < 0 ? nullptr : &limit, &requests.WhileWaiting());
    if (ready < 0 && errno != EINTR)
        throw SystemFailure("wait for events", errno);
    return !Requests::Asked();
}

void Report(const Call &call, const TimedEvent &event)
{
    if (call.json)
        std::cout << Record(event_columns, event).Json(true) << std::endl;
    else
        std::cout << Printable(event.time + "  " + event.what.event + "  " + event.what.object +
                               (event.what.detail.empty() ? "" : "  " + event.what.detail))
                  << std::endl;
}

Action WatchEvents(Arguments &in)
{
    const auto program = in.Option("--exec", "PROGRAM", file_path, "run for each event: its name, object and detail");
    return [=](Call &call) {
        const Requests requests;
        std::vector<Source> sources;
        for (Source (*make)() : {DiskEvents, ArrayEvents, MountEvents, NetworkEvents, ServiceEvents})
            if (Source source = make())
                sources.push_back(std::move(source));
        while (std::cout && Wait(sources, requests)) {
            std::vector<Event> events;
            for (const Source &source : sources)
                source->Look(events);
            for (const Event &event : events) {
                Report(call, {Now(), event});
                if (*program)
                    requests.Run({**program, event.event, event.object, event.detail});
            }
        }
    };
}

}  // namespace

void AddWatch(Program &program)
{
    program.Add("watch", "What happens, as it happens")
        .Add("", reads, Answer::One(event_columns), WatchEvents,
             R"(Prints a line for each thing that happens, until it is
interrupted: a disk comes or goes (disk-in, disk-out), an array starts, stops, or changes its health (array-started,
array-stopped, array-degraded, array-crashed, array-normal), a member fails, is added or removed (member-failed,
member-added, member-removed), a rebuild or scrub goes on (rebuild-begun, rebuild-progress, rebuild-ended), a file
system is mounted or unmounted (volume-mounted, volume-unmounted, mounted, unmounted), a link or an address changes
(link-up, link-down, address-added, address-removed), a service comes or goes (service-up, service-down,
service-restarted). The kernel tells it; no disk is read or woken.

tavoctl watch
tavoctl watch --json
tavoctl watch --exec /usr/local/bin/tell-me)");
}

}  // namespace tavoctl
