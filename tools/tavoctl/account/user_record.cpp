// A user as tavoctl handles one.
#include "account/user_record.h"

#include "tavo_group.h"

#include "frame/containers.h"
#include "frame/error_codes.h"
#include "frame/failure.h"
#include "frame/text.h"

#include <algorithm>
#include <cstdio>
#include <ctime>

#include <strings.h>

namespace tavoctl {
namespace {

constexpr time_t day_seconds = 86400;

char *Pointer(const std::string &text)
{
    return const_cast<char *>(text.c_str());  // the library's record has no const; it does not write
}

struct OwnedUser {
    TAVOUSER *user = nullptr;
    ~OwnedUser() { TAVOUserFree(user); }
};

User UserOf(const TAVOUSER &record)
{
    return {.name = record.szName,
            .password = record.szPasswd,
            .uid = record.nUid,
            .gid = record.nGid,
            .description = record.szDesc,
            .home = record.szHome,
            .shell = record.szShell,
            .mail = record.szMail,
            .expires = record.nExpired,
            .cannot_change_password = record.fCannotChgPasswd != 0,
            .kind = record.nKind,
            .privilege = record.nPrivilege};
}

template <class Get>
std::optional<User> UserBy(const std::string &attempted, Get get)
{
    OwnedUser owned;
    if (get(&owned.user) == 0)
        return UserOf(*owned.user);
    if (TLIBErrGet() == ERR_NO_SUCH_USER || TLIBErrGet() == ERR_INVALID_USERNAME)
        return {};
    throw LibraryFailure(attempted);
}

bool SameTexts(const User &a, const User &b)
{
    return a.name == b.name && a.description == b.description && a.shell == b.shell && a.mail == b.mail;
}

// Returns whether the account is what the change made of it. Where the library chooses, whatever it chose is right.
bool IsDone(const UserChange &change)
{
    const std::optional<User> now = FindUser(change.user.name);
    if (!now)
        return false;
    User wanted = change.user;
    if (wanted.shell.empty())
        wanted.shell = now->shell;
    return SameTexts(*now, wanted) && (wanted.uid < 0 || now->uid == wanted.uid) &&
           (wanted.gid < 0 || now->gid == wanted.gid) && std::max(now->expires, -1) == std::max(wanted.expires, -1) &&
           now->cannot_change_password == wanted.cannot_change_password;
}

}  // namespace

TAVOUSER User::Record() const
{
    TAVOUSER record = {};
    record.szName = Pointer(name);
    record.szPasswd = Pointer(password);
    record.nUid = uid;
    record.nGid = gid;
    record.szDesc = Pointer(description);
    record.szHome = Pointer(home);
    record.szShell = Pointer(shell);
    record.nExpired = expires;
    record.fCannotChgPasswd = cannot_change_password;
    record.szMail = Pointer(mail);
    record.nKind = kind;
    record.nPrivilege = privilege;
    return record;
}

std::optional<User> FindUser(const std::string &name)
{
    return UserBy("read the user " + name, [&](TAVOUSER **record) { return TAVOUserGet(name.c_str(), record); });
}

std::optional<User> FindUserById(int uid)
{
    return UserBy("read the user with the id " + std::to_string(Id(uid)),
                  [&](TAVOUSER **record) { return TAVOUserGetByUID(uid, record); });
}

User ReadUser(const std::string &name)
{
    if (std::optional<User> user = FindUser(name))
        return *std::move(user);
    throw NotFound("read the user " + name, ERR_NO_SUCH_USER,
                   DidYouMean(name, UserNames(), "tavoctl user list shows who is there"));
}

std::vector<std::string> UserNames(const std::string &prefix, const std::string &part)
{
    StringList names;
    constexpr int all = TAVO_USER_LOCAL | TAVO_USER_DOMAIN;
    const int count = part.empty() ? TAVOUserEnumByPrefix(names.Address(), all, prefix.c_str())
                                   : TAVOUserEnumBySubstr(names.Address(), all, part.c_str());
    Must(count >= 0, "list the users");
    return names.Items();
}

std::vector<std::string> UserNames()
{
    return UserNames({}, {});
}

namespace {

int SetInOneCall(const std::vector<UserChange> &changes)
{
    const auto records = Mapped(changes, [](const UserChange &change) { return change.user.Record(); });
    const auto users = Mapped(records, [](const TAVOUSER &record) { return &record; });
    const auto old_names =
        Mapped(changes, [](const UserChange &change) { return change.old_name ? change.old_name->c_str() : nullptr; });
    return TAVOUserSet(old_names.data(), users.data(), static_cast<int>(users.size()));
}

}  // namespace

EntryFailures SetUsers(const std::vector<UserChange> &changes, const std::string &attempted)
{
    const AgesByKey ages = ReadPasswordAges();
    Must(SetInOneCall(changes) == 0, attempted);
    EntryFailures failures;
    for (const UserChange &change : changes) {
        const std::size_t before = failures.size();
        if (!IsDone(change))
            TryAgain(
                change.user.name, attempted + ", " + change.user.name, failures, [&] { return SetInOneCall({change}); },
                [&] { return IsDone(change); });
        if (failures.size() == before && change.old_name)
            RestoreAges(ages, *change.old_name, change.user.name);
    }
    return failures;
}

void SetUser(const std::optional<std::string> &old_name, const User &user, const std::string &attempted)
{
    const UserChange change = {old_name, user};
    const AgesByKey ages = ReadPasswordAges();
    TLIBErrSet(ERR_SUCCESS);
    const bool called = SetInOneCall({change}) == 0;
    const Failure failure = LibraryFailure(attempted);
    if (!called || !IsDone(change))
        throw failure;
    if (old_name)
        RestoreAges(ages, *old_name, user.name);
}

bool IsSystemUser(const User &user)
{
    return user.kind == TAVO_USER_KIND_LOCAL && (user.uid < TAVO_USER_UID_MIN || user.uid == TAVO_USER_UID_GUEST);
}

namespace {

std::optional<int> ExpiryOf(const std::string &text)
{
    if (text.empty() || text == "never")
        return -1;
    std::string date = text;
    std::replace(date.begin(), date.end(), '-', '/');
    TAVOUSER record = {};
    // The library takes a date before 1970 for one in the far future.
    if (TAVOUserExpiredDateFill(&record, date.c_str()) != 0 || date < "1970/01/01")
        return {};
    return record.nExpired;
}

std::optional<int> PrivilegeOf(const std::string &text)
{
    const auto mask = AnyNumberIn<int>(text);
    return mask && *mask >= 0 ? mask : std::nullopt;
}

}  // namespace

int ParseExpiry(const std::string &text)
{
    if (const auto day = ExpiryOf(text))
        return *day;
    throw UsageFailure("take " + text + " as a date", std::string("allowed: ") + date_kind.allowed);
}

std::optional<std::string> ExpiryText(int day)
{
    if (day < 0)
        return {};
    const time_t at = time_t{day} * day_seconds;
    std::tm date = {};
    ::gmtime_r(&at, &date);
    char text[32];
    std::strftime(text, sizeof text, "%Y-%m-%d", &date);
    return text;
}

int ParsePrivilege(const std::string &text)
{
    if (const auto mask = PrivilegeOf(text))
        return *mask;
    throw UsageFailure("take " + text + " as privileges", std::string("allowed: ") + privilege_kind.allowed);
}

std::string PrivilegeText(int privilege)
{
    char text[16];
    std::snprintf(text, sizeof text, "0x%02X", static_cast<unsigned>(privilege));
    return text;
}

std::vector<std::string> GroupsOf(const std::string &user)
{
    StringList names;
    Must(TAVOGroupEnum(names.Address(), TAVO_GROUP_LOCAL | TAVO_GROUP_DOMAIN) >= 0, "list the groups");
    std::vector<std::string> groups;
    for (const std::string &group : names.Items()) {
        StringList members;
        Must(TAVOGroupListMember(group.c_str(), members.Address()) >= 0, "list the members of " + group);
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

const ArgumentKind user_kind = {.name = "user", .candidates = UserNames, .sample = "nemo"};

const ArgumentKind new_user_kind = {
    .name = "new user",
    .allowed = "1 to 64 letters, digits, \".\", \"-\", \"_\" and blanks, with a letter or digit first",
    .valid = [](const std::string &name) { return BlTLIBIsUserName(name.c_str()) == 1; },
    .code = ERR_INVALID_USERNAME,
    .sample = "nemo",
    .wrong = "a:b",
};

const ArgumentKind date_kind = {
    .name = "date",
    .allowed = "yyyy-mm-dd from 1970 on, or never",
    .valid = [](const std::string &text) { return ExpiryOf(text).has_value(); },
    .sample = "2037-01-31",
    .wrong = "soon",
};

const ArgumentKind privilege_kind = {
    .name = "privileges",
    .allowed = "a mask such as 0x23",
    .valid = [](const std::string &text) { return PrivilegeOf(text).has_value(); },
    .sample = "0x23",
    .wrong = "many",
};

}  // namespace tavoctl
