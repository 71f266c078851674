// tavoctl group: many groups at once, from and to files.
#include "account/account_key.h"
#include "account/account_rows.h"
#include "account/group_record.h"
#include "account/group_verbs.h"
#include "account/user_record.h"
#include "frame/failure.h"
#include "frame/input_file.h"
#include "frame/program.h"
#include "frame/progress.h"
#include "frame/table.h"

#include "tavo_group.h"

#include <charconv>
#include <set>

namespace tavoctl {
namespace {

const char *const columns[] = {"name", "gid", "description", "members"};

std::vector<std::string> Columns()
{
    return {std::begin(columns), std::end(columns)};
}

class GroupExport : public Verb {
  public:
    static constexpr VerbInfo info = {"export", reads,
                                      "Writes the groups of people as comma-separated values, or as JSON, in the form "
                                      "that import reads. Members stand between commas in one field.",
                                      "tavoctl group export > groups.csv\n"
                                      "tavoctl group export --json"};

    void Declare(Arguments &arguments) override
    {
        arguments.Option("--output", "PATH", path_, "a new file that only root can read (standard output)");
    }

    int Run(const Call &call) override
    {
        Table table(Columns());
        for (const std::string &name : GroupNames())
            if (const std::optional<Group> group = FindGroup(name); group && !IsSystemGroup(*group))
                table.Add({group->name, group->gid, group->description, group->members});
        WriteWhole(path_, call.json ? table.Json() + "\n" : table.Csv());
        return exit_done;
    }

  private:
    std::string path_;
};

class GroupImport : public Verb {
  public:
    static constexpr VerbInfo info = {
        "import", changes | tells_before,
        "Adds the groups of a list, and with --update changes those that are there. The list is comma-separated values "
        "under a line of field names (name, gid, description, members), or a JSON array of objects. Only name is "
        "required. Everything is looked at before anything is changed; then it goes group by group, and stops at the "
        "first that fails.",
        "tavoctl group import --dry-run groups.csv\n"
        "tavoctl group import --update groups.json"};

    void Declare(Arguments &arguments) override
    {
        arguments.Text("FILE", path_, "the list, or - for standard input");
        arguments.Flag("--update", update_, "change groups that are there, in place of refusing the list");
    }

    int Run(const Call &call) override
    {
        for (const AccountRow &row : ParseAccountRows(ReadWhole(path_), Columns()))
            Read(row);
        if (call.dry_run) {
            Table table({"action", "name", "gid", "description", "members"});
            for (const auto &[old_name, group] : changes_)
                table.Add({old_name ? "change" : "add", group.name, group.gid < 0 ? Cell() : Cell(group.gid),
                           group.description, group.members});
            call.Print(table);
            return exit_done;
        }
        Progress progress("importing");
        for (std::size_t i = 0; i < changes_.size(); ++i) {
            const auto &[old_name, group] = changes_[i];
            progress.Show(std::to_string(i) + " of " + std::to_string(changes_.size()));
            SetGroup(old_name, group,
                     "import " + path_ + ", " + std::to_string(i) + " groups are done, the next is " + group.name);
        }
        return exit_done;
    }

  private:
    void Read(const AccountRow &row)
    {
        const std::string name = *row.Find("name");
        const std::string attempted = "import " + path_ + ", " + row.Where() + ", " + name;
        if (BlTLIBIsGroupName(name.c_str()) != 1)
            throw Failure{.attempted = attempted, .hint = "at most 15 characters", .code = ERR_INVALID_GROUPNAME};
        if (!names_.insert(AccountKey(name)).second)
            throw UsageFailure(attempted, "the name is there twice");
        const std::optional<Group> old = FindGroup(name);
        if (old && !update_)
            throw Failure{.attempted = attempted, .hint = "say --update to change it", .code = ERR_GROUP_EXISTS};
        Group group = old.value_or(Group{});
        group.name = name;
        if (const std::string *text = row.Find("description"))
            group.description = *text;
        if (const std::string *text = row.Find("members")) {
            group.members = SplitNames(*text);
            for (std::string &member : group.members)
                member = ReadUser(member).name;
        }
        if (const std::string *text = row.Find("gid"); text && !text->empty())
            group.gid = ReadId(name, *text, attempted);
        changes_.emplace_back(old ? std::optional(old->name) : std::nullopt, std::move(group));
    }

    int ReadId(const std::string &name, const std::string &text, const std::string &attempted)
    {
        int gid = -1;
        const auto [stop, error] = std::from_chars(text.data(), text.data() + text.size(), gid);
        if (error != std::errc() || stop != text.data() + text.size() || gid < 0)
            throw UsageFailure(attempted, text + " is no group id");
        RefuseTakenGroupId(name, gid);
        if (!ids_.insert(gid).second)
            throw UsageFailure(attempted, "the group id " + text + " is there twice");
        return gid;
    }

    std::string path_;
    bool update_ = false;
    std::vector<std::pair<std::optional<std::string>, Group>> changes_;
    std::set<std::string> names_;
    std::set<int> ids_;
};

}  // namespace

void AddGroupTransfer(Family &group)
{
    group.Add<GroupImport>();
    group.Add<GroupExport>();
}

}  // namespace tavoctl
