// tavoctl discover: the appliances on the network.
#include "families.h"
#include "frame/failure.h"
#include "frame/program.h"
#include "frame/progress.h"
#include "frame/watch.h"

#include "tavo_fhost.h"

#include <vector>

namespace tavoctl {
namespace {

struct FoundHost {
    std::string name, address;
};

constexpr Column<FoundHost> host_columns[] = {
    {"name", field<&FoundHost::name>},
    {"address", field<&FoundHost::address>},
};

std::vector<FoundHost> FindHosts()
{
    constexpr int answer_seconds = 10;
    std::vector<FoundHost> hosts;
    const auto note = [](const TAVOFHOST *host, void *context) {
        static_cast<std::vector<FoundHost> *>(context)->push_back({host->szName, host->szIp});
        return 0;
    };
    Must(TAVOFHOSTEnum(note, &hosts, answer_seconds) >= 0, "ask the network",
         "is findhostd running? Is the network up?");
    return hosts;
}

Action Discover(Arguments &in)
{
    const auto watch = in.Flag("--watch", watch_help);
    return [=](Call &call) {
        const auto look = [&] {
            return call.TableOf(host_columns, FindHosts());
        };
        if (*watch)
            return Watch(call, 0, look);
        Progress progress("asking the network");
        progress.Show("10 s");
        call.Print(look());
    };
}

}  // namespace

void AddDiscover(Program &program)
{
    program.Add("discover", "Other appliances on the network")
        .Add("", reads, Answer::List(host_columns), R"(Lists the appliances that answer on the networks of the wired
interfaces. It takes ten seconds to hear them all. What they say of themselves is not to be relied on.

tavoctl discover
tavoctl discover --json
tavoctl discover --watch)",
             Discover);
}

}  // namespace tavoctl
