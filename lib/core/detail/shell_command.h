// Composes command lines for the shell from fixed formats.
//
// An argument of plain characters is inserted unchanged, so that the command is byte for byte the one that
// administrators find in logs and use in scripts. Any other argument is quoted, so that no name, path or address
// becomes shell syntax.
//
//     ShellCommand("/sbin/pvresize %s > /dev/null 2>&1", device)
#ifndef TAVO_CORE_DETAIL_SHELL_COMMAND_H
#define TAVO_CORE_DETAIL_SHELL_COMMAND_H

#include "core/detail/checked_format.h"
#include "core/detail/text_format.h"

#include <initializer_list>
#include <optional>
#include <string>
#include <string_view>
#include <type_traits>

namespace tavo {

// A piece of the command that the library itself composed, such as a fixed option or a list of quoted devices. It is
// inserted unquoted and may start with "-". Never for text from outside.
struct ComposedPiece {
    std::string_view text;
};

std::optional<std::string> ComposeShellCommand(const char *format, std::initializer_list<TextArg> args,
                                               std::initializer_list<bool> composed);

inline TextArg AsTextArg(const ComposedPiece &piece)
{
    return piece.text;
}

template <class Value>
TextArg AsTextArg(const Value &value)
{
    return value;
}

// Formats as FormatText does; "%s" may be inside single quotes. Empty when a text argument contains a NUL byte or
// starts with "-", where a program would read it as an option. Throws bad_alloc.
template <class... Args>
std::optional<std::string> ShellCommand(FormatFor<Args...> format, const Args &...args)
{
    return ComposeShellCommand(format.Text(), {AsTextArg(args)...}, {std::is_same_v<Args, ComposedPiece>...});
}

// Returns the text as one word of the shell: unchanged when all its characters are plain, else quoted.
std::string ShellQuoted(std::string_view text);

}  // namespace tavo

#endif
