// Which groups an enumeration lists.
#include "account/detail/group_enumeration.h"

#include "tavo_group.h"

#include "account/detail/account_name.h"
#include "account/detail/account_session.h"
#include "account/detail/group_line.h"
#include "account/detail/group_texts.h"

#include <array>

namespace tavo {
namespace {

// Local groups of the system itself are hidden, except "users".
bool IsListed(const GroupLine &group, int flags)
{
    if (group.gid == 0 && group.name != "root")
        return false;
    return (flags & TAVO_GROUP_LOCAL) == 0 || IsDomainName(group.name) || group.gid == -1 ||
           group.gid >= TAVO_GROUP_GID_MIN || group.name == "users";
}

Result<AccountNames> ListGroups(int flags, const KeyFilter &wanted)
{
    if ((flags & (TAVO_GROUP_LOCAL | TAVO_GROUP_DOMAIN)) == 0)
        return ERR_BAD_PARAMETERS;
    AccountSession session(kGroupKind);
    if (const Code code = session.OpenToRead(std::array{size_t{kGroupNameStore}}))
        return code;
    return NamesIn(*session.View(kGroupNameStore), wanted, [&](std::string_view line) -> std::optional<std::string> {
        const Result<GroupLine> group = ParseGroupLine(line);
        const int kind = group && IsDomainName(group->name) ? TAVO_GROUP_DOMAIN : TAVO_GROUP_LOCAL;
        return group && (flags & kind) != 0 && IsListed(*group, flags) ? std::optional(group->name) : std::nullopt;
    });
}

}  // namespace

constexpr NameSource kGroupNames{kGroupKeySize, ListGroups};

}  // namespace tavo
