// Takes the place of syslog in a test program.
#include "support/captured_log.h"

#include <cstdarg>
#include <cstdio>

namespace test {

// Defined where a test program refuses allocations: what the log keeps is not an allocation of the call.
[[gnu::weak]] bool PauseFailing(bool paused) noexcept;

namespace {

CapturedLog *current = nullptr;

}  // namespace

CapturedLog::CapturedLog()
{
    current = this;
}

CapturedLog::~CapturedLog()
{
    current = nullptr;
}

std::vector<std::string> CapturedLog::Texts() const
{
    std::vector<std::string> texts;
    for (const LoggedLine &line : lines_)
        texts.push_back(line.text);
    return texts;
}

}  // namespace test

namespace {

[[gnu::format(printf, 2, 0)]] void Keep(int priority, const char *format, va_list args)
{
    if (!test::current)
        return;
    char text[4096];
    std::vsnprintf(text, sizeof text, format, args);
    const bool before = test::PauseFailing && test::PauseFailing(true);
    test::current->Add(priority, text);
    if (test::PauseFailing)
        test::PauseFailing(before);
}

}  // namespace

// The plain name and the one that a fortified build calls.
extern "C" {

[[gnu::format(printf, 2, 3)]] void syslog(int priority, const char *format, ...)
{
    va_list args;
    va_start(args, format);
    Keep(priority, format, args);
    va_end(args);
}

[[gnu::format(printf, 3, 4)]] void __syslog_chk(int priority, int, const char *format, ...)
{
    va_list args;
    va_start(args, format);
    Keep(priority, format, args);
    va_end(args);
}
}
