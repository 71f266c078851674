// A line of /etc/shadow.
#ifndef TAVO_ACCOUNT_DETAIL_SHADOW_LINE_H
#define TAVO_ACCOUNT_DETAIL_SHADOW_LINE_H

#include "core/detail/result.h"

#include <cstdint>
#include <ctime>
#include <optional>
#include <string>
#include <string_view>

namespace tavo {

inline constexpr int64_t kSecondsOfDay = 86400;  // the file counts in days

struct ShadowLine {
    std::string name;
    std::string hash;
    int32_t expire = -1;         // last valid day; negative: never expires
    bool cannot_change = false;  // the user may not change the password
};

// ERR_FORMAT_ERROR when there are not nine fields.
Result<ShadowLine> ParseShadowLine(std::string_view text);

// A line as of now. The flag is written as a minimum age above the maximum one: that makes passwd refuse every change.
std::string FormatShadowLine(const ShadowLine &line, time_t now);

// The same line with another hash; every other field is kept, except that the warning period becomes 7 days.
// ERR_FORMAT_ERROR as above.
Result<std::string> ReplaceShadowHash(std::string_view text, std::string_view hash);

// Days; nothing: as before.
struct ShadowAges {
    std::optional<int32_t> least;
    std::optional<int32_t> most;
    std::optional<int32_t> warning;
};

// The same line with other ages. ERR_FORMAT_ERROR as above; ERR_BAD_PARAMETERS when the least age would reach the most, or
// does and shall change: that is the flag of an account whose password is fixed.
Result<std::string> ReplaceShadowAges(std::string_view text, const ShadowAges &ages);

// The same line with a "!" before the hash, which no password fits, or without. ERR_FORMAT_ERROR as above; ERR_BAD_PARAMETERS
// when there is nothing that could be unlocked: no hash, or "*".
Result<std::string> ReplaceShadowLock(std::string_view text, bool locked);

inline bool IsLockedHash(std::string_view hash)
{
    return hash.starts_with('!');
}

}  // namespace tavo

#endif
