// tavoctl user: what changes single accounts.
#include "account/account_rules.h"
#include "account/user_record.h"
#include "account/user_verbs.h"
#include "frame/failure.h"
#include "frame/password.h"
#include "frame/program.h"

#include <strings.h>

namespace tavoctl {
namespace {

// What add and modify can say of an account.
class Facts {
  public:
    void Declare(Arguments &arguments)
    {
        arguments.Number("--uid", "N", uid_, "user id");
        arguments.Number("--gid", "N", gid_, "primary group (100, users)");
        arguments.Option("--description", "TEXT", description_, "free text, such as the full name");
        arguments.Option("--shell", "PATH", shell_, "login shell (/bin/csh)");
        arguments.Option("--mail", "ADDRESS", mail_, "mail address");
        arguments.Option("--privilege", "MASK", privilege_, "application privileges, such as 0x23");
        arguments.Option("--expires", "DATE", expires_, "the last day, yyyy/mm/dd, or never");
        arguments.Option("--cannot-change-password", "yes|no", cannot_change_, "whether the password is fixed");
    }

    bool Any() const
    {
        return uid_ >= 0 || gid_ >= 0 || description_ || shell_ || mail_ || privilege_ || expires_ || cannot_change_;
    }

    void Apply(User &user) const
    {
        if (uid_ >= 0) {
            RefuseTakenId(user.name, uid_);
            user.uid = uid_;
        }
        if (gid_ >= 0)
            user.gid = gid_;
        user.description = description_.value_or(user.description);
        user.shell = shell_.value_or(user.shell);
        user.mail = mail_.value_or(user.mail);
        if (privilege_)
            user.privilege = ParsePrivilege(*privilege_);
        if (expires_)
            user.expires = ParseExpiry(*expires_);
        if (cannot_change_)
            user.cannot_change_password = ParseYesNo("--cannot-change-password", *cannot_change_);
    }

  private:
    int uid_ = -1;
    int gid_ = -1;
    std::optional<std::string> description_;
    std::optional<std::string> shell_;
    std::optional<std::string> mail_;
    std::optional<std::string> privilege_;
    std::optional<std::string> expires_;
    std::optional<std::string> cannot_change_;
};

class UserAdd : public Verb {
  public:
    static constexpr VerbInfo info = {"add", changes,
                                      "Adds an account. The password is asked for, or is the first line of standard "
                                      "input; an id is chosen unless one is given.",
                                      "tavoctl user add anna --description \"Anna Berg\"\n"
                                      "tavoctl user add guest2 --empty-password --expires 2027/01/31\n"
                                      "pwgen 16 1 | tavoctl user add backup"};

    void Declare(Arguments &arguments) override
    {
        arguments.Text("NAME", user_.name, "the new account");
        facts_.Declare(arguments);
        arguments.Option("--home", "PATH", user_.home, "home folder (/var/services/homes/NAME)");
        password_.Declare(arguments);
    }

    int Run(const Call &) override
    {
        const std::string attempted = "add the user " + user_.name;
        if (BlTLIBIsUserName(user_.name.c_str()) != 1)
            throw Failure{.attempted = attempted, .code = ERR_INVALID_USERNAME};
        if (FindUser(user_.name))
            throw Failure{.attempted = attempted, .code = ERR_USER_EXISTS};
        RefuseTooMany(1, attempted);
        facts_.Apply(user_);
        user_.password = password_.For(user_.name);
        const int last = LastUserId();
        SetUsers({{.old_name = {}, .user = user_}}, attempted);
        WarnOfName(user_.name);
        if (user_.uid < 0)
            WarnOfReusedId(user_.name, ReadUser(user_.name).uid, last);
        return exit_done;
    }

  private:
    User user_;
    Facts facts_;
    PasswordChoice password_;
};

// A verb that changes an account that is there.
class OneUser : public Verb {
  public:
    void Declare(Arguments &arguments) override { arguments.Text("NAME", name_, user_help, UserNames); }

  protected:
    template <class Edit>
    void Change(const std::string &attempted, Edit edit) const
    {
        UserChange change = {.old_name = name_, .user = ReadUser(name_)};
        edit(change.user);
        SetUsers({change}, attempted);
    }

    std::string name_;
};

class UserModify : public OneUser {
  public:
    static constexpr VerbInfo info = {"modify", changes,
                                      "Changes facts of an account; what is not given stays. Its name is changed by "
                                      "rename, its password by passwd.",
                                      "tavoctl user modify anna --mail anna@example.com\n"
                                      "tavoctl user modify anna --description \"\" --privilege 0x23"};

