// Takes the place of the shell: the library's commands are kept byte for byte, including redirections, and answered by
// the test. No program runs.
#ifndef TESTS_SUPPORT_RECORDED_COMMANDS_H
#define TESTS_SUPPORT_RECORDED_COMMANDS_H

#include <functional>
#include <string>
#include <vector>

namespace test {

struct CommandReply {
    int status = 0;
    std::string output = {};  // at most the size of a pipe, 64 KiB
};

class RecordedCommands {
  public:
    // The answer may depend on the command alone: the child process computes it, and its memory may not be the test's.
    using Answer = std::function<CommandReply(const std::string &command)>;

    explicit RecordedCommands(Answer answer = {});
    ~RecordedCommands();
    RecordedCommands(const RecordedCommands &) = delete;
    RecordedCommands &operator=(const RecordedCommands &) = delete;

    std::vector<std::string> Commands() const;
    void Clear();
    void OnCommand(Answer answer) { answer_ = std::move(answer); }

    [[noreturn]] void Run(const char *command);

  private:
    int Reply(const char *command) const;

    struct Log;

    Answer answer_;
    Log *log_;
};

}  // namespace test

#endif
