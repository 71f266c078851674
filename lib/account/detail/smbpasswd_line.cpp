// Reads and writes lines of Samba's password file.
#include "account/detail/smbpasswd_line.h"

#include "tavo_error.h"

#include "account/detail/colon_fields.h"

#include <algorithm>
#include <cstdio>

namespace tavo {
namespace {

constexpr size_t kSmbFlags = 11;  // between the brackets, with blanks

}  // namespace

Result<SmbpasswdLine> ParseSmbpasswdLine(std::string_view text)
{
    const std::vector<std::string_view> fields = SplitColons(text);
    if (fields.size() != 7)
        return ERR_FORMAT_ERROR;
    return SmbpasswdLine{std::string(fields[0]), FieldNumber(fields[1]).value_or(-1),
                         std::string(fields[2]), std::string(fields[3]),
                         std::string(fields[4]), std::string(fields[5])};
}

std::string FormatSmbpasswdLine(const SmbpasswdLine &line)
{
    return line.name + ':' + std::to_string(line.uid) + ':' + line.lm_hash + ':' + line.nt_hash + ':' + line.flags +
           ':' + line.changed + ':';
}

std::string WithDisabledFlag(std::string_view flags, bool disabled)
{
    std::string letters;
    for (const char flag : flags)
        if (flag != '[' && flag != ']' && flag != ' ' && flag != 'D')
            letters += flag;
    if (disabled)
        letters.insert(letters.starts_with('N') ? 1 : 0, 1, 'D');  // the order in which Samba writes them
    letters.resize(std::max(letters.size(), kSmbFlags), ' ');
    return '[' + letters + ']';
}

bool HasDisabledFlag(std::string_view flags)
{
    return flags.find('D') != std::string_view::npos;
}

std::string SmbChangeTime(time_t now)
{
    char text[16];
    std::snprintf(text, sizeof text, "LCT-%08X", static_cast<uint32_t>(now));
    return text;
}

std::string SmbHexHash(const unsigned char *hash)
{
    char text[33];
    for (int i = 0; i < 16; ++i)
        std::snprintf(text + 2 * i, 3, "%02X", hash[i]);
    return text;
}

bool IsSmbHash(std::string_view text)
{
    return text.size() == 32 && text.find_first_not_of("0123456789ABCDEFabcdef") == std::string_view::npos;
}

}  // namespace tavo
