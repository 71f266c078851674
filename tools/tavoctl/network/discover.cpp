// tavoctl discover: the appliances on the network.
#include "tavo_fhost.h"

#include "families.h"
#include "frame/terminal.h"

#include <csignal>
#include <iostream>
#include <map>

#include <unistd.h>

namespace tavoctl {
namespace {

struct FoundHost {
    std::string name, address;
};

constexpr Column<FoundHost> host_columns[] = {
    {"name", field<&FoundHost::name>},
    {"address", field<&FoundHost::address>},
};

struct HostEvent {
    std::string event, name, address;
    std::optional<std::string> old_name;
};

constexpr Column<HostEvent> event_columns[] = {
    {"event", field<&HostEvent::event>, "arrived, changed or departed"},
    {"name", field<&HostEvent::name>},
    {"address", field<&HostEvent::address>},
    {"old_name", field<&HostEvent::old_name>, "of a host that changed its name"},
};

constexpr int answer_seconds = 10;

std::vector<FoundHost> FindHosts()
{
    std::vector<FoundHost> hosts;
    const auto note = [](const TAVOFHOST *host, void *context) {
        static_cast<std::vector<FoundHost> *>(context)->push_back({host->szName, host->szIp});
        return 0;
    };
    Must(TAVOFHOSTEnum(note, &hosts, answer_seconds) >= 0, "ask the network",
         "is findhostd running? Is the network up?");
    return hosts;
}

// A signal ends the program, but never in the middle of a line.
volatile std::sig_atomic_t printing = 0;
volatile std::sig_atomic_t asked_to_stop = 0;

void StopOnRequest()
{
    struct sigaction action = {};
    action.sa_handler = [](int) {
        if (!printing)
            ::_exit(exit_done);
        asked_to_stop = 1;
    };
    for (const int number : {SIGINT, SIGTERM})
        ::sigaction(number, &action, nullptr);
}

// The known hosts, and the new ones among them.
class HostWatch {
  public:
    explicit HostWatch(const Call &call) : call_(call) {}

    // One query: arrivals and changes are printed as they come, departures at its end.
    void Round()
    {
        const auto note = [](const TAVOFHOST *host, void *context) {
            static_cast<HostWatch *>(context)->See(host->szName, host->szIp);
            return std::cout ? 0 : 1;
        };
        Must(TAVOFHOSTEnum(note, this, answer_seconds) >= 0, "ask the network",
             "is findhostd running? Is the network up?");
        for (auto host = hosts_.begin(); host != hosts_.end();) {
            if (++host->second.rounds_unseen < most_unseen) {
                ++host;
                continue;
            }
            Tell({"departed", host->second.name, host->first, {}});
            host = hosts_.erase(host);
        }
    }

  private:
    // Broadcasts get lost, and findhostd remembers a host for 15 s.
    static constexpr int most_unseen = 3;

    struct Known {
        std::string name;
        int rounds_unseen = 0;
    };

    void See(const std::string &name, const std::string &address)
    {
        const auto [host, fresh] = hosts_.try_emplace(address, Known{name});
        host->second.rounds_unseen = 0;
        if (fresh)
            return Tell({"arrived", name, address, {}});
        if (host->second.name == name)
            return;
        Tell({"changed", name, address, host->second.name});
        host->second.name = name;
    }

    void Tell(const HostEvent &event) const
    {
        printing = 1;
        if (call_.json) {
            std::cout << Record(event_columns, event).Json(true) << "\n" << std::flush;
        } else {
            TableStyle style = call_.style;
            style.headings = false;
            style.columns = {"event", "name", "address", "old_name"};
            std::cout << call_.TableOf(event_columns, std::vector{event}).Text(style) << std::flush;
        }
        printing = 0;
        if (asked_to_stop)
            ::_exit(exit_done);
    }

    const Call &call_;
    std::map<std::string, Known> hosts_;  // by address
};

Action Discover(Arguments &in)
{
    const auto watch = in.Flag("--watch", "print arrivals, changes and departures, one a line, until interrupted");
    return [=](Call &call) {
        if (!*watch) {
            Progress progress("asking the network");
            progress.Show("10 s");
            return call.Print(call.TableOf(host_columns, FindHosts()));
        }
        StopOnRequest();
        for (HostWatch hosts(call); std::cout;)
            hosts.Round();
    };
}

}  // namespace

void AddDiscover(Program &program)
{
    program.Add("discover", "Other appliances on the network")
        .Add("", reads, Answer::List(host_columns).OrOne(event_columns), Discover,
             R"(Lists the appliances that answer on the networks of the wired
interfaces. It takes ten seconds to hear them all. What they say of themselves is not to be relied on.

tavoctl discover
tavoctl discover --json
tavoctl discover --watch --json)");
}

}  // namespace tavoctl
