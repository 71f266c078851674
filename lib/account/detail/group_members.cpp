// Renames and deletions of users in the member lists of all groups.
#include "account/detail/group_members.h"

#include "tavo_error.h"

#include "account/detail/group_line.h"
#include "account/detail/store_family.h"

#include <utility>
#include <vector>

namespace tavo {
namespace {

// False when no member changes.
bool ChangeMembersOf(const MemberChange &change, GroupLine &group)
{
    std::vector<std::string> members;
    bool changed = false;
    for (std::string &member : group.members) {
        const char *value = change(member);
        if (!value)
            members.push_back(std::move(member));
        else if (*value)
            members.emplace_back(value);
        changed = changed || value;
    }
    group.members = std::move(members);
    return changed;
}

// The lines that are to be stored: a store is not changed while it is walked. Past the last group: 0.
Code Collect(StoreView &groups, const MemberChange &change, std::vector<std::pair<std::string, std::string>> &lines)
{
    std::string_view key;
    std::string_view value;
    Code code;
    for (Entry which = Entry::first; (code = groups.Walk(which, key, value)) == 0; which = Entry::next) {
        Result<GroupLine> group = ParseGroupLine(value);
        if (group && ChangeMembersOf(change, *group))
            lines.emplace_back(key, FormatGroupLine(*group).append(1, '\0'));
    }
    return code.Renaming(ERR_DB_END, ERR_SUCCESS);
}

}  // namespace

Code ChangeMembers(AccountSession &session, const MemberChange &change, bool &changed)
{
    std::vector<std::pair<std::string, std::string>> lines;
    changed = false;
    if (const Code code = Collect(*session.View(kGroupNameStore), change, lines))
        return code;
    if (lines.empty())
        return 0;
    changed = true;
    session.BeginChange();
    for (const auto &[key, line] : lines)
        if (const Code code = session.Store(kGroupNameStore)->Set(key, line))
            return code;
    return 0;
}

}  // namespace tavo
