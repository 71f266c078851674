// tavoctl discover: the appliances on the network.
#include "families.h"
#include "frame/failure.h"
#include "frame/program.h"
#include "frame/progress.h"
#include "frame/table.h"
#include "frame/watch.h"

#include "tavo_fhost.h"

#include <utility>

namespace tavoctl {
namespace {

using Hosts = std::vector<std::pair<std::string, std::string>>;  // name and address

constexpr int answer_seconds = 10;

Hosts Find()
{
    Hosts hosts;
    const auto note = [](const TAVOFHOST *host, void *context) {
        static_cast<Hosts *>(context)->emplace_back(host->szName, host->szIp);
        return 0;
    };
    if (TAVOFHOSTEnum(note, &hosts, answer_seconds) < 0)
        throw LibraryFailure("ask the network", "is findhostd running? Is the network up?");
    return hosts;
}

Table Shown(const Hosts &hosts)
{
    Table table({"name", "address"});
    for (const auto &[name, address] : hosts)
        table.Add({name, address});
    return table;
}

class Discover : public Verb {
  public:
    static constexpr VerbInfo info = {"", reads,
                                      "Lists the appliances that answer on the networks of the wired interfaces. It "
                                      "takes ten seconds to hear them all. "
                                      "What they say of themselves is not to be relied on.",
                                      "tavoctl discover\n"
                                      "tavoctl discover --json\n"
                                      "tavoctl discover --watch"};

    void Declare(Arguments &arguments) override { arguments.Flag("--watch", watch_, watch_help); }

    int Run(const Call &call) override
    {
        if (!watch_) {
            Progress progress("asking the network");
            progress.Show("10 s");
            call.Print(Shown(Find()));
            return exit_done;
        }
        Watch(call, 0, [] { return Shown(Find()); });
        return exit_done;
    }

  private:
    bool watch_ = false;
};

}  // namespace

void AddDiscover(Program &program)
{
    program.Add("discover", "Other appliances on the network").Add<Discover>();
}

}  // namespace tavoctl
