// A line of /etc/group, and one of /etc/group_desc.
#ifndef TAVO_ACCOUNT_DETAIL_GROUP_LINE_H
#define TAVO_ACCOUNT_DETAIL_GROUP_LINE_H

#include "core/detail/result.h"

#include <cstdint>
#include <string>
#include <string_view>
#include <vector>

namespace tavo {

struct GroupLine {
    std::string name;
    int32_t gid = -1;
    std::vector<std::string> members;
};

// ERR_FORMAT_ERROR when there are not four fields with a number, ERR_INVALID_GROUPNAME when the name is empty.
// Members that are no members of anything are left out: see IsMember.
Result<GroupLine> ParseGroupLine(std::string_view text);

std::string FormatGroupLine(const GroupLine &line);

std::string FormatGroupDescLine(std::string_view name, std::string_view description);
std::string_view GroupDescription(std::string_view line);

// "nobody" is never a group member. Empty names (stray commas) are skipped.
bool IsMember(std::string_view name);

// Every user is in "users", so its members are not listed.
bool IsEverybody(std::string_view group_key);

}  // namespace tavo

#endif
