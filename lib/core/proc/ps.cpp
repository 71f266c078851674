// Finds processes by their line in the process table.
#include "tavo_proc.h"

#include "core/detail/guard.h"
#include "core/detail/process_list.h"
#include "core/detail/ps_scratch.h"
#include "core/detail/ps_search.h"
#include "core/detail/run_command.h"
#include "core/detail/shell_command.h"

#include <cstring>
#include <string>

namespace {

// grep's time grows with the square of the pattern's length.
constexpr size_t kLongestPattern = 1024;

// Used where ps fails.
int FindInProcessTable(const std::string &pattern, tavo::PsSearch &search)
{
    for (const tavo::Process &process : tavo::ListProcesses()) {
        const std::string line = ProcessLine(process);
        if (line.find(pattern) != std::string::npos)
            search.Add(line);
    }
    return search.Count();
}

int FindByPs(const std::string &pattern, pid_t *pids, int capacity)
{
    tavo::PsSearch search(pattern, pids, capacity);
    const tavo::PsScratch scratch("/tmp/tempTLIBPs" + std::to_string(::getpid()));
    if (!scratch)
        return scratch.IsTaken() ? FindInProcessTable(pattern, search) : Fail(ERR_READ_FAILED);
    if (const auto command = tavo::ShellCommand("/bin/ps -I | /bin/grep '%s' > %s 2>&1", pattern, scratch.Path()))
        tavo::RunCommandQuietly(*command);
    const tavo::File found = scratch.Reopen();
    if (!found)
        return Fail(ERR_READ_FAILED);
    search.AddLines(found.Get());
    // Most machines' ps does not know -I.
    return search.HasListed() ? search.Count() : FindInProcessTable(pattern, search);
}

}  // namespace

extern "C" int TLIBPs(const char *szPattern, pid_t *rgPid, int nPid)
{
    if (!szPattern || ::strnlen(szPattern, kLongestPattern + 1) > kLongestPattern || (!rgPid && nPid > 0))
        return Fail(ERR_BAD_PARAMETERS);
    return Guard([&] { return FindByPs(szPattern, rgPid, nPid); });
}
