// The system log: one line a failure or trace, module and line first, exactly as support staff know it.
//
//     LogError("%s:%d Failed to open %s", path);            the line where this call is
//     LogError({"%s:%d Parameter error", 37});              a published line
//     LogErrorAt(where, "%s:%d Failed to open %s", path);   the caller's place
//
// The first two conversions are the module and the line. Control characters in arguments are written as \xNN, so that
// no name from a disk or from the network can forge a line of its own.
#ifndef TAVO_CORE_DETAIL_LOG_H
#define TAVO_CORE_DETAIL_LOG_H

#include "core/detail/checked_format.h"
#include "core/detail/text_format.h"
#include "core/detail/where.h"

#include <initializer_list>

#include <syslog.h>

namespace tavo {

template <ArgKind... kinds>
class LogFormat {
  public:
    template <class Text>
    consteval LogFormat(const Text &text, Where where = Where()) : format_(text), where_(where)
    {
    }
    template <class Text>
    consteval LogFormat(const Text &text, int published_line, const char *file = __builtin_FILE())
        : format_(text), where_(file, published_line)
    {
    }

    constexpr const char *Text() const noexcept { return format_.Text(); }
    constexpr const Where &Place() const noexcept { return where_; }

  private:
    CheckedFormat<ArgKind::text, ArgKind::number, kinds...> format_;
    Where where_;
};

template <class... Args>
using LogFormatFor = LogFormat<kArgKind<Args>...>;

// Never fails and allocates nothing; a line longer than 1023 bytes is cut. Keeps errno.
void WriteLog(int priority, const char *format, std::initializer_list<TextArg> args) noexcept;

// The same for the few lines that name neither module nor line.
template <class... Args>
void LogBare(FormatFor<Args...> format, const Args &...args) noexcept
{
    WriteLog(LOG_ERR, format.Text(), {args...});
}

template <class... Args>
void LogErrorAt(const Where &where, FormatFor<const char *, int, Args...> format, const Args &...args) noexcept
{
    WriteLog(LOG_ERR, format.Text(), {ModuleOf(where), where.line, args...});
}

template <class... Args>
void LogError(LogFormatFor<Args...> what, const Args &...args) noexcept
{
    WriteLog(LOG_ERR, what.Text(), {ModuleOf(what.Place()), what.Place().line, args...});
}

template <class... Args>
void LogNotice(LogFormatFor<Args...> what, const Args &...args) noexcept
{
    WriteLog(LOG_NOTICE, what.Text(), {ModuleOf(what.Place()), what.Place().line, args...});
}

template <class... Args>
void LogDebug(LogFormatFor<Args...> what, const Args &...args) noexcept
{
    WriteLog(LOG_DEBUG, what.Text(), {ModuleOf(what.Place()), what.Place().line, args...});
}

}  // namespace tavo

using tavo::LogDebug;
using tavo::LogError;
using tavo::LogErrorAt;
using tavo::LogNotice;

#endif
