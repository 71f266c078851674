// tavoctl user: the verbs that change single accounts.
#include "account/account_rules.h"
#include "account/user_verbs.h"
#include "frame/password.h"

namespace tavoctl {
namespace {

// The facts of an account that add and modify can set.
class UserFacts {
  public:
    explicit UserFacts(Arguments &in)
        : uid_(in.Number("--uid", "N", "user id")), gid_(in.Number("--gid", "N", "primary group (100, users)")),
          description_(in.Option("--description", "TEXT", any_text, "free text, such as the full name")),
          shell_(in.Option("--shell", "PATH", file_path, "login shell (/bin/csh)")),
          mail_(in.Option("--mail", "ADDRESS", any_text, "mail address")),
          privilege_(in.Option("--privilege", "MASK", privilege_kind, "application privileges, such as 0x23")),
          expires_(in.Option("--expires", "DATE", date_kind, "the last day, yyyy-mm-dd, or never")),
          cannot_change_(
              in.OptionalChoice("--cannot-change-password", "yes|no", {"yes", "no"}, "whether the password is fixed"))
    {
    }

    bool Any() const
    {
        return *uid_ || *gid_ || *description_ || *shell_ || *mail_ || *privilege_ || *expires_ || *cannot_change_;
    }

    void Apply(User &user) const
    {
        if (*uid_) {
            RefuseTakenId(user.name, static_cast<int>(**uid_));
            user.uid = static_cast<int>(**uid_);
        }
        if (*gid_)
            user.gid = static_cast<int>(**gid_);
        user.description = description_->value_or(user.description);
        user.shell = shell_->value_or(user.shell);
        user.mail = mail_->value_or(user.mail);
        if (*privilege_)
            user.privilege = ParsePrivilege(**privilege_);
        if (*expires_)
            user.expires = ParseExpiry(**expires_);
        if (*cannot_change_)
            user.cannot_change_password = **cannot_change_ == "yes";
    }

  private:
    Given<std::optional<int64_t>> uid_, gid_;
    Given<std::optional<std::string>> description_, shell_, mail_, privilege_, expires_, cannot_change_;
};

// Changes an account that is there, if the edit makes a difference.
template <class Edit>
void ChangeUser(Call &call, const std::string &name, const std::string &attempted, Edit edit)
{
    const User before = ReadUser(name);
    User after = before;
    edit(after);
    call.Compare("user " + before.name, user_columns, std::optional(before), std::optional(after));
    if (call.Proceed())
        SetUser(name, after, attempted);
}

}  // namespace

Action UserAdd(Arguments &in)
{
    const auto name = in.Text("NAME", new_user_kind, "the new account");
    const UserFacts facts(in);
    const auto home = in.Option("--home", "PATH", any_text, "home folder (/var/services/homes/NAME)");
    const PasswordChoice password(in);
    return [=](Call &call) {
        const std::string attempted = "add the user " + *name;
        User user;
        user.name = *name;
        user.home = home->value_or("");
        if (FindUser(*name))
            throw Failure{.attempted = attempted, .code = ERR_USER_EXISTS};
        RefuseTooMany(1, attempted);
        facts.Apply(user);
        call.Compare("user " + *name, user_columns, std::optional<User>(), std::optional(user));
        if (!call.Proceed())
            return;
        user.password = password.For(*name);
        const int last = LastUserId();
        SetUser({}, user, attempted);
        WarnOfName(*name);
        const User added = ReadUser(*name);
        if (user.uid < 0)
            WarnOfReusedId(*name, added.uid, last);
        call.report.changes.clear();
        call.Compare("user " + *name, user_columns, std::optional<User>(), std::optional(added));
        call.Tell("uid", Id(added.uid));
    };
}

Action UserModify(Arguments &in)
{
    const auto name = in.Text("NAME", user_kind, user_help);
    const UserFacts facts(in);
    return [=](Call &call) {
        RefuseIf(!facts.Any(), "change the user " + *name, "nothing to change was given");
        ChangeUser(call, *name, "change the user " + *name, [&](User &user) { facts.Apply(user); });
    };
}

Action UserPasswd(Arguments &in)
{
    const auto name = in.Text("NAME", user_kind, user_help);
    const PasswordChoice choice(in);
    return [=](Call &call) {
        const std::string attempted = "set the password of " + *name;
        User user = ReadUser(*name);  // checked before the password is asked for
        call.Change("user " + user.name, "password", PasswordState(user.password), "new");
        if (!call.Proceed())
            return;
        const std::string password = choice.For(*name);
        RefuseIf(user.password == password && !password.empty(), attempted, "this is the hash of the one that is set");
        user.password = password;
        SetUser(*name, user, attempted);
    };
}

Action UserExpire(Arguments &in)
{
    const auto name = in.Text("NAME", user_kind, user_help);
    const auto date = in.Text("DATE", date_kind, "yyyy-mm-dd, or never");
    return [=](Call &call) {
        ChangeUser(call, *name, "set the last day of " + *name, [&](User &user) { user.expires = ParseExpiry(*date); });
    };
}

}  // namespace tavoctl
