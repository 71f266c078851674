// tavoctl group: reading groups. What changes them stands in files of its own.
#include "account/group_record.h"
#include "account/group_verbs.h"
#include "families.h"
#include "frame/failure.h"
#include "frame/program.h"
#include "frame/table.h"

#include <algorithm>

namespace tavoctl {
namespace {

class GroupList : public Verb {
  public:
    static constexpr VerbInfo info = {"list", reads,
                                      "Lists the groups of people, and \"users\", to which everybody belongs. Groups "
                                      "of the system are not listed.",
                                      "tavoctl group list\n"
                                      "tavoctl group list --part dev --json"};

    void Declare(Arguments &arguments) override
    {
        arguments.Option("--prefix", "TEXT", prefix_, "only names that begin so, in any case");
        arguments.Option("--part", "TEXT", part_, "only names that hold this, in any case");
    }

    int Run(const Call &call) override
    {
        if (!prefix_.empty() && !part_.empty())
            throw UsageFailure("list the groups", "--prefix and --part cannot both be given");
        Table table({"name", "gid", "description", "members"});
        for (const std::string &name : GroupNames(prefix_, part_))
            if (const std::optional<Group> group = FindGroup(name))  // unless deleted since
                table.Add({group->name, group->gid, group->description, GroupMembers(name)});
        call.Print(table);
        return exit_done;
    }

  private:
    std::string prefix_;
    std::string part_;
};

class GroupShow : public Verb {
  public:
    static constexpr VerbInfo info = {"show", reads,
                                      "Shows a group. Listed as members are those that are users; names that the "
                                      "group file has beyond these are strangers.",
                                      "tavoctl group show staff\n"
                                      "tavoctl group show users --json"};

    void Declare(Arguments &arguments) override { arguments.Text("NAME", name_, "the group, in any case", GroupNames); }

    int Run(const Call &call) override
    {
        const Group group = ReadGroup(name_);
        const std::vector<std::string> members = GroupMembers(group.name);
        Record record;
        record.Add("name", group.name);
        record.Add("kind", group.domain ? "domain" : "local");
        record.Add("gid", group.gid);
        record.Add("description", group.description);
        record.Add("members", members);
        std::vector<std::string> strangers;
        for (const std::string &member : group.members)
            if (std::find(members.begin(), members.end(), member) == members.end())
                strangers.push_back(member);
        record.Add("strangers", strangers);
        call.Print(record);
        return exit_done;
    }

  private:
    std::string name_;
};

}  // namespace

void AddGroup(Program &program)
{
    Family &group = program.Add("group", "Local groups");
    group.Add<GroupList>();
    group.Add<GroupShow>();
    AddGroupChanges(group);
    AddGroupTransfer(group);
    AddGroupCheck(group);
}

}  // namespace tavoctl
