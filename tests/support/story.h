// A test as a story: what its calls return, report, log, run and write is one text, which must be the text of the file
// golden/SUITE.CASE.txt in the folder of the test. With TAVO_KEEP_GOLDEN in the environment the texts are written into that
// folder.
//
//     test::Story story_{TEST_GOLDEN, {test::CommandsOf(commands_), test::LogOf(log_)}, {"/etc/hosts"}};
//     TELL(TAVONetHostsRefresh());
#ifndef TESTS_SUPPORT_STORY_H
#define TESTS_SUPPORT_STORY_H

#include "support/captured_log.h"
#include "support/fault_state.h"
#include "support/recorded_calls.h"
#include "support/recorded_commands.h"

#include <concepts>
#include <functional>
#include <map>
#include <regex>
#include <string>
#include <utility>
#include <vector>

#include <syslog.h>

namespace test {

class Story {
  public:
    using Source = std::function<std::vector<std::string>()>;  // the lines since the last time

    // The files are those at these paths, and those in folders at these paths.
    explicit Story(std::string golden, std::vector<Source> sources, std::vector<std::string> paths = {})
        : golden_(std::move(golden)), sources_(std::move(sources)), paths_(std::move(paths))
    {
    }
    ~Story();  // fails the test when the text is another one
    Story(const Story &) = delete;
    Story &operator=(const Story &) = delete;

    // Makes a call, and tells what it returned and all that happened meanwhile.
    template <class Call>
    auto Tell(const std::string &text, Call call)
    {
        Begin();
        const auto result = call();
        End(text + " = " + Text(result));
        return result;
    }

    // A value, below the last call.
    void Show(const std::string &name, const auto &value) { Line("    " + name + ": " + Text(value)); }
    // What another run may have in another form: each match of the pattern is replaced.
    void Mask(const std::string &pattern, const std::string &text) { masks_.emplace_back(std::regex(pattern), text); }
    // A heading: the row of a table that the next calls belong to.
    void Head(const std::string &text) { Line("- " + text); }

  private:
    static std::string Text(std::integral auto number) { return std::to_string(number); }
    static std::string Text(const char *text) { return text ? '"' + std::string(text) + '"' : "NULL"; }
    static std::string Text(const std::string &text) { return '"' + text + '"'; }
    static std::string Text(const std::vector<std::string> &texts);

    void Begin();
    void End(const std::string &text);
    void Line(const std::string &text);
    std::map<std::string, std::string> Files() const;

    const std::string golden_;
    const std::vector<Source> sources_;
    const std::vector<std::string> paths_;
    std::vector<std::pair<std::regex, std::string>> masks_ = {
        {std::regex("process [0-9]+ \\([^)]*\\)"), "process ..."}};  // that holds a lock
    std::map<std::string, std::string> files_;
    std::string text_;
};

#define TELL(...) story_.Tell(#__VA_ARGS__, [&] { return __VA_ARGS__; })

// Without the commands that match the pattern.
Story::Source CommandsOf(RecordedCommands &commands, const std::string &without = "");
// Without the lines below that priority.
Story::Source LogOf(CapturedLog &log, int least = LOG_DEBUG);
// Those of the calls that begin so.
Story::Source CallsOf(RecordedCalls &calls, const std::string &begin = "");

}  // namespace test

#endif
