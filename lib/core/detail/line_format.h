// The line format of a settings file: a caller's text with the places of the key and of the value. It never reaches
// printf, where "%n" or a third "%s" would write and read memory.
#ifndef TAVO_CORE_DETAIL_LINE_FORMAT_H
#define TAVO_CORE_DETAIL_LINE_FORMAT_H

#include <optional>
#include <string>
#include <string_view>

namespace tavo {

inline constexpr const char *kLineFormat = "%s=%s\n";

// Returns the line for a key and a value; a NULL format is the default one. Empty when the format holds anything but
// two "%s" and any number of "%%".
std::optional<std::string> FormatLine(const char *format, std::string_view key, std::string_view value);

}  // namespace tavo

#endif
