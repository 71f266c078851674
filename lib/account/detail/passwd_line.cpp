// Reads and writes lines of /etc/passwd.
#include "account/detail/passwd_line.h"

#include "tavo_error.h"

#include "account/detail/colon_fields.h"

namespace tavo {

Result<PasswdLine> ParsePasswdLine(std::string_view text)
{
    const std::vector<std::string_view> fields = SplitColons(text);
    if (fields.size() != 7)
        return ERR_FORMAT_ERROR;
    if (fields[0].empty())
        return ERR_INVALID_USERNAME;
    const std::optional<int32_t> uid = FieldNumber(fields[2]);
    const std::optional<int32_t> gid = FieldNumber(fields[3]);
    if (!uid || !gid)
        return ERR_FORMAT_ERROR;
    return PasswdLine{std::string(fields[0]), *uid, *gid, DecodeColons(fields[4]), std::string(fields[5]),
                      std::string(fields[6])};
}

std::string FormatPasswdLine(const PasswdLine &line)
{
    std::string text = line.name + ":x:";
    text += std::to_string(line.uid) + ':' + std::to_string(line.gid) + ':';
    return text + EncodeColons(line.description.c_str()) + ':' + line.home + ':' + line.shell;
}

}  // namespace tavo
