// The terminal that standard output or standard error goes to.
#include "frame/terminal.h"

#include "frame/text.h"

#include <algorithm>
#include <clocale>
#include <csignal>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <iostream>

#include <langinfo.h>
#include <sys/ioctl.h>
#include <unistd.h>

namespace tavoctl {
namespace {

constexpr int usual_width = 80;

winsize Size()
{
    winsize size = {};
    if (::ioctl(STDOUT_FILENO, TIOCGWINSZ, &size) != 0)
        size = {};
    return size;
}

bool IsSet(const char *name)
{
    const char *value = std::getenv(name);
    return value && *value;
}

constexpr char erase_line[] = "\r\x1b[K";

}  // namespace

int Terminal::Width()
{
    if (!::isatty(STDOUT_FILENO))
        return 0;
    const int width = Size().ws_col;
    return width > 0 ? width : usual_width;
}

bool Terminal::HasColours()
{
    const char *kind = std::getenv("TERM");
    return ::isatty(STDOUT_FILENO) && !IsSet("NO_COLOR") && kind && std::strcmp(kind, "dumb") != 0;
}

void Terminal::UseUtf8()
{
    if (!std::setlocale(LC_CTYPE, "") || std::strcmp(::nl_langinfo(CODESET), "UTF-8") != 0)
        std::setlocale(LC_CTYPE, "C.UTF-8");
}

void Terminal::Page(const std::string &text)
{
    const auto lines = std::count(text.begin(), text.end(), '\n');
    const int height = ::isatty(STDOUT_FILENO) && ::isatty(STDIN_FILENO) ? Size().ws_row : 0;
    const char *pager = std::getenv("PAGER");
    if (height <= 0 || lines < height || (pager && (!*pager || std::strcmp(pager, "cat") == 0))) {
        std::cout << text;
        return;
    }
    std::cout.flush();
    ::setenv("LESS", "FRX", 0);  // as git does: colours, and the text stays on the screen
    std::FILE *pipe = ::popen(pager ? pager : "less", "we");
    if (!pipe) {
        std::cout << text;
        return;
    }
    // A user who has read enough closes the pager, which must not end this program. Set only now: the pager starts with the
    // signal's default.
    const auto before = ::signal(SIGPIPE, SIG_IGN);
    (void)!std::fwrite(text.data(), 1, text.size(), pipe);
    const int status = ::pclose(pipe);
    ::signal(SIGPIPE, before);
    constexpr int no_such_program = 127;
    if (WIFEXITED(status) && WEXITSTATUS(status) == no_such_program)
        std::cout << text;
}

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
