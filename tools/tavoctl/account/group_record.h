// A group as tavoctl handles one: values in place of the library's pointers.
#ifndef TAVOCTL_GROUP_RECORD_H
#define TAVOCTL_GROUP_RECORD_H

#include <optional>
#include <string>
#include <vector>

namespace tavoctl {

struct Group {
    std::string name;
    int gid = -1;
    std::vector<std::string> members;
    bool domain = false;
    std::string description;
};

std::optional<Group> FindGroup(const std::string &name);  // throws a Failure when that cannot be told
Group ReadGroup(const std::string &name);                 // throws a Failure, also when there is none

// The names that the library lists, in its order; for completion too.
std::vector<std::string> GroupNames();
std::vector<std::string> GroupNames(const std::string &prefix, const std::string &part);

// Those of the members that are users; for "users" all of them.
std::vector<std::string> GroupMembers(const std::string &name);

// One call of the library, and a second one where the description is new. Throws a Failure.
void SetGroup(const std::optional<std::string> &old_name, const Group &group, const std::string &attempted);

bool IsSystemGroup(const Group &group);

// Throws a Failure when another group has the id.
void RefuseTakenGroupId(const std::string &name, int gid);

// Names between commas; empty ones are left out.
std::vector<std::string> SplitNames(const std::string &text);

}  // namespace tavoctl

#endif
