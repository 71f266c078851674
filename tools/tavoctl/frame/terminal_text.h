// Text from files and arguments, made safe to look at.
#ifndef TAVOCTL_TERMINAL_TEXT_H
#define TAVOCTL_TERMINAL_TEXT_H

#include <string>
#include <string_view>
#include <vector>

namespace tavoctl {

// The text with every byte that a terminal could take for a command as "\xNN": control characters, bytes that are not
// UTF-8, and the invisible characters that change the direction of text. Line feeds too, unless keep_lines.
std::string Printable(std::string_view text, bool keep_lines = false);

// The texts with a separator between them.
std::string Joined(const std::vector<std::string> &texts, const char *separator);

}  // namespace tavoctl

#endif
