// A line of Samba's password file.
#ifndef TAVO_ACCOUNT_DETAIL_SMBPASSWD_LINE_H
#define TAVO_ACCOUNT_DETAIL_SMBPASSWD_LINE_H

#include "core/detail/result.h"

#include <cstdint>
#include <ctime>
#include <string>
#include <string_view>

namespace tavo {

struct SmbpasswdLine {
    std::string name;
    int32_t uid = -1;
    std::string lm_hash;  // 32 hexadecimal digits each, or 32 "X" for an account without a Samba password
    std::string nt_hash;
    std::string flags = "[U          ]";
    std::string changed;  // "LCT-" and the seconds as 8 hexadecimal digits
};

// Replaces both hashes when there are none: Samba then refuses every login.
inline constexpr char kNoSmbHash[] = "XXXXXXXXXXXXXXXXXXXXXXXXXXXXXXXX";

// ERR_FORMAT_ERROR when there are not seven fields.
Result<SmbpasswdLine> ParseSmbpasswdLine(std::string_view text);

std::string FormatSmbpasswdLine(const SmbpasswdLine &line);

// The flags with the one of a disabled account ("D") set or cleared.
std::string WithDisabledFlag(std::string_view flags, bool disabled);
bool HasDisabledFlag(std::string_view flags);

std::string SmbChangeTime(time_t now);              // the field `changed`
std::string SmbHexHash(const unsigned char *hash);  // 16 bytes as 32 digits
bool IsSmbHash(std::string_view text);              // 32 hexadecimal digits

}  // namespace tavo

#endif
