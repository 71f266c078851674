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

}  // namespace

Code ListGroups(int flags, const KeyFilter &wanted, std::vector<std::string> &names)
{
    if ((flags & (TAVO_GROUP_LOCAL | TAVO_GROUP_DOMAIN)) == 0)
        return ERR_BAD_PARAMETERS;
    AccountSession session(kGroupKind);
    if (const Code code = session.OpenToRead(std::array{size_t{kGroupNameStore}}))
        return code;
    StoreView &groups = *session.View(kGroupNameStore);
    std::string_view key;
    std::string_view value;
    Code code;
    for (Entry which = Entry::first; (code = groups.Walk(which, key, value)) == 0; which = Entry::next) {
        const Result<GroupLine> group = ParseGroupLine(value);
        if (!group)
            continue;
        const int kind = IsDomainName(group->name) ? TAVO_GROUP_DOMAIN : TAVO_GROUP_LOCAL;
        if ((flags & kind) != 0 && IsListed(*group, flags) && wanted(key.substr(0, key.find('\0'))))
            names.push_back(group->name);
    }
    return code == ERR_DB_END ? Code() : code == ERR_OUT_OF_MEMORY ? code : Code(ERR_ENUM_FAILED);
}

std::optional<std::string> GroupFilterText(const char *text)
{
    std::optional<std::string> key = AccountKey(text, kGroupKeySize);
    if (key)
        key->pop_back();
    return key;
}

}  // namespace tavo
