// What a story tells of commands and calls: apart from the story, since it brings along what takes the place of the shell.
#include "support/story.h"

namespace test {
namespace {

std::vector<std::string> WithBegin(const char *begin, std::vector<std::string> lines)
{
    for (std::string &line : lines)
        line.insert(0, begin);
    return lines;
}

}  // namespace

Story::Source CommandsOf(RecordedCommands &commands, const std::string &without)
{
    return [&commands, pattern = std::regex(without), is_whole = without.empty()] {
        std::vector<std::string> lines = commands.Take();
        std::erase_if(lines, [&](const std::string &line) { return !is_whole && std::regex_search(line, pattern); });
        return WithBegin("run ", lines);
    };
}

Story::Source CallsOf(RecordedCalls &calls, const std::string &begin)
{
    return [&calls, begin] {
        std::vector<std::string> lines = calls.Take();
        std::erase_if(lines, [&](const std::string &line) { return !line.starts_with(begin); });
        return WithBegin("call ", lines);
    };
}

}  // namespace test
