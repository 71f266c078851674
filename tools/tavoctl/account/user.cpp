// tavoctl user: reading accounts. What changes them stands in files of its own.
#include "account/user_verbs.h"

#include "account/user_record.h"
#include "families.h"
#include "frame/containers.h"
#include "frame/failure.h"
#include "frame/program.h"

#include "tavo_group.h"

#include <strings.h>

namespace tavoctl {
namespace {

std::vector<std::string> GroupsOf(const std::string &user)
{
    StringList names;
    if (TAVOGroupEnum(names.Address(), TAVO_GROUP_LOCAL | TAVO_GROUP_DOMAIN) < 0)
        throw LibraryFailure("list the groups");
    std::vector<std::string> groups;
    for (const std::string &group : names.Items()) {
        StringList members;
        if (TAVOGroupListMember(group.c_str(), members.Address()) < 0)
            throw LibraryFailure("list the members of " + group);
        for (const std::string &member : members.Items())
            if (::strcasecmp(member.c_str(), user.c_str()) == 0)
                groups.push_back(group);
    }
    return groups;
}

const char *PasswordState(const std::string &hash)
{
    if (hash.empty())
        return "none";
    return hash.front() == '*' || hash.front() == '!' ? "locked" : "set";
}

class UserList : public Verb {
  public:
    static constexpr VerbInfo info = {"list", reads,
                                      "Lists the accounts of people. Accounts of the system are not listed; the guest "
                                      "is where the model has one.",
                                      "tavoctl user list\n"
                                      "tavoctl user list --prefix a --json"};

    void Declare(Arguments &arguments) override
    {
        arguments.Option("--prefix", "TEXT", prefix_, "only names that begin so, in any case");
        arguments.Option("--part", "TEXT", part_, "only names that hold this, in any case");
    }

    int Run(const Call &call) override
    {
        if (!prefix_.empty() && !part_.empty())
            throw UsageFailure("list the users", "--prefix and --part cannot both be given");
        Table table({"name", "uid", "gid", "description", "mail", "expires", "expired"});
        for (const std::string &name : UserNames(prefix_, part_))
            if (const std::optional<User> user = FindUser(name))  // unless deleted since
                table.Add({user->name, user->uid, user->gid, user->description, user->mail, ExpiryCell(user->expires),
                           TAVOUserIsExpired(user->expires) == 1});
        call.Print(table);
        return exit_done;
    }

  private:
    std::string prefix_;
    std::string part_;
};

class UserShow : public Verb {
  public:
    static constexpr VerbInfo info = {"show", reads,
                                      "Shows everything about one account, but no hash: of the password, whether it is "
                                      "set, none, or locked.",
                                      "tavoctl user show anna\n"
                                      "tavoctl user show --uid 1026 --json"};

    void Declare(Arguments &arguments) override
    {
        arguments.OptionalText("NAME", name_, user_help, UserNames);
        arguments.Number("--uid", "N", uid_, "the account with this id, in place of a name");
    }

    int Run(const Call &call) override
    {
        if (name_.empty() == (uid_ < 0))
            throw UsageFailure("show a user", "give a name, or --uid");
        std::optional<User> user = uid_ < 0 ? FindUser(name_) : FindUserById(uid_);
        if (!user)
            throw NotFound("show the user " + (uid_ < 0 ? name_ : std::to_string(uid_)), ERR_NO_SUCH_USER);
        Record record;
        record.Add("name", user->name);
        record.Add("kind", user->kind == TAVO_USER_KIND_DOMAIN ? "domain" : "local");
        record.Add("uid", user->uid);
        record.Add("gid", user->gid);
        record.Add("description", user->description);
        record.Add("home", user->home);
        record.Add("shell", user->shell);
        record.Add("mail", user->mail);
        record.Add("privilege", PrivilegeText(user->privilege));
        record.Add("password", PasswordState(user->password));
        record.Add("cannot_change_password", user->cannot_change_password);
        record.Add("expires", ExpiryCell(user->expires));
        record.Add("expired", TAVOUserIsExpired(user->expires) == 1);
        record.Add("groups", GroupsOf(user->name));
        call.Print(record);
        return exit_done;
    }

  private:
    std::string name_;
    int uid_ = -1;
};

}  // namespace

void AddUser(Program &program)
{
    Family &user = program.Add("user", "Local users");
    user.Add<UserList>();
    user.Add<UserShow>();
    AddUserChanges(user);
    AddUserImport(user);
    AddUserExport(user);
    AddUserCheck(user);
}

}  // namespace tavoctl
