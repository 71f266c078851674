// Runs a composed command line through the shell and returns its standard output line by line.
//
//     CommandOutput output(*command);
//     for (std::string line; output.Next(line);)
//         ...
//     if (output.Status() != 0)
#ifndef TAVO_CORE_DETAIL_COMMAND_OUTPUT_H
#define TAVO_CORE_DETAIL_COMMAND_OUTPUT_H

#include "core/detail/child_status.h"
#include "core/detail/owner.h"
#include "core/detail/tool_words.h"

#include <optional>
#include <string>

namespace tavo {

class CommandOutput {
  public:
    // Starts the command in the environment that run_command.h describes. The destructor logs the command's standard
    // error. Throws bad_alloc.
    explicit CommandOutput(const std::string &command);

    // Waits for the command's end; a command that still writes to its output dies by SIGPIPE.
    ~CommandOutput();
    CommandOutput(const CommandOutput &) = delete;
    CommandOutput &operator=(const CommandOutput &) = delete;

    // Reads the next line without its newline; false at the end. A last line without newline counts. Throws bad_alloc.
    bool Next(std::string &line);

    // Skips unread output and waits for the end: the exit status, or -1 when the command could not be run or was killed
    // by a signal.
    int Status() noexcept;

  private:
    bool Fill() noexcept;
    int Collect() noexcept;

    ToolWords words_;
    KeepChildStatus keep_;
    Fd read_;
    pid_t pid_ = -1;
    std::optional<int> status_;
    size_t begin_ = 0;
    size_t end_ = 0;
    char buffer_[4096];
};

}  // namespace tavo

#endif
