// The virtual appliance for tests.
#include "support/machine.h"

#include "support/test.h"

namespace test {

bool OnMachine()
{
    // A developer's machine may have disks, too: these are recognised by the name of the root.
    struct stat facts;
    return RootForm() == "machine" && ::stat("/dev/sda", &facts) == 0 && S_ISBLK(facts.st_mode);
}

CommandResult Shell(const std::string &line)
{
    CommandResult result = {127, ""};
    std::FILE *pipe = ::popen(("exec 2>&1 </dev/null; " + line).c_str(), "re");
    if (!pipe)
        return result;
    char buffer[4096];
    for (std::size_t got; (got = std::fread(buffer, 1, sizeof buffer, pipe)) > 0;)
        result.output.append(buffer, got);
    const int status = ::pclose(pipe);
    result.status = WIFEXITED(status) ? WEXITSTATUS(status) : 128 + WTERMSIG(status);
    return result;
}

std::string Told(const std::string &line)
{
    const CommandResult result = Shell(line);
    EXPECT_EQ(result.status, 0) << line << "\n" << result.output;
    return result.output;
}

void Happen(const std::string &event)
{
    Told("/usr/tavo/bin/appliance-event " + event);
}

bool Comes(const std::function<bool()> &condition)
{
    return Eventually(condition);
}

}  // namespace test
