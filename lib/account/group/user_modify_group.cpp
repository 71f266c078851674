// Applies renames and deletions of users to the member lists of all groups.
#include "tavo_group.h"

#include "account/detail/account_name.h"
#include "account/detail/group_commit.h"
#include "account/detail/group_texts.h"
#include "core/detail/guard.h"
#include "tavo_lock.h"

namespace {

// False when no member is named in the hash.
bool ChangeMembers(const TLIBSZHASH *names, tavo::GroupLine &group)
{
    std::vector<std::string> members;
    bool changed = false;
    for (std::string &member : group.members) {
        const std::optional<std::string> key = tavo::AccountKey(member);
        const char *value = key ? SzTLIBSzHashGetValue(names, key->c_str()) : nullptr;
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
int Collect(tavo::Btree &groups, const TLIBSZHASH *names, std::vector<std::pair<std::string, std::string>> &lines)
{
    std::string_view key;
    std::string_view value;
    int code;
    for (tavo::Entry which = tavo::Entry::kFirst; (code = groups.Walk(which, key, value)) == 0;
         which = tavo::Entry::kNext) {
        tavo::GroupLine group;
        if (tavo::ParseGroupLine(value, group) == 0 && ChangeMembers(names, group))
            lines.emplace_back(key, tavo::FormatGroupLine(group).append(1, '\0'));
    }
    return code == ERR_DB_END ? 0 : code;
}

}  // namespace

extern "C" int TAVOUserModifyGroup(const TLIBSZHASH *pshNames)
{
    if (!pshNames)
        return Fail(ERR_BAD_PARAMETERS);
    return Guard([&] {
        tavo::AccountSession session(tavo::kGroupKind);
        if (const int code = session.OpenToChange(TAVO_LOCK_GROUP))
            return Fail(code);
        tavo::Btree &groups = *session.Store(tavo::kGroupNameStore);
        std::vector<std::pair<std::string, std::string>> lines;
        if (const int code = Collect(groups, pshNames, lines))
            return Fail(code);
        if (!lines.empty()) {
            session.BeginChange();
            for (const auto &[key, line] : lines)
                if (const int code = groups.Set(key, line))
                    return Fail(code);
            if (const int code = tavo::CommitGroups(session))
                return Fail(code);
        }
        return session.Unlock() ? 0 : Fail(ERR_UNLOCK_FAILED);
    });
}
