// Takes the place of the shell: the library's commands are kept byte for byte, including redirections, and answered by
// the test. No program runs.
#ifndef TESTS_SUPPORT_RECORDED_COMMANDS_H
#define TESTS_SUPPORT_RECORDED_COMMANDS_H

#include <functional>
#include <map>
#include <string>
#include <vector>

namespace test {

struct CommandReply {
    int status = 0;           // below 0: a signal of that number kills it
    std::string output = {};  // at most the size of a pipe, 64 KiB
};

// As the library runs a command to whose output it does not listen.
inline std::string Quiet(const std::string &command)
{
    return command + " > /dev/null 2>&1";
}

class RecordedCommands {
  public:
    // The answer may depend on the command alone: the child process computes it, and its memory may not be the test's.
    using Answer = std::function<CommandReply(const std::string &command)>;

    explicit RecordedCommands(Answer answer = {});
    ~RecordedCommands();
    RecordedCommands(const RecordedCommands &) = delete;
    RecordedCommands &operator=(const RecordedCommands &) = delete;

    std::vector<std::string> Commands() const;
    std::vector<std::string> Take();  // those since the last call
    void Clear();
    void OnCommand(Answer answer) { answer_ = std::move(answer); }
    // These commands print these texts; every other one ends so.
    void Print(std::map<std::string, std::string> outputs, int other = 0)
    {
        answer_ = [=](const std::string &command) {
            const auto found = outputs.find(command);
            return found == outputs.end() ? CommandReply{other} : CommandReply{0, found->second};
        };
    }
    // Every command ends so.
    void Exit(int status)
    {
        answer_ = [status](const std::string &) {
            return CommandReply{status};
        };
    }
    // Only commands that contain the text end so.
    void Fail(const std::string &part, int status = 1)
    {
        answer_ = [=](const std::string &command) {
            return CommandReply{command.find(part) == command.npos ? 0 : status};
        };
    }

    [[noreturn]] void Run(const char *command);

  private:
    int Reply(const char *command) const;

    struct Log;

    Answer answer_;
    Log *log_;
};

}  // namespace test

#endif
