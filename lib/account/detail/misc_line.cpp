// Reads and writes lines of /etc/tavouser.conf.
#include "account/detail/misc_line.h"

#include "tavo_error.h"

#include "account/detail/colon_fields.h"

namespace tavo {

Result<MiscLine> ParseMiscLine(std::string_view text)
{
    const std::vector<std::string_view> fields = SplitColons(text);
    if (fields.size() != 3)
        return ERR_FORMAT_ERROR;
    return MiscLine{std::string(fields[0]), FieldNumber(fields[1]).value_or(0), std::string(fields[2])};
}

std::string FormatMiscLine(const MiscLine &line)
{
    return line.name + ':' + std::to_string(line.privilege) + ':' + line.mail;
}

std::string FormatMarkerLine(std::string_view marker, int32_t id)
{
    return std::string("#$").append(marker) + '$' + std::to_string(id) + "$\n";
}

std::optional<int32_t> ParseMarkerLine(std::string_view line, std::string_view marker)
{
    const std::string begin = std::string("#$").append(marker) + '$';
    if (!line.starts_with(begin))
        return std::nullopt;
    line.remove_prefix(begin.size());
    const size_t end = line.find('$');
    return end == std::string_view::npos ? std::nullopt : FieldNumber(line.substr(0, end));
}

}  // namespace tavo
