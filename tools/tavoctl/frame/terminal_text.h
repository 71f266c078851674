// Text from files and arguments, made safe to look at.
#ifndef TAVOCTL_TERMINAL_TEXT_H
#define TAVOCTL_TERMINAL_TEXT_H

#include <cstddef>
#include <string>
#include <string_view>

namespace tavoctl {

// The text with every byte that a terminal could take for a command as "\xNN": control characters, what is not UTF-8,
// and the invisible characters that turn the direction of text around. Line feeds too, unless keep_lines.
std::string Printable(std::string_view text, bool keep_lines = false);

// How many columns printable text takes: its characters are counted, and double-width ones as one.
std::size_t Columns(std::string_view text);

}  // namespace tavoctl

#endif
