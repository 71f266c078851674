// tavoctl user import: many accounts in one batch.
#include "account/account_key.h"
#include "account/account_rows.h"
#include "account/account_rules.h"
#include "account/user_columns.h"
#include "account/user_record.h"
#include "account/user_verbs.h"
#include "frame/failure.h"
#include "frame/input_file.h"
#include "frame/password.h"
#include "frame/program.h"

#include <algorithm>
#include <charconv>
#include <set>

namespace tavoctl {
namespace {

int ParseId(const AccountRow &row, const std::string &column)
{
    const std::string *text = row.Find(column);
    if (!text || text->empty())
        return -1;
    int id = -1;
    const auto [stop, error] = std::from_chars(text->data(), text->data() + text->size(), id);
    if (error != std::errc() || stop != text->data() + text->size() || id < 0)
        throw UsageFailure("read the list", row.Where() + ": " + column + " " + *text + " is no id");
    return id;
}

// What the row says goes into the user; an empty value says nothing, except of free texts.
void ApplyRow(const AccountRow &row, User &user)
{
    const auto text = [&](const char *column, std::string &into, bool may_be_empty) {
        const std::string *value = row.Find(column);
        if (value && (may_be_empty || !value->empty()))
            into = *value;
    };
    const auto given = [&](const char *column) -> const std::string * {
        const std::string *value = row.Find(column);
        return value && !value->empty() ? value : nullptr;
    };
    text("name", user.name, false);
    text("description", user.description, true);
    text("mail", user.mail, true);
    text("home", user.home, false);
    text("shell", user.shell, false);
    if (const int uid = ParseId(row, "uid"); uid >= 0)
        user.uid = uid;
    if (const int gid = ParseId(row, "gid"); gid >= 0)
        user.gid = gid;
    if (const std::string *mask = given("privilege"))
        user.privilege = ParsePrivilege(*mask);
    if (const std::string *date = given("expires"))
        user.expires = ParseExpiry(*date);
    if (const std::string *flag = given("cannot_change_password"))
        user.cannot_change_password = ParseYesNo("cannot_change_password", *flag);
}

class UserImport : public Verb {
  public:
    static constexpr VerbInfo info = {
        "import", changes | tells_before,
        "Adds the accounts of a list in one batch, and with --update changes those that are there. The list is "
        "comma-separated values under a line of field names, or a JSON array of objects; the fields are those of "
        "export, and password in clear text. Only name is required. Everything is looked at before anything is "
        "changed.",
        "tavoctl user import --dry-run users.csv\n"
        "tavoctl user import --update --unknown-password users.csv\n"
        "tavoctl user export --json | ssh other tavoctl user import -"};

    void Declare(Arguments &arguments) override
    {
        arguments.Text("FILE", path_, "the list, or - for standard input");
        arguments.Flag("--update", update_, "change accounts that are there, in place of refusing the list");
        password_.Declare(arguments);
    }

    int Run(const Call &call) override
    {
        for (const AccountRow &row : ParseAccountRows(ReadWhole(path_), Columns()))
            Read(row);
        RefuseTooMany(additions_, "import " + path_);
        if (call.dry_run) {
            call.Print(Plan());
            return exit_done;
        }
        if (changes_.empty())
            return exit_done;
        const int last = LastUserId();
        SetUsers(changes_, "import " + path_);
        StoreHashes();
        for (const UserChange &change : changes_) {
            if (change.old_name)
                continue;
            WarnOfName(change.user.name);
            if (change.user.uid < 0)
                WarnOfReusedId(change.user.name, ReadUser(change.user.name).uid, last);
        }
        return exit_done;
    }

  private:
    struct Hashes {
        std::string name, password, lm, nt;
    };

    static std::vector<std::string> Columns()
    {
        std::vector<std::string> columns = UserColumns(WithHashes::yes);
        columns.emplace_back("password");
        return columns;
    }

