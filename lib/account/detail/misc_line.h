// /etc/tavouser.conf: facts that do not fit into the other files.
#ifndef TAVO_ACCOUNT_DETAIL_MISC_LINE_H
#define TAVO_ACCOUNT_DETAIL_MISC_LINE_H

#include "core/detail/result.h"

#include <cstdint>
#include <optional>
#include <string>
#include <string_view>

namespace tavo {

struct MiscLine {
    std::string name;
    int32_t privilege = 0;
    std::string mail;
};

inline constexpr char kUidMarker[] = "_@UID__INDEX@_";
inline constexpr char kGidMarker[] = "_@GID__INDEX@_";
inline constexpr char kMiscComment[] = "# record user misc, format \"user_name:user_privilege:user_mail\"\n";

// ERR_FORMAT_ERROR when there are not three fields. A privilege that is not a number reads as 0.
Result<MiscLine> ParseMiscLine(std::string_view text);

std::string FormatMiscLine(const MiscLine &line);

// The first line of a file, which holds the id assigned last: "#$_@UID__INDEX@_$1024$\n".
std::string FormatMarkerLine(std::string_view marker, int32_t id);
std::optional<int32_t> ParseMarkerLine(std::string_view line, std::string_view marker);

}  // namespace tavo

#endif
