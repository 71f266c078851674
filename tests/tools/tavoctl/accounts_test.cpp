// tavoctl user, group and quota: their changes of the files, and refusals before any change.
#include "run_tavoctl.h"
#include "support/domain_entries.h"
#include "support/test.h"

#include <nlohmann/json.hpp>

#include <crypt.h>
#include <sys/inotify.h>
#include <utmpx.h>

namespace {

using nlohmann::json;
using test::ReadFile;
using test::Succeeds;
using test::Tavoctl;
using test::TavoctlAtTerminal;
using test::Words;
using test::WriteFile;
using testing::Contains;
using testing::HasSubstr;
using testing::Not;

constexpr char passwd[] = "/etc/passwd";
constexpr char shadow[] = "/etc/shadow";
constexpr char misc[] = "/etc/tavouser.conf";
constexpr char samba[] = "/usr/tavo/etc/private/smbpasswd";
constexpr char groups[] = "/etc/group";

// The fields of an account's line; none when there is no line.
std::vector<std::string> Fields(const char *path, const std::string &name)
{
    std::istringstream lines(std::filesystem::exists(path) ? ReadFile(path) : "");
    std::vector<std::string> fields;
    for (std::string line; std::getline(lines, line);) {
        if (!line.starts_with(name + ":"))
            continue;
        std::istringstream rest(line + ":");
        for (std::string field; std::getline(rest, field, ':');)
            fields.push_back(field);
    }
    return fields;
}

std::string Line(const char *path, const std::string &name)
{
    std::string line;
    for (const std::string &field : Fields(path, name))
        line += field + ":";
    return line.substr(0, line.empty() ? 0 : line.size() - 1);
}

std::vector<std::string> AccountFiles()
{
    std::vector<std::string> texts;
    for (const char *path : {passwd, shadow, misc, samba, groups, "/etc/group_desc"})
        texts.push_back(std::filesystem::exists(path) ? ReadFile(path) : "");
    return texts;
}

bool PasswordIs(const std::string &user, const std::string &password)
{
    const std::vector<std::string> fields = Fields(shadow, user);
    crypt_data data = {};
    return fields.size() > 1 && fields[1] == ::crypt_r(password.c_str(), fields[1].c_str(), &data);
}

json Shown(Words words)
{
    words.emplace_back("--json");
    const test::Ran ran = Tavoctl(words);
    EXPECT_TRUE(json::accept(ran.out)) << testing::PrintToString(words) << ran;
    return json::accept(ran.out) ? test::Facts(ran) : json();
}

class TavoctlAccounts : public testing::Test {
  protected:
    void SetUp() override
    {
        Succeeds({"user", "add", "anna", "--description", "Anna: of Berg", "--mail", "anna@example.com", "--shell",
                  "/bin/sh", "--privilege", "0x23", "--expires", "2037-01-31"},
                 "secret one\nmore");
        Succeeds({"user", "add", "berta", "--uid", "2000", "--gid", "101", "--cannot-change-password", "yes",
                  "--empty-password"});
    }
};

TEST_F(TavoctlAccounts, UsersAreAddedChangedAndRenamed)
{
    const std::string uid = Fields(passwd, "anna").at(2);
    EXPECT_EQ(Line(passwd, "anna"), "anna:x:" + uid + ":100:Anna%3A of Berg:/var/services/homes/anna:/bin/sh");
    EXPECT_EQ(Line(passwd, "berta"), "berta:x:2000:101::/var/services/homes/berta:/bin/csh");
    EXPECT_EQ(Line(misc, "anna"), "anna:35:anna@example.com");
    EXPECT_EQ(Fields(shadow, "anna").at(7), "24502");
    EXPECT_EQ(Fields(shadow, "berta").at(3), "100000");
    EXPECT_TRUE(PasswordIs("anna", "secret one"));
    EXPECT_TRUE(PasswordIs("berta", ""));

    // Facts that are not given stay, the password with its hashes too.
    const std::string hash = Fields(shadow, "anna").at(1);
    const std::vector<std::string> samba_before = Fields(samba, "anna");
    Succeeds({"user", "modify", "ANNA", "--description", "", "--cannot-change-password", "yes"});
    EXPECT_EQ(Line(passwd, "anna"), "anna:x:" + uid + ":100::/var/services/homes/anna:/bin/sh");
    EXPECT_EQ(Line(misc, "anna"), "anna:35:anna@example.com");
    EXPECT_EQ(Fields(shadow, "anna").at(1), hash);
    EXPECT_EQ(Fields(shadow, "anna").at(3), "100000");
    Succeeds({"user", "expire", "anna", "never"});
    EXPECT_EQ(Fields(shadow, "anna").at(7), "");
    EXPECT_EQ(Fields(samba, "anna").at(2), samba_before.at(2));
    EXPECT_EQ(Fields(samba, "anna").at(3), samba_before.at(3));

    Succeeds({"group", "add", "staff", "--members", "Berta,anna", "--description", "All of us"});
    Succeeds({"user", "rename", "anna", "Anna"});
    Succeeds({"user", "rename", "berta", "bert"});
    EXPECT_EQ(Line(passwd, "Anna"), "Anna:x:" + uid + ":100::/var/services/homes/Anna:/bin/sh");
    EXPECT_EQ(Line(passwd, "anna") + Line(passwd, "berta"), "");
    EXPECT_EQ(Fields(groups, "staff").at(3), "bert,Anna");
    EXPECT_TRUE(PasswordIs("Anna", "secret one"));

    EXPECT_EQ(Tavoctl({"user", "delete", "anna", "bert"}).status, 2);  // there is no terminal to ask at
    Succeeds({"user", "delete", "--yes", "anna", "bert"});
    EXPECT_EQ(Line(passwd, "Anna") + Line(shadow, "Anna") + Line(misc, "bert") + Line(samba, "bert"), "");
    EXPECT_EQ(Line(groups, "staff"), "staff:x:" + Fields(groups, "staff").at(2) + ":");
}

TEST_F(TavoctlAccounts, GroupsAreAddedChangedAndRenamed)
{
    Succeeds({"group", "add", "staff"});
    const std::string gid = Fields(groups, "staff").at(2);
    Succeeds({"group", "modify", "staff", "--join", "ANNA,berta,anna"});
    EXPECT_EQ(Line(groups, "staff"), "staff:x:" + gid + ":anna,berta");
    Succeeds({"group", "modify", "STAFF", "--leave", "Anna", "--description", "Us"});
    EXPECT_EQ(Line(groups, "staff"), "staff:x:" + gid + ":berta");
    Succeeds({"group", "modify", "staff", "--members", "", "--gid", "70000"});
    Succeeds({"group", "rename", "staff", "Team"});
    EXPECT_EQ(Line(groups, "Team") + Line(groups, "staff"), "Team:x:70000:");
    EXPECT_EQ(Line("/etc/group_desc", "Team"), "Team:Us");
    EXPECT_EQ(Shown({"group", "show", "team"}), json::parse(R"({"name": "Team", "kind": "local", "gid": 70000,
        "description": "Us", "members": [], "strangers": []})"));
    EXPECT_THAT(Shown({"group", "show", "users"}).at("members"), testing::AllOf(Contains("anna"), Contains("admin")));
    Succeeds({"group", "delete", "--yes", "team"});
    EXPECT_EQ(Line(groups, "Team"), "");
}

TEST_F(TavoctlAccounts, ReadingVerbsSayTheSameAsTheFiles)
{
    const int uid = std::stoi(Fields(passwd, "anna").at(2));
    json anna = {{"name", "anna"},
                 {"kind", "local"},
                 {"uid", uid},
                 {"gid", 100},
                 {"description", "Anna: of Berg"},
                 {"home", "/var/services/homes/anna"},
                 {"shell", "/bin/sh"},
                 {"mail", "anna@example.com"},
                 {"privilege", "0x23"},
                 {"password", "set"},
                 {"cannot_change_password", false},
                 {"expires", "2037-01-31"},
                 {"expired", false},
                 {"min_days", 0},
                 {"max_days", 99999},
                 {"warn_days", 7},
                 {"groups", {"users"}}};
    EXPECT_EQ(Shown({"user", "show", "Anna"}), anna);
    EXPECT_EQ(Shown({"user", "show", "--uid", std::to_string(uid)}), anna);
    EXPECT_EQ(Shown({"user", "show", "admin"}).at("password"), "locked");

    const auto names = [](const json &list) {
        std::vector<std::string> found;
        for (const json &row : list)
            found.push_back(row.at("name"));
        return found;
    };
    EXPECT_THAT(names(Shown({"user", "list"})), testing::ElementsAre("admin", "anna", "berta", "guest"));
    EXPECT_THAT(names(Shown({"user", "list", "--prefix", "A"})), testing::ElementsAre("admin", "anna"));
    EXPECT_THAT(names(Shown({"user", "list", "--part", "ERT"})), testing::ElementsAre("berta"));
    const json guest = Shown({"user", "list", "--prefix", "guest"}).at(0);
    EXPECT_EQ(guest.at("expires"), "1970-01-02");
    EXPECT_EQ(guest.at("expired"), true);
    EXPECT_EQ(Tavoctl({"--complete", "user", "show", "an"}).out, "anna\n");
}

struct Refusal {
    Words words;
    int status;
    const char *reason;
};

TEST_F(TavoctlAccounts, RefusalsChangeNothing)
{
    const Refusal refusals[] = {
        {{"user", "add", "--empty-password", "Anna"}, 1, "ERR_USER_EXISTS"},
        {{"user", "add", "--empty-password", "a:b"}, 2, "ERR_INVALID_USERNAME"},
        {{"user", "add", "--empty-password", "..", "--uid", "3000"}, 2, "ERR_INVALID_USERNAME"},
        {{"user", "add", "--empty-password", "eve", "--home", "/var/../etc"}, 2, "ERR_BAD_PARAMETERS"},
        {{"user", "add", "--empty-password", "eve", "--shell", "/bin/sh:"}, 2, "ERR_BAD_PARAMETERS"},
        {{"user", "add", "--empty-password", "eve", "--uid", "2000"}, 2, "berta"},
        {{"user", "modify", "anna", "--uid", "0"}, 2, "root"},
        {{"user", "rename", "anna", "BERTA"}, 1, "ERR_USER_EXISTS"},
        {{"user", "rename", "anna", "an/na"}, 2, "ERR_INVALID_USERNAME"},
        {{"user", "passwd", "nemo"}, 3, "ERR_NO_SUCH_USER"},
        {{"user", "show", "nemo"}, 3, "ERR_NO_SUCH_USER"},
        {{"user", "delete", "--yes", "anna", "nemo"}, 3, "ERR_NO_SUCH_USER"},
        {{"user", "delete", "--yes", "anna", "Admin", "--system"}, 1, "ERR_USER_DB_DELETE"},
        {{"user", "delete", "--yes", "anna", "guest"}, 2, "--system"},
        {{"group", "delete", "--yes", "users", "--system"}, 2, "the primary group of"},
        {{"user", "lock", "anna", "guest"}, 2, "--system"},
        {{"user", "unlock", "anna", "admin", "--system"}, 2, "no password to go back to"},
        {{"user", "aging", "anna"}, 2, "nothing to change"},
        {{"user", "aging", "anna", "--min", "90", "--max", "90"}, 2, "--max must be above --min"},
        {{"user", "aging", "berta", "--max", "90"}, 2, "fixed"},
        {{"group", "add", "sixteen letters!"}, 2, "ERR_INVALID_GROUPNAME"},
        {{"group", "add", "Users"}, 1, "ERR_GROUP_EXISTS"},
        {{"group", "add", "staff", "--members", "anna,nemo"}, 3, "nemo"},
        {{"group", "add", "staff", "--description", "a:b"}, 2, "ERR_BAD_PARAMETERS"},
        {{"group", "add", "staff", "--gid", "100"}, 2, "users"},
        {{"group", "modify", "administrators", "--leave", "anna"}, 3, "it is not a member"},
        {{"group", "rename", "nemo", "nobodies"}, 3, "ERR_NO_SUCH_GROUP"},
        {{"quota", "set", "anna", "7", "1M"}, 3, "not mounted"},
        {{"quota", "get", "anna", "7"}, 3, "not mounted"},
    };
    for (const Refusal &refusal : refusals) {
        const std::vector<std::string> before = AccountFiles();
        test::IsRefused(refusal.words, refusal.reason, refusal.status);
        EXPECT_EQ(AccountFiles(), before) << testing::PrintToString(refusal.words);
    }
}

// A process of berta's, and then a session that the system has recorded.
TEST_F(TavoctlAccounts, UsersWhoAreAtWorkAreDeletedByForceOnly)
{
    if (test::RootLacks("uids"))
        GTEST_SKIP() << "nobody else to become";
    const Words remove = {"user", "delete", "--yes", "anna", "berta"};
    const pid_t pid = ::fork();
    if (pid == 0) {
        if (::setuid(2000) == 0)
            ::pause();
        ::_exit(1);
    }
    test::Ran ran = {};
    EXPECT_TRUE(test::Eventually([&] {
        return (ran = Tavoctl({"user", "delete", "--dry-run", "berta"})).status == 4;
    }));
    EXPECT_THAT(ran.err, testing::AllOf(HasSubstr("running the process " + std::to_string(pid)), HasSubstr("--force")));
    EXPECT_EQ(Tavoctl(remove).status, 4);
    EXPECT_NE(Line(passwd, "anna"), "");
    EXPECT_NE(Line(passwd, "berta"), "");
    ::kill(pid, SIGKILL);
    ::waitpid(pid, nullptr, 0);

    utmpx session = {};
    session.ut_type = USER_PROCESS;
    session.ut_pid = ::getpid();
    std::strcpy(session.ut_user, "berta");
    std::strcpy(session.ut_line, "pts/7");
    const auto record = [&] {
        WriteFile("/var/run/utmp", std::string(reinterpret_cast<char *>(&session), sizeof session));
    };
    record();
    ran = Tavoctl(remove);
    EXPECT_EQ(ran.status, 4) << ran;
    EXPECT_THAT(ran.err, HasSubstr("logged in at pts/7"));
    session.ut_pid = pid;  // which has ended
    record();
    EXPECT_EQ(Tavoctl({"user", "delete", "--dry-run", "anna", "berta"}).status, 0);
    session.ut_pid = ::getpid();
    record();
    Succeeds({"user", "delete", "--yes", "--force", "anna", "berta"});
    EXPECT_EQ(Line(passwd, "anna") + Line(passwd, "berta"), "");

    Succeeds({"group", "add", "staff", "--gid", "70000"});
    Succeeds({"user", "add", "carla", "--empty-password", "--gid", "70000"});
    ran = Tavoctl({"group", "delete", "--yes", "staff"});
    EXPECT_EQ(ran.status, 2) << ran;
    EXPECT_THAT(ran.err, HasSubstr("the primary group of carla"));
    Succeeds({"group", "delete", "--yes", "--force", "staff"});
    EXPECT_EQ(Line(groups, "staff"), "");
}

TEST_F(TavoctlAccounts, LocksAndAgesOutliveOtherChanges)
{
    const std::string hash = Fields(shadow, "anna").at(1);
    Succeeds({"user", "aging", "anna", "--min", "1", "--max", "90", "--warn", "14"});
    Succeeds({"user", "lock", "anna", "berta"});
    Succeeds({"user", "lock", "anna"});
    Succeeds({"user", "modify", "anna", "--description", "away"});
    Succeeds({"user", "rename", "anna", "anna2"});
    EXPECT_EQ(Fields(shadow, "anna2").at(1), "!" + hash);
    EXPECT_EQ(Fields(samba, "anna2").at(4), "[DU         ]");
    const json user = Shown({"user", "show", "anna2"});
    EXPECT_THAT((std::vector<json>{user.at("min_days"), user.at("max_days"), user.at("warn_days")}),
                testing::ElementsAre(1, 90, 14));
    EXPECT_EQ(user.at("password"), "locked");

    Succeeds({"user", "unlock", "anna2", "berta"});
    EXPECT_EQ(Fields(shadow, "anna2").at(1), hash);
    EXPECT_EQ(Fields(samba, "anna2").at(4), "[U          ]");
    EXPECT_TRUE(PasswordIs("anna2", "secret one"));
    // The password of berta is fixed by her ages.
    Succeeds({"user", "aging", "berta", "--warn", "3"});
    Succeeds({"user", "modify", "berta", "--cannot-change-password", "no"});
    EXPECT_EQ(Line(shadow, "berta").substr(Line(shadow, "berta").find(":0:99999:")), ":0:99999:3:::");
}

TEST_F(TavoctlAccounts, NamesThatMislead)
{
    EXPECT_THAT(Tavoctl({"user", "add", "--unknown-password", "0815"}).err, HasSubstr("warning"));
    EXPECT_THAT(Tavoctl({"user", "add", "--unknown-password", "a b"}).err, HasSubstr("warning"));
    EXPECT_THAT(Tavoctl({"user", "rename", "a b", "\xD0\xB0nna"}).err, HasSubstr("warning"));
    // All ids were assigned once, so the next one belonged to a deleted user.
    WriteFile(misc, "#$_@UID__INDEX@_$3072$\n" + ReadFile(misc).substr(ReadFile(misc).find('\n') + 1));
    const test::Ran ran = Tavoctl({"user", "add", "--unknown-password", "carla"});
    EXPECT_EQ(ran.status, 0) << ran;
    EXPECT_THAT(ran.err, HasSubstr("the user id " + Fields(passwd, "carla").at(2) + " belonged to a deleted user"));
    EXPECT_FALSE(PasswordIs("carla", ""));
}

TEST_F(TavoctlAccounts, TheModelsLimitHolds)
{
    // Four are there: as many as the model allows, and then one and two too many.
    for (const char *most : {"4", "3", "2"}) {
        WriteFile("/etc.defaults/tavoinfo.conf", "supportguest=yes\nmaxaccounts=" + std::string(most) + "\n");
        EXPECT_THAT(Tavoctl({"user", "add", "--empty-password", "carla"}).err, HasSubstr("ERR_TOO_MANY_USERS")) << most;
        EXPECT_THAT(Tavoctl({"user", "import", "-"}, "name,password\ncarla,x\n").err, HasSubstr("ERR_TOO_MANY_USERS"));
    }
    EXPECT_EQ(Line(passwd, "carla"), "");
    for (const char *settings : {"supportguest=yes\nmaxaccounts=5\n", "supportguest=yes\n"}) {
        WriteFile("/etc.defaults/tavoinfo.conf", settings);
        Succeeds({"user", "add", "--empty-password", "carla"});
        Succeeds({"user", "delete", "--yes", "carla"});
    }
}

TEST_F(TavoctlAccounts, PasswordsAreTypedTwiceAndNeverShown)
{
    if (test::RootLacks("pts"))
        GTEST_SKIP() << "no terminals here";
    const auto type = [](const char *first, const char *second) {
        return TavoctlAtTerminal({"user", "passwd", "anna"}, {{"Password of anna: ", first}, {"Again: ", second}});
    };
    const test::Ran good = type("n3w w0rd\n", "n3w w0rd\n");
    EXPECT_EQ(good.status, 0) << good;
    EXPECT_EQ(good.out, "Password of anna: \r\nAgain: \r\n");
    EXPECT_TRUE(PasswordIs("anna", "n3w w0rd"));
    EXPECT_EQ(type("one\n", "two\n").status, 1);
    EXPECT_EQ(type("\n", "").status, 2);
    EXPECT_TRUE(PasswordIs("anna", "n3w w0rd"));

    Succeeds({"user", "passwd", "anna"}, "piped\n");
    EXPECT_TRUE(PasswordIs("anna", "piped"));
    EXPECT_EQ(Tavoctl({"user", "passwd", "anna"}, "").status, 2);
    EXPECT_EQ(Tavoctl({"user", "passwd", "anna"}, std::string("a\0b\n", 4)).status, 2);
    EXPECT_EQ(Tavoctl({"user", "passwd", "anna"}, Fields(shadow, "anna").at(1)).status, 2);
    EXPECT_TRUE(PasswordIs("anna", "piped"));
    Succeeds({"user", "passwd", "anna", "--empty-password"});
    EXPECT_TRUE(PasswordIs("anna", ""));
}

TEST_F(TavoctlAccounts, ExportedAccountsComeBackAsTheyWere)
{
    const test::ScratchDir dir;
    Succeeds({"user", "modify", "anna", "--description", "A, \"B\": ' C"});
    for (const bool as_json : {false, true}) {
        Words words = {"user", "export", "--hashes", "--output", dir / (as_json ? "u.json" : "u.csv")};
        Words group_words = {"group", "export", "--output", dir / (as_json ? "g.json" : "g.csv")};
        if (as_json) {
            words.emplace_back("--json");
            group_words.emplace_back("--json");
        }
        Succeeds({"group", "add", "staff", "--members", "berta,anna", "--description", "x, y"});
        Succeeds(words);
        Succeeds(group_words);
        struct stat state = {};
        EXPECT_EQ(::stat(words[4].c_str(), &state), 0);
        EXPECT_EQ(state.st_mode & 07777u, 0600u);
        EXPECT_EQ(Tavoctl(words).status, 1) << "a file that is there stays";

        std::vector<std::string> before;
        for (const char *name : {"anna", "berta"})
            for (const char *path : {passwd, shadow, misc, samba})
                before.push_back(Line(path, name).substr(0, Line(path, name).find(":LCT-")));
        Succeeds({"user", "delete", "--yes", "anna", "berta"});
        Succeeds({"group", "delete", "--yes", "staff"});
        EXPECT_EQ(Tavoctl({"user", "import", words[4]}).status, 1) << "admin is there";
        EXPECT_EQ(Line(passwd, "anna"), "");
        Succeeds({"user", "import", "--update", words[4]});
        Succeeds({"group", "import", group_words[3]});
        std::vector<std::string> after;
        for (const char *name : {"anna", "berta"})
            for (const char *path : {passwd, shadow, misc, samba})
                after.push_back(Line(path, name).substr(0, Line(path, name).find(":LCT-")));
        EXPECT_EQ(after, before);
        EXPECT_EQ(Fields(groups, "staff").at(3), "berta,anna");
        EXPECT_EQ(Line("/etc/group_desc", "staff"), "staff:x, y");
        EXPECT_EQ(Fields(shadow, "admin").at(1), "*") << "what has no password does not get one";
        Succeeds({"group", "delete", "--yes", "staff"});
    }
    // Hashes are only exported on request.
    EXPECT_THAT(Tavoctl({"user", "export"}).out, testing::AllOf(HasSubstr("anna"), Not(HasSubstr("$1$"))));
    EXPECT_THAT(Tavoctl({"user", "export", "--json"}).out, testing::AllOf(HasSubstr("anna"), Not(HasSubstr("hash"))));
}

// Their controller keeps them: a list with them could not be imported.
TEST_F(TavoctlAccounts, AccountsOfADomainAreShownAndNotExported)
{
    ASSERT_NO_FATAL_FAILURE(test::PutDomainEntries(0));
    for (const char *family : {"user", "group"}) {
        EXPECT_THAT(Tavoctl({family, "list"}).out, HasSubstr("DOM")) << family;
        EXPECT_THAT(Tavoctl({family, "export"}).out, Not(HasSubstr("DOM"))) << family;
    }
}

TEST_F(TavoctlAccounts, ImportIsOneBatch)
{
    std::string list = "name,password\r\n";
    for (int i = 0; i < 50; ++i)
        list += "user" + std::to_string(i) + ",pw" + std::to_string(i) + "\r\n";
    const int watch = ::inotify_init1(IN_NONBLOCK | IN_CLOEXEC);
    ASSERT_GE(::inotify_add_watch(watch, "/etc", IN_MOVED_TO), 0);
    Succeeds({"user", "import", "-"}, list);
    alignas(inotify_event) char bytes[8192];
    const ssize_t size = ::read(watch, bytes, sizeof bytes);
    int renames = 0;
    for (ssize_t at = 0; at < size;) {
        const auto *event = reinterpret_cast<const inotify_event *>(bytes + at);
        renames += std::string(event->name) == "passwd";
        at += static_cast<ssize_t>(sizeof *event + event->len);
    }
    ::close(watch);
    EXPECT_EQ(renames, 1);
    EXPECT_TRUE(PasswordIs("user0", "pw0"));
    EXPECT_TRUE(PasswordIs("user49", "pw49"));
}

TEST_F(TavoctlAccounts, ABatchSaysWhatBecameOfEachEntry)
{
    const auto entries = [](const test::Ran &ran) {
        std::string text;
        const json document = test::Facts(ran);
        for (const json &entry : document.at("entries"))
            text += entry.at("object").get<std::string>() + " " + entry.at("result").get<std::string>() +
                    (entry.at("name").is_null() ? "" : " " + entry.at("name").get<std::string>()) + "\n";
        return text;
    };
    // Rights of an earlier carla cannot be taken away.
    Succeeds({"user", "add", "carla", "--empty-password"});
    Succeeds({"group", "add", "crew"});
    WriteFile("/usr/tavo/etc/smb.conf", "[x]\n\tvalid users = carla,@crew\n");
    ASSERT_EQ(::mkdir("/usr/tavo/etc/smb.conf.tmp", 0700), 0);
    Succeeds({"user", "delete", "--yes", "carla"});
    Succeeds({"group", "delete", "--yes", "crew"});
    const std::string list = "name,password\nx,1\ncarla,1\nanna,\n";
    const Words import = {"user", "import", "--update", "--json", "-"};
    Words dry = import;
    dry.emplace_back("--dry-run");
    EXPECT_EQ(entries(Tavoctl(dry, list)), "user x planned\nuser carla planned\nuser anna unchanged\n");
    test::Ran ran = Tavoctl(import, list);
    EXPECT_EQ(ran.status, 1) << ran;
    EXPECT_EQ(entries(ran), "user x done\nuser carla failed ERR_REMOVE_FAILED\nuser anna unchanged\n");
    EXPECT_THAT(ran.out, Not(HasSubstr("\"user carla\",\n      \"column\"")));
    const json failure = json::parse(ran.err, nullptr, false);
    ASSERT_TRUE(failure.is_object()) << ran;
    EXPECT_EQ(failure.at("error").at("attempted"), "import -, carla");
    EXPECT_TRUE(PasswordIs("x", "1"));
    EXPECT_EQ(Line(passwd, "carla"), "");
    ran = Tavoctl({"user", "import", "-"}, "name,password\ncarla,1\ny,1\n");
    EXPECT_EQ(ran.status, 1) << ran;
    EXPECT_THAT(ran.err, HasSubstr("cannot import -, carla: ERR_REMOVE_FAILED"));
    EXPECT_NE(Line(passwd, "y"), "");
    ran = Tavoctl({"group", "import", "--json", "-"}, "name,members\ncrew,anna\ntwo,\n");
    EXPECT_EQ(ran.status, 1) << ran;
    EXPECT_EQ(entries(ran), "group crew failed ERR_REMOVE_FAILED\ngroup two done\n");
    ASSERT_EQ(::rmdir("/usr/tavo/etc/smb.conf.tmp"), 0);

    // An account that has no line in the shadow file has nothing to lock.
    std::string hashes = ReadFile(shadow);
    hashes.erase(hashes.find("\nx:"), hashes.find('\n', hashes.find("\nx:") + 1) - hashes.find("\nx:"));
    WriteFile(shadow, hashes);
    ran = Tavoctl({"user", "lock", "--json", "x", "ANNA", "y"});
    EXPECT_EQ(ran.status, 3) << ran;
    EXPECT_EQ(entries(ran), "user x failed ERR_NO_SUCH_USER\nuser anna done\nuser y done\n");
    EXPECT_EQ(entries(Tavoctl({"user", "delete", "--yes", "--json", "Y", "x"})), "user y done\nuser x done\n");
}

TEST_F(TavoctlAccounts, AListThatIsWrongAnywhereIsRefusedWhole)
{
    const struct {
        Words verb;
        std::string list;
        const char *reason;
    } cases[] = {
        {{"user"}, "name,password\nx,1\nanna,1\n", "row 3, anna: ERR_USER_EXISTS"},
        {{"user"}, "name,password\nx,1\nX,1\n", "duplicate name"},
        {{"user"}, "name,password\nx,1\n", nullptr},
        {{"user"}, "name,password\nx,1\ny,\n", "row 3, y: it has no password"},
        {{"user"}, "name,password\nx,1\ny\n", "row 3 has 1 fields"},
        {{"user"}, "name,colour\nx,red\n", "colour"},
        {{"user"}, "name,name\nx,y\n", "duplicate column"},
        {{"user"}, "password\n1\n", "no name"},
        {{"user"}, "name,password\nx,\"1\n", "not closed"},
        {{"user"}, "name,password\nx,1\na:b,1\n", "ERR_INVALID_USERNAME"},
        {{"user"}, "name,password,uid\nx,1,1024\n", "admin"},
        {{"user"}, "name,password,uid\nx,1,1500\ny,1,1500\n", "1500"},
        {{"user"}, "name,password,expires\nx,1,2026/13/01\n", "2026/13/01"},
        {{"user"}, "name,password_hash\nx,$1$ab$c\n", "some are missing"},
        {{"user"}, "[{\"name\":\"x\",\"password\":\"1\"},3]", "row 2 is not an object"},
        {{"user"}, "[{\"name\":\"x\",\"password\":{}}]", "fits no field"},
        {{"user"}, "{\"name\":\"x\"}", "neither a JSON array"},
        {{"user"}, "[{\"name\":\"x\",\"password\":\"1\"}", "neither a JSON array"},
        {{"group"}, "name,members\nnew,anna\nodd,\"anna,nemo\"\n", "nemo"},
        {{"group"}, "name,gid\nnew,70000\nodd,70000\n", "duplicate group id 70000"},
    };
    for (const auto &[verb, list, reason] : cases) {
        const std::vector<std::string> before = AccountFiles();
        Words words = verb;
        words.insert(words.end(), {"import", "-"});
        if (!reason)
            words.emplace_back("--dry-run");
        const test::Ran ran = Tavoctl(words, list);
        EXPECT_EQ(ran.status != 0, reason != nullptr) << list << ran;
        EXPECT_THAT(ran.err, HasSubstr(reason ? reason : "")) << list;
        EXPECT_EQ(AccountFiles(), before) << list;
    }
    EXPECT_EQ(Tavoctl({"user", "import", "/none"}).status, 3);

    // What is not a list of accounts is not read to its end.
    const test::ScratchDir dir;
    ASSERT_EQ(::mkfifo((dir / "fifo").c_str(), 0600), 0);
    WriteFile(dir / "large", "name\n");
    ASSERT_EQ(::truncate((dir / "large").c_str(), off_t{1} << 30), 0);
    const struct {
        std::string path;
        const char *reason;
    } inputs[] = {{"/dev/zero", "not a regular file"}, {dir / "fifo", "not a regular file"}, {dir / "large", "16 MiB"}};
    for (const auto &[path, reason] : inputs)
        for (const Words &words : {Words{"user", "import", path},
                                   {"group", "import", path},
                                   {"net", "apply", path},
                                   {"state", "diff", path},
                                   {"conf", "list", "--file", path},
                                   {"conf", "get", "--file", path, "k"},
                                   {"conf", "set", "--file", path, "k", "v"},
                                   {"section", "list", "--file", path},
                                   {"section", "get", "--file", path, "s"}})
            test::IsRefused(words, reason, 2);
    EXPECT_EQ(test::ShellStatus(std::system("tavoctl user import - </dev/zero 2>/dev/null")), 2);
    EXPECT_EQ(test::ShellStatus(std::system("tr '\\0' x </dev/zero | tavoctl user import - 2>/dev/null")), 2);
}

TEST_F(TavoctlAccounts, ChangesAreShownBeforeAndSaidAfter)
{
    const auto run = [](Words words) {
        words.emplace_back("--json");
        return test::Facts(words);
    };
    const auto change = [](const char *object, const char *column, const json &before, const json &after) {
        return json{{"object", object}, {"column", column}, {"old", before}, {"new", after}};
    };
    const std::vector<std::string> before = AccountFiles();
    const json mail = change("user anna", "mail", "anna@example.com", "a@example.com");
    const json planned = run({"user", "modify", "anna", "--dry-run", "--mail", "a@example.com"});
    EXPECT_EQ(planned, (json{{"changed", true}, {"dry_run", true}, {"changes", {mail}}}));
    EXPECT_EQ(Tavoctl({"group", "add", "--dry-run", "staff", "--members", "anna"}).out,
              "OBJECT       COLUMN   OLD  NEW\n"
              "group staff  name     -    staff\n"
              "group staff  kind     -    local\n"
              "group staff  members  -    anna\n");
    EXPECT_EQ(run({"user", "delete", "--dry-run", "anna"}).at("changed"), true);
    EXPECT_EQ(AccountFiles(), before);

    const ino_t inode = test::InodeOf(passwd);
    for (const Words &words :
         std::vector<Words>{{"user", "modify", "anna", "--mail", "anna@example.com", "--privilege", "35"},
                            {"user", "expire", "anna", "2037/01/31"},
                            {"user", "rename", "anna", "anna"}})
        EXPECT_EQ(run(words), (json{{"changed", false}, {"changes", json::array()}})) << testing::PrintToString(words);
    EXPECT_EQ(test::InodeOf(passwd), inode) << "nothing was written";
    EXPECT_EQ(AccountFiles(), before);

    EXPECT_EQ(run({"user", "modify", "anna", "--mail", "a@example.com"}).at("changes"), json{mail});
    const json added = run({"user", "add", "carla", "--empty-password"});
    EXPECT_EQ(added.at("changed"), true);
    EXPECT_EQ(std::to_string(added.at("uid").get<int>()), Fields(passwd, "carla").at(2));
    const json group = run({"group", "add", "staff"});
    EXPECT_EQ(std::to_string(group.at("gid").get<int>()), Fields(groups, "staff").at(2));
}

TEST_F(TavoctlAccounts, CheckNamesEveryDifferenceAndRepairsNone)
{
    Succeeds({"group", "add", "staff", "--members", "anna"});
    EXPECT_EQ(Shown({"user", "check"}), json::array());
    EXPECT_EQ(Tavoctl({"user", "check"}).status, 0);
    EXPECT_EQ(Tavoctl({"group", "check"}).status, 0);

    const struct {
        const char *family;
        const char *command;
        const char *name;
        const char *file;
        const char *finding;
    } cases[] = {
        {"user", "sed -i 's,^\\(anna:.*\\):/bin/sh,\\1:/bin/bash,' /etc/passwd", "anna", passwd,
         "file and store differ in shell"},
        {"user", "sed -i 's,^berta:[^:]*:,berta:x:,' /etc/shadow", "berta", shadow,
         "file and store differ in password"},
        {"user", "sed -i /^berta:/d /etc/passwd", "berta", passwd, "it is in the store only"},
        {"user", "sed -i /^berta:/d /etc/passwd", "berta", shadow, "it is not in /etc/passwd"},
        {"user", "sed -i /^berta:/d /etc/shadow", "berta", shadow, "it is missing: no login"},
        {"user", "echo 'eve:x:0:0:::/bin/sh' >>/etc/passwd", "eve", passwd, "it is in the file only"},
        {"user", "echo 'eve:x:0:0:::/bin/sh' >>/etc/passwd", nullptr, passwd, "the id 0 is shared: eve, root"},
        {"user", "echo 'Anna:x:9:0:::/bin/sh' >>/etc/passwd", "Anna", passwd, "the name is there twice"},
        {"user", "echo eve:0 >>/etc/tavouser.conf", "eve", misc, "has 2 fields and not 3, or no name"},
        {"user", "rm /usr/tavo/etc/private/smbpasswd", nullptr, samba, "the file is missing"},
        {"user", "rm /tmp/.db.user.shadow.1379", nullptr, shadow, "the store is missing"},
        {"user", "echo garbage >/tmp/.db.user.misc.1379", nullptr, misc, "the store is damaged"},
        {"user", "rm /tmp/.db.user.uid.1379; mkfifo /tmp/.db.user.uid.1379", nullptr, "/tmp/.db.user.uid.1379",
         "the store is damaged"},
        {"group", "sed -i 's,^staff:.*,&;x,' /etc/group", "staff", groups, "the member anna;x is not a user"},
        {"group", "sed -i 's,^staff:.*,&;x,' /etc/group", "staff", groups, "file and store differ in members"},
        {"group", "echo nobody:here >>/etc/group_desc", "nobody", "/etc/group_desc", "it is in the file only"},
    };
    for (const auto &[family, command, name, file, finding] : cases) {
        ASSERT_EQ(Tavoctl({family, "list"}).status, 0);
        ASSERT_EQ(Tavoctl({family, "check"}).status, 0) << command;
        ASSERT_EQ(std::system("rm -rf /root/kept; cp -a /etc /root/kept; cp -a /usr/tavo/etc/private /root/kept"), 0);
        ASSERT_EQ(std::system(command), 0) << command;
        const std::vector<std::string> before = AccountFiles();
        const test::Ran ran = Tavoctl({family, "check", "--json"});
        EXPECT_EQ(ran.status, 1) << command << ran;
        bool found = false;
        for (const json &row : test::Facts(ran))
            found |= row.at("name") == (name ? json(name) : json()) && row.at("file") == file &&
                     row.at("finding").get<std::string>().ends_with(finding);
        EXPECT_TRUE(found) << command << ran;
        EXPECT_EQ(AccountFiles(), before) << command;
        EXPECT_EQ(Tavoctl({family, "check", "--json"}).out, ran.out) << command;  // nor the stores
        ASSERT_EQ(std::system("cp -a /root/kept/passwd /root/kept/shadow /root/kept/tavouser.conf /root/kept/group "
                              "/root/kept/group_desc /etc; cp -a /root/kept/private /usr/tavo/etc; rm -rf "
                              "/tmp/.db.*"),
                  0);
    }
    // After a start of the machine there are no stores, and nothing is wrong.
    EXPECT_EQ(Tavoctl({"user", "check"}).status, 0);
    EXPECT_FALSE(std::filesystem::exists("/tmp/.db.user.name.1379"));
}

}  // namespace
