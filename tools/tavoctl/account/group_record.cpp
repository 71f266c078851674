// A group as tavoctl handles one.
#include "account/group_record.h"

#include "tavo_group.h"

#include "frame/containers.h"
#include "frame/failure.h"
#include "frame/text.h"

#include <algorithm>

#include <strings.h>

namespace tavoctl {
namespace {

struct OwnedGroup {
    TAVOGROUP *group = nullptr;
    ~OwnedGroup() { TAVOGroupFree(group); }
};

std::string Description(const std::string &name)
{
    const int size = TAVOGroupDescGet(name.c_str(), nullptr, 0);
    if (size <= 0)
        return {};
    std::string text(static_cast<std::size_t>(size), '\0');
    return TAVOGroupDescGet(name.c_str(), text.data(), size) > 0 ? text.c_str() : std::string();
}

Group GroupOf(const TAVOGROUP &record)
{
    Group group = {.name = record.szName,
                   .gid = record.nGid,
                   .members = {},
                   .domain = record.nKind == TAVO_GROUP_KIND_DOMAIN,
                   .description = Description(record.szName)};
    for (char **member = record.rgszMember; *member; ++member)
        group.members.emplace_back(*member);
    return group;
}

bool EndsField(char c)
{
    return c == ':' || static_cast<unsigned char>(c) < ' ';
}

}  // namespace

std::optional<Group> FindGroup(const std::string &name)
{
    OwnedGroup owned;
    if (TAVOGroupGet(name.c_str(), &owned.group) == 0)
        return GroupOf(*owned.group);
    if (TLIBErrGet() == ERR_NO_SUCH_GROUP || TLIBErrGet() == ERR_INVALID_GROUPNAME)
        return {};
    throw LibraryFailure("read the group " + name);
}

Group ReadGroup(const std::string &name)
{
    if (std::optional<Group> group = FindGroup(name))
        return *std::move(group);
    throw NotFound("read the group " + name, ERR_NO_SUCH_GROUP,
                   DidYouMean(name, GroupNames(), "tavoctl group list shows which are there"));
}

std::vector<std::string> GroupNames(const std::string &prefix, const std::string &part)
{
    StringList names;
    constexpr int all = TAVO_GROUP_LOCAL | TAVO_GROUP_DOMAIN;
    const int count = part.empty() ? TAVOGroupEnumByPrefix(names.Address(), all, prefix.c_str())
                                   : TAVOGroupEnumBySubstr(names.Address(), all, part.c_str());
    Must(count >= 0, "list the groups");
    return names.Items();
}

std::vector<std::string> GroupNames()
{
    return GroupNames({}, {});
}

std::vector<std::string> GroupMembers(const std::string &name)
{
    StringList members;
    Must(TAVOGroupListMember(name.c_str(), members.Address()) >= 0, "list the members of " + name);
    return members.Items();
}

void CheckGroup(const Group &group, const std::string &attempted)
{
    if (std::any_of(group.description.begin(), group.description.end(), EndsField))
        throw Failure{.attempted = attempted,
                      .reason = "the description holds a colon or a control character",
                      .code = ERR_BAD_PARAMETERS};
}

void SetGroup(const std::optional<std::string> &old_name, const Group &group, const std::string &attempted)
{
    CheckGroup(group, attempted);
    std::vector<char *> members;
    for (const std::string &member : group.members)
        members.push_back(const_cast<char *>(member.c_str()));  // the library's record has no const; it does not write
    members.push_back(nullptr);
    TAVOGROUP record = {};
    record.szName = const_cast<char *>(group.name.c_str());
    record.nGid = group.gid;
    record.rgszMember = members.data();
    Must(TAVOGroupSet(old_name ? old_name->c_str() : nullptr, &record) == 0, attempted);
    if (ReadGroup(group.name).description != group.description &&
        TAVOGroupDescSet(group.name.c_str(), group.description.c_str()) != 0)
        throw LibraryFailure("set the description of the group " + group.name);
}

bool IsSystemGroup(const Group &group)
{
    return !group.domain && group.gid < TAVO_GROUP_GID_MIN;
}

void RefuseTakenGroupId(const std::string &name, int gid)
{
    OwnedGroup owned;
    if (TAVOGroupGetByGID(gid, &owned.group) == 0 && ::strcasecmp(owned.group->szName, name.c_str()) != 0)
        throw UsageFailure("give " + name + " the group id " + std::to_string(Id(gid)),
                           std::string("it is that of ") + owned.group->szName);
}

std::vector<std::string> SplitNames(const std::string &text)
{
    std::vector<std::string> names = Split(text, ',');
    std::erase(names, "");
    return names;
}

std::vector<std::string> StrangersOf(const Group &group)
{
    const std::optional<Group> stored = FindGroup(group.name);
    std::vector<std::string> strangers = stored ? stored->members : std::vector<std::string>();
    std::erase_if(strangers, [&](const std::string &name) { return Contains(group.members, name); });
    return strangers;
}

const ArgumentKind group_kind = {.name = "group", .candidates = GroupNames, .sample = "nemos"};

const ArgumentKind new_group_kind = {
    .name = "new group",
    .allowed = "1 to 15 letters, digits, \".\", \"-\", \"_\" and blanks, with neither \"-\" nor a blank first",
    .valid = [](const std::string &name) { return BlTLIBIsGroupName(name.c_str()) == 1; },
    .code = ERR_INVALID_GROUPNAME,
    .sample = "nemos",
    .wrong = "a,b",
};

}  // namespace tavoctl
