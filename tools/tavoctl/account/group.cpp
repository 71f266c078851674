// tavoctl group: local groups.
#include "tavo_group.h"
#include "tavo_lock.h"

#include "account/account_check.h"
#include "account/account_plans.h"
#include "account/account_use.h"
#include "account/account_verbs.h"
#include "account/group_record.h"
#include "account/user_record.h"
#include "families.h"
#include "frame/held_locks.h"
#include "frame/terminal.h"

#include <algorithm>
#include <set>

#include <strings.h>

namespace tavoctl {
namespace {

struct GroupKind {
    using Record = Group;
    static constexpr char noun[] = "group";
    static constexpr char name_help[] = "the group, in any case";
    static constexpr char delete_warning[] = "";
    static constexpr char force_help[] = "also the primary group of a user";
    static constexpr bool guards_names = true;
    static constexpr int exists_code = ERR_GROUP_EXISTS;
    static constexpr const auto &columns = group_columns;
    static constexpr const ArgumentKind &kind = group_kind;
    static constexpr const ArgumentKind &new_kind = new_group_kind;
    static constexpr auto remove = TAVOGroupDelete;

    static Group WithMembers(Group group)
    {
        group.members = GroupMembers(group.name);
        return group;
    }
    static std::vector<Group> All(const std::string &prefix, const std::string &part)
    {
        std::vector<Group> groups;
        for (const std::string &name : GroupNames(prefix, part))
            if (const std::optional<Group> group = FindGroup(name))  // unless deleted since
                groups.push_back(WithMembers(*group));
        return groups;
    }
    static constexpr auto Find = FindGroup;
    static constexpr auto Read = ReadGroup;
    static constexpr auto IsSystem = IsSystemGroup;
    static void RefuseDelete(const Group &, const std::string &) {}
    static void RefuseUsed(const Group &group, const std::string &attempted)
    {
        if (const std::string users = UsersWithPrimaryGroup(Id(group.gid)); !users.empty())
            throw UsageFailure(attempted, "it is the primary group of " + users, "--force does it anyway");
    }
    static constexpr auto RefuseId = RefuseTakenGroupId;
    static constexpr auto Set = SetGroup;
};

// As the user's name is written, whatever the case of the argument.
std::vector<std::string> ExistingUsers(const std::string &list)
{
    return Mapped(SplitNames(list), [](const std::string &name) { return ReadUser(name).name; });
}

bool SameName(const std::string &a, const std::string &b)
{
    return ::strcasecmp(a.c_str(), b.c_str()) == 0;
}

Action GroupShow(Arguments &in)
{
    const auto name = in.Text("NAME", group_kind, GroupKind::name_help);
    return [=](Call &call) { call.One(group_columns, GroupKind::WithMembers(ReadGroup(*name))); };
}

Action GroupAdd(Arguments &in)
{
    const auto name = in.Text("NAME", new_group_kind, "the new group");
    const auto gid = in.Number("--gid", "N", "group id");
    const auto members = in.Option("--members", "USER,...", user_kind, "its members");
    const auto description = in.Option("--description", "TEXT", any_text, "free text");
    return [=](Call &call) {
        const std::string attempted = "add the group " + *name;
        if (FindGroup(*name))
            throw Failure{.attempted = attempted, .code = ERR_GROUP_EXISTS};
        Group group;
        group.name = *name;
        group.gid = static_cast<int>(gid->value_or(-1));
        if (*gid)
            RefuseTakenGroupId(group.name, group.gid);
        group.members = ExistingUsers(members->value_or(""));
        group.description = description->value_or("");
        call.Compare("group " + *name, group_columns, std::optional<Group>(), std::optional(group));
        CheckGroup(group, attempted);
        if (!call.Proceed())
            return;
        SetGroup({}, group, attempted);
        WarnOfName(group.name);
        call.Tell("gid", Id(ReadGroup(*name).gid));
    };
}

Action GroupModify(Arguments &in)
{
    const auto name = in.Text("NAME", group_kind, GroupKind::name_help);
    const auto members = in.Option("--members", "USER,...", user_kind, "its members, in place of all that it has");
    const auto join = in.Option("--join", "USER,...", user_kind, "further members");
    const auto leave = in.Option("--leave", "USER,...", user_kind, "users that shall not be members any more");
    const auto description = in.Option("--description", "TEXT", any_text, "free text");
    const auto gid = in.Number("--gid", "N", "group id");
    return [=](Call &call) {
        const std::string attempted = "change the group " + *name;
        RefuseIf(!*members && !*join && !*leave && !*description && !*gid, attempted, "nothing to change was given");
        const Group before = ReadGroup(*name);
        Group group = before;
        RefuseIf((*members || *join || *leave) && SameName(group.name, "users"), "change the members of " + *name,
                 "every user is one");
        if (*members)
            group.members = ExistingUsers(**members);
        for (const std::string &user : ExistingUsers(join->value_or("")))
            if (std::none_of(group.members.begin(), group.members.end(),
                             [&](const std::string &member) { return SameName(member, user); }))
                group.members.push_back(user);
        for (const std::string &user : SplitNames(leave->value_or("")))
            if (std::erase_if(group.members, [&](const std::string &member) { return SameName(member, user); }) == 0)
                throw NotFound("take " + user + " out of the group " + *name, ERR_NO_SUCH_USER, "it is not a member");
        group.description = description->value_or(group.description);
        if (*gid) {
            RefuseTakenGroupId(group.name, static_cast<int>(**gid));
            group.gid = static_cast<int>(**gid);
        }
        call.Compare("group " + before.name, group_columns, std::optional(before), std::optional(group));
        CheckGroup(group, attempted);
        if (call.Proceed())
            SetGroup(*name, group, attempted);
    };
}

Action GroupExport(Arguments &in)
{
    const auto path = in.Option("--output", "PATH", file_path, "a new file that only root can read (standard output)");
    return [=](Call &call) {
        std::vector<Group> groups = GroupKind::All({}, {});
        std::erase_if(groups, [](const Group &group) { return group.domain || IsSystemGroup(group); });
        Export(call, call.TableOf(group_export_columns, groups), *path);
    };
}

Action GroupImport(Arguments &in)
{
    const auto path = in.Text("FILE", file_path, "the list, or - for standard input");
    const auto update = in.Flag("--update", "change groups that are there, in place of refusing the list");
    return [=](Call &call) {
        const GroupPlan plan =
            PlanGroups(call, *path, *update, ParseAccountRows(ReadWhole(*path), Names(group_export_columns)),
                       [](const std::string &name) { return ReadUser(name).name; });
        for (const std::string &name : plan.entries)
            call.BeginEntry("group " + name);
        if (call.Proceed())
            for (const auto &[name, failure] : CarryOut(plan))
                call.FailEntry("group " + name, failure);
    };
}

Action GroupCheck(Arguments &)
{
    return [](Call &call) {
        AccountCheck check({{"/etc/group", TAVO_GROUP_DB_NAME, {"name", "password", "gid", "members"}},
                            {"/etc/group_desc", TAVO_GROUP_DB_DESC, {"name", "description"}}},
                           TAVO_GROUP_DB_ID);
        const HeldLocks lock(TAVO_LOCK_USER | TAVO_LOCK_GROUP, true, usual_wait);
        check.Run();
        std::set<std::string> users;
        for (const auto &fields : FieldsIn("/etc/passwd"))
            users.insert(AccountKey(fields[0]));
        for (const auto &[key, line] : check.Lines(0)) {
            const std::vector<std::string> fields = SplitFields(line);
            for (const std::string &member : SplitNames(fields[3]))
                if (!users.contains(AccountKey(member)))
                    check.Add(fields[0], "/etc/group", "the member " + member + " is not a user");
        }
        check.Print(call);
    };
}

}  // namespace

GroupPlan PlanGroups(Call &call, const std::string &path, bool update, const std::vector<AccountRow> &list,
                     const std::function<std::string(const std::string &)> &member_name)
{
    ImportedRows<GroupKind> rows(path, update);
    GroupPlan plan = {.path = path};
    for (const AccountRow &row : list) {
        const std::optional<Group> old = rows.Present(row);
        Group group = old.value_or(Group{});
        group.name = *row.Find("name");
        if (const std::string *text = row.Find("description"))
            group.description = *text;
        if (const std::string *text = row.Find("members")) {
            std::vector<std::string> members = Mapped(SplitNames(*text), member_name);
            // Their order means nothing, and no list has the strangers.
            const std::vector<std::string> users = old ? GroupMembers(old->name) : std::vector<std::string>();
            if (!std::is_permutation(members.begin(), members.end(), users.begin(), users.end()))
                group.members = std::move(members);
        }
        if (const auto gid = rows.IdIn(row, "gid")) {
            rows.TakeId(row, *gid);
            group.gid = *gid;
        }
        CheckGroup(group, rows.Attempted(row));
        plan.entries.push_back(group.name);
        const std::size_t before = call.report.changes.size();
        call.Compare("group " + group.name, group_columns, old, std::optional(group));
        if (call.report.changes.size() > before)
            plan.changes.emplace_back(old, std::move(group));
    }
    return plan;
}

EntryFailures CarryOut(const GroupPlan &plan)
{
    Progress progress("importing");
    EntryFailures failures;
    for (std::size_t i = 0; i < plan.changes.size(); ++i) {
        const auto &[old, group] = plan.changes[i];
        progress.Show(std::to_string(i) + " of " + std::to_string(plan.changes.size()));
        try {
            SetGroup(old ? std::optional(old->name) : std::nullopt, group, "import " + plan.path + ", " + group.name);
        } catch (const Failure &failure) {
            failures.emplace_back(group.name, failure);
        }
    }
    return failures;
}

std::vector<Group> AllGroups()
{
    return GroupKind::All({}, {});
}

void AddGroup(Program &program)
{
    Family &group = program.Add("group", "Local groups");
    group.Add("list", reads, Answer::List(group_columns), AccountList<GroupKind>,
              R"(Lists the groups of people, and "users", to which everybody
belongs. Groups of the system are not listed.

tavoctl group list
tavoctl group list --part dev --json)");
    group.Add("show", reads, Answer::One(group_columns), GroupShow,
              R"(Shows a group. Listed as members are those that are users;
names that the group file has beyond these are strangers.

tavoctl group show staff
tavoctl group show users --json)");
    group.Add("add", changes, GroupAdd, R"(Adds a group. An id is chosen unless one is given.

tavoctl group add staff
tavoctl group add staff --members anna,berta --description "Everybody here")");
    group.Add("modify", changes, GroupModify, R"(Changes the members, the description or the id of a group; what is
not given stays.

tavoctl group modify staff --join carla --leave anna,berta
tavoctl group modify staff --members anna
tavoctl group modify staff --description "")");
    group.Add("rename", changes, AccountRename<GroupKind>, R"(Renames a group, also in the lists of shared folders
and of Samba.

tavoctl group rename staff team)");
    group.Add("delete", changes | destroys, Answer::Batch(), AccountDelete<GroupKind>,
              R"(Deletes groups, also from the lists of shared folders,
all in one batch. Their members stay. Nothing is done when one of them is not there, or is the primary group of a user.

tavoctl group delete staff
tavoctl group delete --yes staff guests)");
    group.Add("import", changes, Answer::Batch(), GroupImport,
              R"(Adds the groups of a list, and with --update changes those that are
there. The list is comma-separated values under a line of field names (name, gid, description, members), or the JSON of
export. Only name is required. Everything is looked at before anything is changed; then it goes group by group. One that
fails does not keep the others from being done.

tavoctl group import --dry-run groups.csv
tavoctl group import --update groups.json)");
    group.Add("export", reads, Answer::Document(group_export_columns), GroupExport,
              R"(Writes the groups of people as comma-separated
values, or as JSON, in the form that import reads. Members are joined by commas in one field.

tavoctl group export > groups.csv
tavoctl group export --json)");
    group.Add("check", reads, Answer::List(finding_columns), GroupCheck,
              R"(Compares the two files of groups with the library's
stores, and names every difference, and every member that is not a user; exit status 1 when there is one. Nothing is
changed. A file that was edited by hand differs until the library is used the next time, and then the file counts.

tavoctl group check
tavoctl group check --json)");
}

}  // namespace tavoctl
