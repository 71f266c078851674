// Logs the standard error of tools that the library runs.
#include "core/detail/tool_words.h"

#include "core/detail/child_process.h"
#include "core/detail/log.h"
#include "core/detail/open_file.h"

#include <string_view>

#include <sys/mman.h>

namespace tavo {

ToolWords::ToolWords() noexcept : memory_(AboveStandard(Fd(::memfd_create("tool-words", MFD_CLOEXEC))))
{
}

ToolWords &ToolWords::operator=(ToolWords &&other) noexcept
{
    Log();
    memory_ = std::move(other.memory_);
    return *this;
}

ToolWords::~ToolWords()
{
    Log();
}

int ToolWords::Descriptor() const noexcept
{
    return memory_ ? memory_.Get() : kNullDevice;
}

void ToolWords::Log() const noexcept
{
    const KeepErrno keep;
    char text[2048];  // the rest of a tool's messages is repetition
    const ssize_t size = memory_ ? ::pread(memory_.Get(), text, sizeof text, 0) : 0;
    std::string_view words(text, size > 0 ? static_cast<size_t>(size) : 0);
    while (!words.empty()) {
        const std::string_view line = words.substr(0, words.find('\n'));
        words.remove_prefix(std::min(line.size() + 1, words.size()));
        if (!line.empty())
            LogDebug("%s:%d %s", line);
    }
}

}  // namespace tavo
