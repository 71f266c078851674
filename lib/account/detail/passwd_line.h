// A line of /etc/passwd.
#ifndef TAVO_ACCOUNT_DETAIL_PASSWD_LINE_H
#define TAVO_ACCOUNT_DETAIL_PASSWD_LINE_H

#include "core/detail/result.h"

#include <cstdint>
#include <string>
#include <string_view>

namespace tavo {

struct PasswdLine {
    std::string name;
    int32_t uid = -1;
    int32_t gid = -1;
    std::string description;  // as people read it: its colons are encoded in the line only
    std::string home;
    std::string shell;
};

// ERR_FORMAT_ERROR when there are not seven fields with two numbers, ERR_INVALID_USERNAME when the name is empty.
Result<PasswdLine> ParsePasswdLine(std::string_view text);

std::string FormatPasswdLine(const PasswdLine &line);

}  // namespace tavo

#endif