    void Declare(Arguments &arguments) override
    {
        OneUser::Declare(arguments);
        facts_.Declare(arguments);
    }

    int Run(const Call &) override
    {
        if (!facts_.Any())
            throw UsageFailure("change the user " + name_, "nothing to change was given");
        Change("change the user " + name_, [&](User &user) { facts_.Apply(user); });
        return exit_done;
    }

  private:
    Facts facts_;
};

class UserRename : public OneUser {
  public:
    static constexpr VerbInfo info = {"rename", changes,
                                      "Gives an account another name, also one that differs in case only. Id, "
                                      "password, groups, shared folders and home folder go with it.",
                                      "tavoctl user rename anna anna.berg"};

    void Declare(Arguments &arguments) override
    {
        OneUser::Declare(arguments);
        arguments.Text("NEW_NAME", new_name_, "its new name");
    }

    int Run(const Call &) override
    {
        const std::string attempted = "rename the user " + name_ + " to " + new_name_;
        if (BlTLIBIsUserName(new_name_.c_str()) != 1)
            throw Failure{.attempted = attempted, .code = ERR_INVALID_USERNAME};
        Change(attempted, [&](User &user) { user.name = new_name_; });
        WarnOfName(new_name_);
        return exit_done;
    }

  private:
    std::string new_name_;
};

class UserDelete : public Verb {
  public:
    static constexpr VerbInfo info = {"delete", changes | destroys,
                                      "Deletes accounts with their quotas, group memberships and home folders, all in "
                                      "one batch. Nothing is done when one of them is not there.",
                                      "tavoctl user delete anna\n"
                                      "tavoctl user delete --yes anna berta carla"};

    void Declare(Arguments &arguments) override
    {
        arguments.Texts("NAME", names_, user_help, 1, UserNames);
        arguments.Flag("--system", system_, "also accounts that the system needs");
    }

    int Run(const Call &call) override
    {
        std::string list;
        for (const std::string &name : names_) {
            const User user = ReadUser(name);
            if (IsSystemUser(user) && !system_)
                throw UsageFailure("delete the user " + name, "the system needs it", "say --system to do it");
            if (::strcasecmp(name.c_str(), "root") == 0 || ::strcasecmp(name.c_str(), "admin") == 0)
                throw Failure{
                    .attempted = "delete the user " + name, .hint = "it must stay", .code = ERR_USER_DB_DELETE};
            list += (list.empty() ? "" : ", ") + user.name;
        }
        call.Confirm("Delete " + list + ", with home folders?");
        const auto is_there = [](const std::string &name) {
            return FindUser(name).has_value();
        };
        DeleteAll(names_, TAVOUserDelete, is_there, "delete " + list);
        return exit_done;
    }

  private:
    std::vector<std::string> names_;
    bool system_ = false;
};

class UserPasswd : public OneUser {
  public:
    static constexpr VerbInfo info = {"passwd", changes,
                                      "Sets the password of an account, also for Samba. It is asked for, or is the "
                                      "first line of standard input.",
                                      "tavoctl user passwd anna\n"
                                      "tavoctl user passwd anna < /root/new-password"};

    void Declare(Arguments &arguments) override
    {
        OneUser::Declare(arguments);
        password_.Declare(arguments);
    }

    int Run(const Call &) override
    {
        ReadUser(name_);  // nobody is asked for a password in vain
        const std::string password = password_.For(name_);
        Change("set the password of " + name_, [&](User &user) {
            if (user.password == password && !password.empty())
                throw UsageFailure("set the password of " + name_, "this is the hash of the one that is set");
            user.password = password;
        });
        return exit_done;
    }

  private:
    PasswordChoice password_;
};

class UserExpire : public OneUser {
  public:
    static constexpr VerbInfo info = {"expire", changes,
                                      "Sets the last day of an account, which is valid through that whole day, or "
                                      "takes the limit away. `user show` says whether an account has expired.",
                                      "tavoctl user expire anna 2027/01/31\n"
                                      "tavoctl user expire anna never"};

    void Declare(Arguments &arguments) override
    {
        OneUser::Declare(arguments);
        arguments.Text("DATE", date_, "yyyy/mm/dd, or never");
    }

    int Run(const Call &) override
    {
        const int day = ParseExpiry(date_);
        Change("set the last day of " + name_, [&](User &user) { user.expires = day; });
        return exit_done;
    }

  private:
    std::string date_;
};

}  // namespace

void AddUserChanges(Family &user)
{
    user.Add<UserAdd>();
    user.Add<UserModify>();
    user.Add<UserRename>();
    user.Add<UserDelete>();
    user.Add<UserPasswd>();
    user.Add<UserExpire>();
}

}  // namespace tavoctl
