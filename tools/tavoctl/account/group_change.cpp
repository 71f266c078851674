// tavoctl group: what changes single groups.
#include "account/account_rules.h"
#include "account/group_record.h"
#include "account/group_verbs.h"
#include "account/user_record.h"
#include "frame/failure.h"
#include "frame/program.h"

#include "tavo_group.h"

#include <algorithm>

#include <strings.h>

namespace tavoctl {
namespace {

constexpr char name_help[] = "the group, in any case";

// As the user's name is written, whatever the case of the argument.
std::vector<std::string> ExistingUsers(const std::string &list)
{
    std::vector<std::string> names = SplitNames(list);
    for (std::string &name : names)
        name = ReadUser(name).name;
    return names;
}

bool SameName(const std::string &a, const std::string &b)
{
    return ::strcasecmp(a.c_str(), b.c_str()) == 0;
}

void RefuseBadName(const std::string &name, const std::string &attempted)
{
    if (BlTLIBIsGroupName(name.c_str()) != 1)
        throw Failure{.attempted = attempted, .hint = "at most 15 characters", .code = ERR_INVALID_GROUPNAME};
}

// "users" has everybody without a list.
void RefuseMembersOfUsers(const std::string &name)
{
    if (SameName(name, "users"))
        throw UsageFailure("change the members of " + name, "every user is one");
}

class GroupAdd : public Verb {
  public:
    static constexpr VerbInfo info = {"add", changes, "Adds a group. An id is chosen unless one is given.",
                                      "tavoctl group add staff\n"
                                      "tavoctl group add staff --members anna,berta --description \"Everybody here\""};

    void Declare(Arguments &arguments) override
    {
        arguments.Text("NAME", group_.name, "the new group");
        arguments.Number("--gid", "N", group_.gid, "group id");
        arguments.Option("--members", "USER,...", members_, "its members", UserNames);
        arguments.Option("--description", "TEXT", group_.description, "free text");
    }

    int Run(const Call &) override
    {
        const std::string attempted = "add the group " + group_.name;
        RefuseBadName(group_.name, attempted);
        if (FindGroup(group_.name))
            throw Failure{.attempted = attempted, .code = ERR_GROUP_EXISTS};
        if (group_.gid >= 0)
            RefuseTakenGroupId(group_.name, group_.gid);
        group_.members = ExistingUsers(members_);
        SetGroup({}, group_, attempted);
        WarnOfName(group_.name);
        return exit_done;
    }

  private:
    Group group_;
    std::string members_;
};

class GroupModify : public Verb {
  public:
    static constexpr VerbInfo info = {"modify", changes,
                                      "Changes the members, the description or the id of a group; what is not given "
                                      "stays.",
                                      "tavoctl group modify staff --join carla --leave anna,berta\n"
                                      "tavoctl group modify staff --members anna\n"
                                      "tavoctl group modify staff --description \"\""};

    void Declare(Arguments &arguments) override
    {
        arguments.Text("NAME", name_, name_help, GroupNames);
        arguments.Option("--members", "USER,...", members_, "its members, in place of all that it has", UserNames);
        arguments.Option("--join", "USER,...", join_, "further members", UserNames);
        arguments.Option("--leave", "USER,...", leave_, "members that are none any more", UserNames);
        arguments.Option("--description", "TEXT", description_, "free text");
        arguments.Number("--gid", "N", gid_, "group id");
    }

    int Run(const Call &) override
    {
        const std::string attempted = "change the group " + name_;
        if (!members_ && join_.empty() && leave_.empty() && !description_ && gid_ < 0)
            throw UsageFailure(attempted, "nothing to change was given");
        Group group = ReadGroup(name_);
        if (members_ || !join_.empty() || !leave_.empty())
            RefuseMembersOfUsers(group.name);
        if (members_)
            group.members = ExistingUsers(*members_);
        for (const std::string &user : ExistingUsers(join_))
            if (std::none_of(group.members.begin(), group.members.end(),
                             [&](const std::string &member) { return SameName(member, user); }))
                group.members.push_back(user);
        for (const std::string &user : SplitNames(leave_))
            if (std::erase_if(group.members, [&](const std::string &member) { return SameName(member, user); }) == 0)
                throw NotFound("take " + user + " out of the group " + name_, ERR_NO_SUCH_USER, "it is no member");
        group.description = description_.value_or(group.description);
        if (gid_ >= 0) {
            RefuseTakenGroupId(group.name, gid_);
            group.gid = gid_;
        }
        SetGroup(name_, group, attempted);
        return exit_done;
    }

  private:
    std::string name_;
    std::optional<std::string> members_;
    std::string join_;
    std::string leave_;
    std::optional<std::string> description_;
    int gid_ = -1;
};

class GroupRename : public Verb {
  public:
    static constexpr VerbInfo info = {"rename", changes,
                                      "Gives a group another name, also in the lists of shared folders and of Samba.",
                                      "tavoctl group rename staff team"};

    void Declare(Arguments &arguments) override
    {
        arguments.Text("NAME", name_, name_help, GroupNames);
        arguments.Text("NEW_NAME", new_name_, "its new name");
        arguments.Flag("--system", system_, "also groups that the system needs");
    }

    int Run(const Call &) override
    {
        const std::string attempted = "rename the group " + name_ + " to " + new_name_;
        RefuseBadName(new_name_, attempted);
        Group group = ReadGroup(name_);
        if (IsSystemGroup(group) && !system_)
            throw UsageFailure(attempted, "the system needs it", "say --system to do it");
        group.name = new_name_;
        SetGroup(name_, group, attempted);
        WarnOfName(new_name_);
        return exit_done;
    }

  private:
    std::string name_;
    std::string new_name_;
    bool system_ = false;
};

class GroupDelete : public Verb {
  public:
    static constexpr VerbInfo info = {"delete", changes | destroys,
                                      "Deletes groups, also from the lists of shared folders, all in one batch. Their "
                                      "members stay. Nothing is done when one of them is not there.",
                                      "tavoctl group delete staff\n"
                                      "tavoctl group delete --yes staff guests"};

    void Declare(Arguments &arguments) override
    {
        arguments.Texts("NAME", names_, name_help, 1, GroupNames);
        arguments.Flag("--system", system_, "also groups that the system needs");
    }

    int Run(const Call &call) override
    {
        std::string list;
        for (const std::string &name : names_) {
            const Group group = ReadGroup(name);
            if (IsSystemGroup(group) && !system_)
                throw UsageFailure("delete the group " + name, "the system needs it", "say --system to do it");
            list += (list.empty() ? "" : ", ") + group.name;
        }
        call.Confirm("Delete " + list + "?");
        const auto is_there = [](const std::string &name) {
            return FindGroup(name).has_value();
        };
        DeleteAll(names_, TAVOGroupDelete, is_there, "delete " + list);
        return exit_done;
    }

  private:
    std::vector<std::string> names_;
    bool system_ = false;
};

}  // namespace

void AddGroupChanges(Family &group)
{
    group.Add<GroupAdd>();
    group.Add<GroupModify>();
    group.Add<GroupRename>();
    group.Add<GroupDelete>();
}

}  // namespace tavoctl
