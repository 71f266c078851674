// tavoctl discover: the appliances on the network.
#include "families.h"
#include "frame/containers.h"
#include "frame/failure.h"
#include "frame/program.h"
#include "frame/progress.h"
#include "frame/table.h"
#include "frame/watch.h"

#include "tavo_fhost.h"
#include "tavo_proc.h"

#include <cstdio>
#include <iostream>
#include <utility>

#include <unistd.h>

namespace tavoctl {
namespace {

using Hosts = std::vector<std::pair<std::string, std::string>>;  // name and address

constexpr unsigned answer_seconds = 10;

std::string Interfaces(std::uint32_t mask)
{
    std::string text;
    for (int i = 0; i < 8; ++i) {
        if (mask & (1u << i))
            text += (text.empty() ? "" : ", ") + std::to_string(i + 1);
    }
    return text;
}

// Where some interface cannot send, the library gives up; the others may well have found somebody.
void CollectFromTheRest()
{
    const Failure failure = LibraryFailure("ask the network", "is findhostd running? Is the network up?");
    if (TLIBReadPidFile("/var/run/findhostd.pid") <= 0)
        throw failure;
    const std::uint32_t mask = ErrFHOSTSendQueryPkt();
    if (mask == 0)
        throw failure;
    std::cerr << "tavoctl: not asked from wired interface " << Interfaces(mask) << ", which has no address\n";
    ::sleep(answer_seconds);
    // As the library does when all is well.
    if (std::rename("/tmp/tavods.list", "/tmp/tavods.list.tmp") != 0)
        throw failure;
}

Hosts Find()
{
    if (TAVOFHOSTDumpHost() != 0)
        CollectFromTheRest();
    StringHash hash;
    if (TAVOFHOSTGet2Hash(hash.Address()) < 0)
        throw LibraryFailure("read who has answered");
    Hosts hosts;
    for (auto &[key, address] : hash.Pairs())
        hosts.emplace_back(key.substr(0, key.size() - address.size() - 2), std::move(address));  // "NAME(ADDRESS)"
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
