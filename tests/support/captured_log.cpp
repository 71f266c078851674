// Takes the place of syslog in a test program.
#include "support/captured_log.h"

#include <algorithm>
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

std::vector<std::string> CapturedLog::TakeTexts()
{
    std::vector<std::string> texts = Texts();
    lines_.clear();
    for (std::string &text : texts) {
        const size_t begin = text.find_first_of(":(") + 1;
        const size_t end = text.find_first_not_of("0123456789", begin);
        if (begin > 0 && end != begin)
            text.replace(begin, std::min(end, text.size()) - begin, "#");
    }
    return texts;
}

std::string CapturedLog::Take()
{
    std::string all;
    for (const std::string &text : TakeTexts())
        all += (all.empty() ? "" : "\n") + text;
    return all;
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
