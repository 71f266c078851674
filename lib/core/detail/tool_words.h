// The standard error of a tool that the library runs. The destructor writes it to the system log at debug priority:
// after the lines of the function that ran the tool, and never to the caller's own standard error.
#ifndef TAVO_CORE_DETAIL_TOOL_WORDS_H
#define TAVO_CORE_DETAIL_TOOL_WORDS_H

#include "core/detail/owner.h"

namespace tavo {

class ToolWords {
  public:
    ToolWords() noexcept;
    ToolWords(ToolWords &&) = default;
    ToolWords &operator=(ToolWords &&other) noexcept;
    ~ToolWords();

    // Returns the descriptor to be the tool's standard error.
    int Descriptor() const noexcept;

  private:
    void Log() const noexcept;

    Fd memory_;  // a file without a name; where the kernel has no such files, the messages are lost
};

}  // namespace tavo

#endif
