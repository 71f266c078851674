// Reads and writes lines of the group files.
#include "account/detail/group_line.h"

#include "tavo_error.h"

#include "account/detail/colon_fields.h"
#include "core/detail/text_fields.h"

namespace tavo {

Result<GroupLine> ParseGroupLine(std::string_view text)
{
    const std::vector<std::string_view> fields = SplitColons(text);
    if (fields.size() != 4)
        return ERR_FORMAT_ERROR;
    if (fields[0].empty())
        return ERR_INVALID_GROUPNAME;
    const std::optional<int32_t> gid = FieldNumber(fields[2]);
    if (!gid)
        return ERR_FORMAT_ERROR;
    GroupLine line{std::string(fields[0]), *gid, {}};
    for (std::string_view rest = fields[3]; !rest.empty();) {
        if (const std::string_view member = TakeUntil(rest, ','); IsMember(member))
            line.members.emplace_back(member);
    }
    return line;
}

std::string FormatGroupLine(const GroupLine &line)
{
    std::string text = line.name + ":x:" + std::to_string(line.gid) + ':';
    const char *separator = "";
    for (const std::string &member : line.members) {
        text.append(separator).append(member);
        separator = ",";
    }
    return text;
}

std::string FormatGroupDescLine(std::string_view name, std::string_view description)
{
    return std::string(name).append(":").append(description);
}

std::string_view GroupDescription(std::string_view line)
{
    line = line.substr(0, line.find('\0'));
    const size_t colon = line.find(':');
    return colon == line.npos ? std::string_view() : line.substr(colon + 1);
}

bool IsMember(std::string_view name)
{
    return !name.empty() && name != "nobody";
}

bool IsEverybody(std::string_view group_key)
{
    return group_key.substr(0, group_key.find('\0')) == "USERS";
}

}  // namespace tavo
