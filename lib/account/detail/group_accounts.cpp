// Reads, stores and removes one group in the open stores of the group family.
#include "account/detail/group_accounts.h"

#include "account/detail/account_name.h"
#include "account/detail/account_session.h"
#include "account/detail/colon_fields.h"
#include "account/detail/group_texts.h"

namespace tavo {
namespace {

// Programs read these lines with buffers of a fixed size.
constexpr size_t kLongestField = 512;

bool FitsInMembers(std::string_view name)
{
    return name.size() <= kLongestField && FitsInField(name, true) && name.find(',') == name.npos && !IsDotName(name);
}

Code TakeMembers(const TAVOGROUP &group, GroupChange &change)
{
    for (char *const *member = group.rgszMember; member && *member; ++member) {
        if (!FitsInMembers(*member))
            return ERR_BAD_PARAMETERS;
        if (IsMember(*member) && !IsEverybody(change.key))
            change.line.members.emplace_back(*member);
    }
    return 0;
}

Code FindOld(const TAVOGROUPDB &db, const char *old_name, GroupChange &change)
{
    const std::optional<std::string> key = AccountKey(old_name, kGroupKeySize);
    if (!key || IsDomainName(old_name))  // a domain's group lives there
        return ERR_NO_SUCH_GROUP;
    const Result<GroupLine> old = ReadGroupLine(db, *key);
    if (!old)
        return old.Failure();
    change.old_key = *key;
    change.old_name = old->name;
    change.old_gid = old->gid;
    return 0;
}

}  // namespace

TAVOGROUPDB GroupDb(const AccountSession &session)
{
    return {session.Store(kGroupNameStore), session.Store(kGidStore), session.Store(kDescStore)};
}

Result<GroupLine> ReadGroupLine(const StoreView &names, std::string_view key)
{
    return ReadLine(names, key, ParseGroupLine).Renaming(ERR_KEY_NOT_FOUND, ERR_NO_SUCH_GROUP);
}

Result<GroupLine> ReadGroupLine(const TAVOGROUPDB &db, std::string_view key)
{
    return ReadGroupLine(*Btree::Of(db.pName), key);
}

Result<std::string> FindGroupKey(const AccountSession &session, int32_t gid)
{
    const auto has_id = [](std::string_view text, int32_t id) {
        const Result<GroupLine> line = ParseGroupLine(text);
        return line && line->gid == id;
    };
    return FindKeyById(*session.View(kGidStore), *session.View(kGroupNameStore), gid, has_id)
        .Renaming(ERR_KEY_NOT_FOUND, ERR_NO_SUCH_GROUP);
}

bool IsGroupDescription(std::string_view text)
{
    return text.size() <= kLongestField && FitsInField(text, true);
}

Code PrepareGroup(const TAVOGROUPDB &db, const char *old_name, const TAVOGROUP &group, int32_t gid, GroupChange &change)
{
    change = {};
    const std::optional<std::string> key = AccountKey(group.szName, kGroupKeySize);
    if (!key)
        return ERR_INVALID_GROUPNAME;
    change.key = *key;
    if (old_name)
        if (const Code code = FindOld(db, old_name, change))
            return code;
    if (change.old_key != change.key)
        if (const Code code = RequireAbsent(*Btree::Of(db.pName), change.key, ERR_GROUP_EXISTS))
            return code;
    if (!IsAccountName(group.szName, kGroupNameChars) || IsDotName(group.szName))
        return ERR_INVALID_GROUPNAME;
    change.line.name = group.szName;
    change.line.gid = old_name && gid == -1 ? change.old_gid : gid;
    if (change.line.gid < 0 && change.line.gid != change.old_gid)
        return ERR_BAD_PARAMETERS;
    return TakeMembers(group, change);
}

Code StoreGroup(const TAVOGROUPDB &db, const GroupChange &change)
{
    std::string description;
    if (!change.old_key.empty()) {
        const Result<std::string_view> line = Btree::Of(db.pDesc)->Get(change.old_key);
        if (line)
            description = GroupDescription(*line);
        else if (line.Failure() != ERR_KEY_NOT_FOUND)
            return line.Failure();
        // The entries of a group that keeps its key are overwritten anyway.
        const bool overwritten = change.old_key == change.key && !IsEverybody(change.key);
        const Code code = RemoveGroup(db, change.old_key, change.old_gid);
        if (code != 0 && !overwritten)
            return code;
    }
    Code code = Btree::Of(db.pName)->Set(change.key, WithNul(FormatGroupLine(change.line)));
    // Of two groups with one id the first keeps the index.
    if (code == 0)
        code = RequireAbsent(*Btree::Of(db.pGid), IdKey(change.line.gid), ERR_KEY_EXISTS);
    if (code == 0)
        code = Btree::Of(db.pGid)->Set(IdKey(change.line.gid), change.key);
    code = code.Renaming(ERR_KEY_EXISTS, ERR_SUCCESS);
    if (code == 0 && !description.empty())
        code = Btree::Of(db.pDesc)->Set(change.key, WithNul(FormatGroupDescLine(change.line.name, description)));
    return code;
}

Code RemoveGroup(const TAVOGROUPDB &db, const std::string &key, int32_t gid)
{
    const bool indexed = HasIndex(*Btree::Of(db.pGid), gid, key);
    const Code codes[] = {Btree::Of(db.pName)->Delete(key), Btree::Of(db.pDesc)->Delete(key),
                          indexed ? Btree::Of(db.pGid)->Delete(IdKey(gid)) : Code()};
    for (const Code code : codes)
        if (code != 0 && code != ERR_KEY_NOT_FOUND)
            return code == ERR_OUT_OF_MEMORY ? code : Code(ERR_GROUP_DB_DELETE);
    return 0;
}

}  // namespace tavo
