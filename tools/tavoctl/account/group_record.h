// A group as tavoctl handles one: values in place of the library's pointers.
#ifndef TAVOCTL_GROUP_RECORD_H
#define TAVOCTL_GROUP_RECORD_H

#include "frame/arguments.h"
#include "frame/column.h"

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

std::optional<Group> FindGroup(const std::string &name);  // throws a Failure when the look-up fails
Group ReadGroup(const std::string &name);                 // throws a Failure, also when there is none

// The names that the library lists, in its order; for completion too.
std::vector<std::string> GroupNames();
std::vector<std::string> GroupNames(const std::string &prefix, const std::string &part);

// Those of the members that are users; for "users" all of them.
std::vector<std::string> GroupMembers(const std::string &name);

// One call of the library, and a second one where the description is new. Throws a Failure.
void SetGroup(const std::optional<std::string> &old_name, const Group &group, const std::string &attempted);

// Throws a Failure for what the library would refuse only when the group is there: its description comes in a second call.
void CheckGroup(const Group &group, const std::string &attempted);

bool IsSystemGroup(const Group &group);

// Throws a Failure when another group has the id.
void RefuseTakenGroupId(const std::string &name, int gid);

// Names between commas; empty ones are left out.
std::vector<std::string> SplitNames(const std::string &text);

// Listed in the group file, but not users.
std::vector<std::string> StrangersOf(const Group &group);

inline constexpr Column<Group> group_columns[] = {
    {"name", field<&Group::name>},
    {"kind", [](const Group &g) -> std::string { return g.domain ? "domain" : "local"; }, "local or domain",
     in_details},
    {"gid", [](const Group &g) { return g.gid == -1 ? std::nullopt : std::optional(Id(g.gid)); }, "group id"},
    {"description", field<&Group::description>},
    {"members", field<&Group::members>, "those that are users"},
    {"strangers", [](const Group &g) { return StrangersOf(g); }, "members that are not users", in_one},
};

// The fields of the lists that group export writes and group import reads.
inline constexpr Column<Group> group_export_columns[] = {
    {"name", field<&Group::name>},
    {"gid", [](const Group &g) { return Id(g.gid); }, "group id"},
    {"description", field<&Group::description>},
    {"members", field<&Group::members>},
};

extern const ArgumentKind group_kind;      // one that is there
extern const ArgumentKind new_group_kind;  // a name for one

}  // namespace tavoctl

#endif
