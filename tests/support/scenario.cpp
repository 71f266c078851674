// Scripts the tools that the library runs.
#include "support/scenario.h"

#include "scripted/quoted_line.h"
#include "scripted/scenario_dir.h"
#include "support/test.h"

namespace test {

ScriptedCall &ScriptedCall::Prints(std::string_view text)
{
    scenario::Write(path_ / "stdout", text);
    return *this;
}

ScriptedCall &ScriptedCall::Exits(int status)
{
    scenario::Write(path_ / "status", std::to_string(status));
    return *this;
}

ScriptedCall &ScriptedCall::DiesOf(int signal)
{
    scenario::Write(path_ / "status", "signal " + std::to_string(signal));
    return *this;
}

ScriptedCall &ScriptedCall::Times(int count)
{
    scenario::Write(path_ / "times", std::to_string(count));
    return *this;
}

ScriptedCall &ScriptedCall::AnyTimes()
{
    scenario::Write(path_ / "times", "any");
    return *this;
}

ScriptedCall &ScriptedCall::Runs(std::string_view script)
{
    scenario::Write(path_ / "run", script);
    std::filesystem::permissions(path_ / "run", std::filesystem::perms(0755));
    return *this;
}

Scenario::Scenario()
{
    scenario::Reset();
    std::filesystem::create_directories(std::filesystem::path(scenario::folder) / "calls");
}

Scenario::~Scenario()
{
    EXPECT_EQ(Finish(), "");
    scenario::Reset();
}

ScriptedCall Scenario::Expect(const std::vector<std::string> &words)
{
    return ScriptedCall(scenario::AddCall(scenario::QuotedLine(words)));
}

ScriptedCall Scenario::ExpectAny(const std::string &tool)
{
    return ScriptedCall(scenario::AddCall(scenario::QuotedWord(tool) + " ..."));
}

void Scenario::InAnyOrder()
{
    scenario::Write(std::filesystem::path(scenario::folder) / "order", "any");
}

std::vector<std::string> Scenario::Calls()
{
    std::vector<std::string> calls;
    std::ifstream log(scenario::log_file);
    for (std::string line; std::getline(log, line);)
        calls.push_back(line.substr(line.find(' ') + 1));
    return calls;
}

std::string Scenario::Finish()
{
    const std::string complaints = scenario::Complaints();
    scenario::Reset();
    std::filesystem::create_directories(std::filesystem::path(scenario::folder) / "calls");
    return complaints;
}

}  // namespace test