    void Read(const AccountRow &row)
    {
        const std::string name = *row.Find("name");
        const std::string attempted = "import " + path_ + ", " + row.Where() + ", " + name;
        if (BlTLIBIsUserName(name.c_str()) != 1)
            throw Failure{.attempted = attempted, .code = ERR_INVALID_USERNAME};
        if (!names_.insert(AccountKey(name)).second)
            throw UsageFailure(attempted, "the name is there twice");
        const std::optional<User> old = FindUser(name);
        if (old && !update_)
            throw Failure{.attempted = attempted, .hint = "say --update to change it", .code = ERR_USER_EXISTS};
        UserChange change = {.old_name = {}, .user = old.value_or(User{})};
        if (old)
            change.old_name = old->name;
        else
            ++additions_;
        ApplyRow(row, change.user);
        if (const int uid = change.user.uid; uid >= 0 && !(old && old->uid == uid)) {
            RefuseTakenId(name, uid);
            if (!ids_.insert(uid).second)
                throw UsageFailure(attempted, "the user id " + std::to_string(uid) + " is there twice");
        }
        ChoosePassword(row, change, attempted);
        changes_.push_back(std::move(change));
    }

    void ChoosePassword(const AccountRow &row, UserChange &change, const std::string &attempted)
    {
        const auto value = [&](const char *column) {
            const std::string *text = row.Find(column);
            return text ? *text : std::string();
        };
        const Hashes given = {change.user.name, value("password_hash"), value("lm_hash"), value("nt_hash")};
        const std::string password = value("password");
        const bool hashed = !given.password.empty() && !given.lm.empty() && !given.nt.empty();
        if (!hashed && !(given.password + given.lm + given.nt).empty())
            throw UsageFailure(attempted, "of the three hashes some are missing");
        if (hashed && !password.empty())
            throw UsageFailure(attempted, "it has a password and hashes of one");
        if (!password.empty())
            change.user.password = password;
        else if (hashed && !change.old_name)
            change.user.password = UnknownPassword();  // for the moment until the hashes are stored
        else if (!change.old_name && password_.IsMade())
            change.user.password = password_.For(change.user.name);
        else if (!change.old_name)
            throw UsageFailure(attempted, "it has no password", "say --unknown-password or --empty-password");
        if (hashed)
            hashes_.push_back(given);
    }

    void StoreHashes() const
    {
        std::vector<User> users;
        for (const Hashes &hash : hashes_)
            users.emplace_back().name = hash.name;
        std::vector<TAVOUSER> records;
        for (const User &user : users)
            records.push_back(user.Record());
        std::vector<const TAVOUSER *> rows;
        std::vector<const char *> password, lm, nt;
        for (std::size_t i = 0; i < hashes_.size(); ++i) {
            rows.push_back(&records[i]);
            password.push_back(hashes_[i].password.c_str());
            lm.push_back(hashes_[i].lm.c_str());
            nt.push_back(hashes_[i].nt.c_str());
        }
        const std::string attempted = "store the hashes of " + path_;
        const int count = static_cast<int>(rows.size());
        TLIBErrSet(ERR_SUCCESS);
        const int result = count ? TAVOUserSetPasswd(rows.data(), password.data(), lm.data(), nt.data(), count) : 0;
        Failure failure = LibraryFailure(attempted);
        if (result != 0)
            throw failure;
        for (const Hashes &hash : hashes_)
            if (ReadUser(hash.name).password != hash.password) {
                failure.reason = "those of " + hash.name + " were refused";
                throw failure;
            }
    }

    Table Plan() const
    {
        Table table({"action", "name", "uid", "gid", "description", "mail", "expires", "password"});
        for (const UserChange &change : changes_) {
            const User &user = change.user;
            const bool hashed =
                std::any_of(hashes_.begin(), hashes_.end(), [&](const Hashes &hash) { return hash.name == user.name; });
            const bool keeps =
                change.old_name && !hashed && user.password == FindUser(*change.old_name).value_or(User{}).password;
            table.Add({change.old_name ? "change" : "add", user.name, user.uid < 0 ? Cell() : Cell(user.uid),
                       user.gid < 0 ? Cell(int{TAVO_USER_GID_DEFAULT}) : Cell(user.gid), user.description, user.mail,
                       ExpiryCell(user.expires), keeps ? "kept" : "new"});
        }
        return table;
    }

    std::string path_;
    bool update_ = false;
    PasswordChoice password_;
    int additions_ = 0;
    std::vector<UserChange> changes_;
    std::vector<Hashes> hashes_;
    std::set<std::string> names_;
    std::set<int> ids_;
};

}  // namespace

void AddUserImport(Family &user)
{
    user.Add<UserImport>();
}

}  // namespace tavoctl
