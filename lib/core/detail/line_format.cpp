// Fills a key and a value into a line format.
#include "core/detail/line_format.h"

namespace tavo {

std::optional<std::string> FormatLine(const char *format, std::string_view key, std::string_view value)
{
    std::string_view rest = format ? format : kLineFormat;
    std::string line;
    line.reserve(rest.size() + key.size() + value.size());
    int filled = 0;
    for (size_t percent; (percent = rest.find('%')) != rest.npos; rest.remove_prefix(percent + 2)) {
        line += rest.substr(0, percent);
        const std::string_view conversion = rest.substr(percent, 2);
        if (conversion == "%%")
            line += '%';
        else if (conversion == "%s" && filled < 2)
            line += filled++ == 0 ? key : value;
        else
            return std::nullopt;
    }
    if (filled != 2)
        return std::nullopt;
    return line += rest;
}

}  // namespace tavo
