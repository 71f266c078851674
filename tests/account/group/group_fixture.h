// Groups as the tests make them, and the files that they end up in.
#ifndef TESTS_ACCOUNT_GROUP_GROUP_FIXTURE_H
#define TESTS_ACCOUNT_GROUP_GROUP_FIXTURE_H

#include "tavo_group.h"

#include "account/user/user_fixture.h"
#include "support/test.h"

namespace test {

struct FreeGroup {
    void operator()(TAVOGROUP *group) const { TAVOGroupFree(group); }
};
using Group = std::unique_ptr<TAVOGROUP, FreeGroup>;
using Names = std::vector<std::string>;

// A record as a program would write it, not as TAVOGroupAlloc2 does: nothing is left out.
struct GroupRecord {
    GroupRecord(std::string group_name, int gid, Names members) : name(std::move(group_name)), names(std::move(members))
    {
        for (std::string &member : names)
            pointers.push_back(member.data());
        pointers.push_back(nullptr);
        record = {name.data(), gid, pointers.data(), 0, 0};
    }
    std::string name;
    Names names;
    std::vector<char *> pointers;
    TAVOGROUP record;
};

// The code, 0 for success.
inline int CodeOf(int result)
{
    return result >= 0 ? 0 : TLIBErrGet() != 0 ? TLIBErrGet() : -1;
}

inline int SetGroup(const char *old_name, const std::string &name, int gid = -1, Names members = {})
{
    const GroupRecord group(name, gid, std::move(members));
    TLIBErrSet(ERR_SUCCESS);
    return CodeOf(TAVOGroupSet(old_name, &group.record));
}

inline int AddGroup(const std::string &name, int gid = -1, Names members = {})
{
    return SetGroup(nullptr, name, gid, std::move(members));
}

inline int DeleteGroups(std::vector<const char *> names)
{
    TLIBErrSet(ERR_SUCCESS);
    const int result = TAVOGroupDelete(names.data(), static_cast<int>(names.size()));
    return result == 0 ? TLIBErrGet() : CodeOf(result);
}

inline int AddUser(const char *name)
{
    return AddUser(UserTexts{.name = name});
}

inline Group GetGroup(const std::string &name)
{
    TAVOGROUP *group = nullptr;
    return TAVOGroupGet(name.c_str(), &group) == 0 ? Group(group) : Group();
}

inline Names Members(const TAVOGROUP &group)
{
    Names names;
    for (char **member = group.rgszMember; *member; ++member)
        names.emplace_back(*member);
    return names;
}

inline std::string GroupFile()
{
    return FileText("/etc/group");
}

inline std::string DescFile()
{
    return FileText("/etc/group_desc");
}

}  // namespace test

#endif
