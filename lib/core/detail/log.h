// The system log: one line a failure or trace, module and line first, exactly as support staff know it.
//
//     LogError("%s:%d Failed to open %s", path);            the line where this stands
//     LogError({"%s:%d Parameter error", 37});              a published line
//
// The first two conversions are the module and the line. Control characters in arguments are written as \xNN, so that
// no name from a disk or from the network can forge a line of its own.
#ifndef TAVO_CORE_DETAIL_LOG_H
#define TAVO_CORE_DETAIL_LOG_H

#include "core/detail/fault.h"
#include "core/detail/text_format.h"

#include <initializer_list>

#include <syslog.h>

namespace tavo {

struct LogFormat {
    constexpr LogFormat(const char *format_text, int line_number = __builtin_LINE()) noexcept
        : format(format_text), line(line_number)
    {
    }

    const char *format;
    int line;
};

// Never fails and allocates nothing; a line longer than 1023 bytes is cut. Keeps errno.
void WriteLog(int priority, const char *format, std::initializer_list<TextArg> args) noexcept;

namespace {

template <class... Args>
void LogError(LogFormat what, const Args &...args) noexcept
{
    WriteLog(LOG_ERR, what.format, {kModule, what.line, args...});
}

template <class... Args>
void LogDebug(LogFormat what, const Args &...args) noexcept
{
    WriteLog(LOG_DEBUG, what.format, {kModule, what.line, args...});
}

}  // namespace

}  // namespace tavo

using tavo::LogDebug;
using tavo::LogError;

#endif
