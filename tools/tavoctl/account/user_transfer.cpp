// tavoctl user: many accounts at once, from and to files.
#include "account/account_check.h"
#include "account/account_plans.h"
#include "account/user_verbs.h"
#include "frame/password.h"

#include <algorithm>
#include <map>

namespace tavoctl {
namespace {

struct SambaHashes {
    std::string lm, nt;
};

// Samba's two hashes of every account that has some, by the key of its name.
std::map<std::string, SambaHashes> ReadSambaHashes()
{
    std::map<std::string, SambaHashes> found;
    for (const auto &fields : FieldsIn("/usr/tavo/etc/private/smbpasswd"))
        if (fields.size() > 3 && fields[2].find('X') == std::string::npos)
            found[AccountKey(fields[0])] = {fields[2], fields[3]};
    return found;
}

// Copies the facts of the row into the user; empty values are ignored, except for free texts.
void ApplyRow(const AccountRow &row, User &user)
{
    const auto given = [&](const char *column) -> const std::string * {
        const std::string *value = row.Find(column);
        return value && !value->empty() ? value : nullptr;
    };
    const auto set = [](const std::string *value, std::string &into) {
        if (value)
            into = *value;
    };
    set(given("name"), user.name);
    set(row.Find("description"), user.description);
    set(row.Find("mail"), user.mail);
    set(given("home"), user.home);
    set(given("shell"), user.shell);
    user.uid = ImportedRows<UserKind>::IdIn(row, "uid").value_or(user.uid);
    user.gid = ImportedRows<UserKind>::IdIn(row, "gid").value_or(user.gid);
    if (const std::string *mask = given("privilege"))
        user.privilege = ParsePrivilege(*mask);
    if (const std::string *date = given("expires"))
        user.expires = ParseExpiry(*date);
    if (const std::string *flag = given("cannot_change_password")) {
        RefuseIf(*flag != "yes" && *flag != "no", "take " + *flag + " as cannot_change_password", "allowed: yes, no");
        user.cannot_change_password = *flag == "yes";
    }
}

constexpr char locked_hash[] = "!";

// The password of a row, or its hashes, or what the options say. True when it is going to be another one.
bool ChoosePassword(const AccountRow &row, const PasswordChoice *choice, const std::string &attempted,
                    UserChange &change, UserPlan &plan)
{
    const auto value = [&](const char *column) {
        const std::string *text = row.Find(column);
        return text ? *text : std::string();
    };
    const GivenHashes given = {change.user.name, value("password_hash"), value("lm_hash"), value("nt_hash")};
    const std::string password = value("password");
    const bool hashed = !given.password.empty() && !given.lm.empty() && !given.nt.empty();
    RefuseIf(!hashed && !(given.password + given.lm + given.nt).empty(), attempted,
             "of the three hashes some are missing");
    RefuseIf(hashed && !password.empty(), attempted, "it has a password and hashes of one");
    bool differs = hashed && change.user.password != given.password;
    if (!password.empty())
        change.user.password = password;
    else if (hashed && !change.old_name)
        change.user.password = UnknownPassword();  // for the moment until the hashes are stored
    else if (!hashed && !choice && row.Find("password_hash")) {
        differs = !change.user.password.empty();
        change.user.password.clear();
    } else if (!hashed && !change.old_name && !choice) {
        change.user.password = UnknownPassword();  // Samba's hashes stay those of it
        plan.locked.push_back(change.user.name);
    } else if (!hashed && !change.old_name && choice->IsMade())
        change.user.password = choice->For(change.user.name);
    else if (!hashed && !change.old_name)
        throw UsageFailure(attempted, "it has no password", "use --unknown-password or --empty-password");
    if (hashed && (differs || !change.old_name))
        plan.hashes.push_back(given);
    return differs || !password.empty() || !change.old_name;
}

void StoreHashes(const std::vector<GivenHashes> &hashes, const std::string &attempted, EntryFailures &failures)
{
    const auto users = Mapped(hashes, [](const GivenHashes &hash) {
        User user;
        user.name = hash.name;
        return user;
    });
    const auto records = Mapped(users, &User::Record);
    const auto rows = Mapped(records, [](const TAVOUSER &record) { return &record; });
    const auto texts = [&](std::string GivenHashes::*text) {
        return Mapped(hashes, [=](const GivenHashes &hash) { return (hash.*text).c_str(); });
    };
    const auto password = texts(&GivenHashes::password), lm = texts(&GivenHashes::lm), nt = texts(&GivenHashes::nt);
    const int count = static_cast<int>(rows.size());
    const AgesByKey ages = ReadPasswordAges();
    Must(!count || TAVOUserSetPasswd(rows.data(), password.data(), lm.data(), nt.data(), count) == 0, attempted);
    for (std::size_t i = 0; i < hashes.size(); ++i) {
        const GivenHashes &hash = hashes[i];
        const auto is_stored = [&] { return ReadUser(hash.name).password == hash.password; };
        const std::size_t before = failures.size();
        if (!is_stored())
            TryAgain(
                hash.name, attempted + ", " + hash.name, failures,
                [&] { return TAVOUserSetPasswd(&rows[i], &password[i], &lm[i], &nt[i], 1); }, is_stored);
        if (failures.size() == before)
            RestoreAges(ages, hash.name, hash.name);
    }
}

}  // namespace

UserPlan PlanUsers(Call &call, const std::string &path, bool update, const std::vector<AccountRow> &list,
                   const PasswordChoice *password)
{
    ImportedRows<UserKind> rows(path, update);
    UserPlan plan = {.path = path};
    for (const AccountRow &row : list) {
        const std::optional<User> old = rows.Present(row);
        UserChange change = {.old_name = {}, .user = old.value_or(User{})};
        if (old)
            change.old_name = old->name;
        else
            ++plan.additions;
        ApplyRow(row, change.user);
        if (old)
            change.user.home = old->home;  // the library moves none
        if (const int uid = change.user.uid; uid >= 0 && !(old && old->uid == uid))
            rows.TakeId(row, uid);
        User described = change.user;
        const bool differs = ChoosePassword(row, password, rows.Attempted(row), change, plan);
        const std::string object = "user " + change.user.name;
        const std::size_t before = call.report.changes.size();
        plan.entries.push_back(change.user.name);
        const bool locked = !plan.locked.empty() && plan.locked.back() == change.user.name;
        described.password = old ? old->password : locked ? locked_hash : change.user.password;
        call.Compare(object, user_columns, old, std::optional(described));
        if (old && differs)
            call.Change(object, "password", PasswordState(old->password), "new");
        if (call.report.changes.size() > before)
            plan.changes.push_back(std::move(change));
    }
    RefuseTooMany(plan.additions, "import " + path);
    return plan;
}

EntryFailures CarryOut(const UserPlan &plan)
{
    const int last = LastUserId();
    EntryFailures failures = SetUsers(plan.changes, "import " + plan.path);
    const auto failed = [&](const std::string &name) {
        return std::any_of(failures.begin(), failures.end(),
                           [&](const auto &failure) { return failure.first == name; });
    };
    std::vector<GivenHashes> hashes = plan.hashes;
    const auto samba = plan.locked.empty() ? std::map<std::string, SambaHashes>() : ReadSambaHashes();
    for (const std::string &name : plan.locked)
        if (const auto found = samba.find(AccountKey(name)); found != samba.end())
            hashes.push_back({name, locked_hash, found->second.lm, found->second.nt});
    std::erase_if(hashes, [&](const GivenHashes &hash) { return failed(hash.name); });
    StoreHashes(hashes, "store the hashes of " + plan.path, failures);
    for (const UserChange &change : plan.changes) {
        if (change.old_name || failed(change.user.name))
            continue;
        WarnOfName(change.user.name);
        if (change.user.uid < 0)
            WarnOfReusedId(change.user.name, ReadUser(change.user.name).uid, last);
    }
    return failures;
}

void ThrowFirst(const EntryFailures &failures)
{
    if (failures.empty())
        return;
    Failure failure = failures.front().second;
    if (failures.size() > 1)
        failure.AddHint(std::to_string(failures.size()) + " entries were refused");
    throw failure;
}

std::vector<User> LocalUsers()
{
    std::vector<User> users = UserKind::All({}, {});
    std::erase_if(users, [](const User &user) { return user.kind == TAVO_USER_KIND_DOMAIN; });
    return users;
}

Table ExportedUsers(const std::vector<User> &users, bool hashes)
{
    const auto samba = hashes ? ReadSambaHashes() : std::map<std::string, SambaHashes>();
    std::vector<ColumnFacts> columns = Facts(user_export_columns);
    std::erase_if(columns, [&](const ColumnFacts &column) { return column.place == in_one && !hashes; });
    for (ColumnFacts &column : columns)
        column.place = in_list;
    Table table(columns);
    for (const User &user : users) {
        ExportedUser exported = {user, {}, {}, {}};
        const auto found = samba.find(AccountKey(user.name));
        if (found != samba.end() && user.password.starts_with('$'))
            exported = {user, user.password, found->second.lm, found->second.nt};
        else if (user.password.empty())
            exported.hash = "";
        std::vector<Cell> row = Mapped(user_export_columns, [&](const auto &column) { return column.read(exported); });
        row.resize(columns.size());
        table.Add(std::move(row));
    }
    return table;
}

Action UserExport(Arguments &in)
{
    const auto hashes = in.Flag("--hashes", "with the hashes of the passwords");
    const auto path = in.Option("--output", "PATH", file_path, "a new file that only root can read (standard output)");
    return [=](Call &call) { Export(call, ExportedUsers(LocalUsers(), *hashes), *path); };
}

Action UserImport(Arguments &in)
{
    const auto path = in.Text("FILE", file_path, "the list, or - for standard input");
    const auto update = in.Flag("--update", "change accounts that are there, in place of refusing the list");
    const PasswordChoice password(in);
    return [=](Call &call) {
        std::vector<std::string> columns = Names(user_export_columns);
        columns.emplace_back("password");
        const UserPlan plan = PlanUsers(call, *path, *update, ParseAccountRows(ReadWhole(*path), columns), &password);
        for (const std::string &name : plan.entries)
            call.BeginEntry("user " + name);
        if (call.Proceed())
            for (const auto &[name, failure] : CarryOut(plan))
                call.FailEntry("user " + name, failure);
    };
}

}  // namespace tavoctl
