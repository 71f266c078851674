// One line on standard error about work that takes its time.
#include "frame/progress.h"

#include "frame/terminal_text.h"

#include <iostream>

#include <unistd.h>

namespace tavoctl {
namespace {

constexpr char erase_line[] = "\r\x1b[K";

}  // namespace

bool Progress::Visible()
{
    static const bool visible = ::isatty(STDERR_FILENO);
    return visible;
}

void Progress::Show(const std::string &state)
{
    if (!Visible())
        return;
    std::cerr << erase_line << Printable(what_ + ": " + state) << std::flush;
    shown_ = true;
}

Progress::~Progress()
{
    if (shown_)
        std::cerr << erase_line << std::flush;
}

}  // namespace tavoctl
