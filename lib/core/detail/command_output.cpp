// Runs a composed command line through the shell and returns its standard output line by line.
#include "core/detail/command_output.h"

#include "core/detail/open_file.h"
#include "core/detail/run_command.h"

#include <cstring>

#include <fcntl.h>

namespace tavo {

CommandOutput::CommandOutput(const std::string &command)
{
    int ends[2];
    if (::pipe2(ends, O_CLOEXEC) != 0)
        return;
    Fd low_read(ends[0]);
    const Fd write = AboveStandard(Fd(ends[1]));
    read_ = AboveStandard(std::move(low_read));
    if (read_ && write)
        pid_ = StartCommand(command, write.Get(), words_.Descriptor());
    if (pid_ < 0)
        read_.Reset();
}

CommandOutput::~CommandOutput()
{
    Collect();
}

bool CommandOutput::Next(std::string &line)
{
    line.clear();
    for (;;) {
        if (begin_ == end_ && !Fill())
            return !line.empty();
        const char *const start = buffer_ + begin_;
        const char *const newline = static_cast<const char *>(std::memchr(start, '\n', end_ - begin_));
        const size_t length = newline ? static_cast<size_t>(newline - start) : end_ - begin_;
        line.append(start, length);
        begin_ += length + (newline ? 1 : 0);
        if (newline)
            return true;
    }
}

int CommandOutput::Status() noexcept
{
    while (Fill()) {
    }
    return Collect();
}

bool CommandOutput::Fill() noexcept
{
    begin_ = end_ = 0;
    while (read_) {
        const ssize_t got = ::read(read_.Get(), buffer_, sizeof buffer_);
        if (got > 0) {
            end_ = static_cast<size_t>(got);
            return true;
        }
        if (got == 0 || errno != EINTR)
            read_.Reset();
    }
    return false;
}

int CommandOutput::Collect() noexcept
{
    read_.Reset();
    if (!status_)
        status_ = pid_ < 0 ? -1 : CollectChild(pid_);
    return *status_;
}

}  // namespace tavo
