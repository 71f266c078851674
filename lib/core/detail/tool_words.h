// What a tool says on its standard error while it runs for the library. It goes to the system log, at debug priority, when
// this object goes: after the lines of the function that ran the tool, and never to the caller's own standard error.
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

    // The standard error of the tool's process.
    int Descriptor() const noexcept;

  private:
    void Log() const noexcept;

    Fd memory_;  // a file without a name; none where the kernel has no such files: then the words are lost
};

}  // namespace tavo

#endif
