// tavoctl user, group and quota: their changes of the files, and refusals before any change.
#include "command_story.h"
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
using testing::HasSubstr;
using testing::Not;

constexpr char passwd[] = "/etc/passwd";
constexpr char shadow[] = "/etc/shadow";
constexpr char misc[] = "/etc/tavouser.conf";
constexpr char samba[] = "/usr/tavo/etc/private/smbpasswd";
constexpr char groups[] = "/etc/group";
const std::vector<std::string> kFiles = {passwd, shadow, misc, groups, "/etc/group_desc"};

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
    std::vector<std::string> texts = {std::filesystem::exists(samba) ? ReadFile(samba) : ""};
    for (const std::string &path : kFiles)
        texts.push_back(std::filesystem::exists(path) ? ReadFile(path) : "");
    return texts;
}

bool PasswordIs(const std::string &user, const std::string &password)
{
    const std::vector<std::string> fields = Fields(shadow, user);
    crypt_data data = {};
    return fields.size() > 1 && fields[1] == ::crypt_r(password.c_str(), fields[1].c_str(), &data);
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
    test::CommandStory story(kFiles);
    story.Run({"user", "add", "carla"}, "secret two\n");
    story.Run({{"user", "modify", "ANNA", "--description", "", "--cannot-change-password", "yes"},
               {"user", "expire", "anna", "never"},
               {"group", "add", "staff", "--members", "Berta,anna", "--description", "All of us"},
               {"user", "rename", "anna", "Anna"},
               {"user", "rename", "berta", "bert"},
               {"user", "rename", "--dry-run", "carla", "cara"},
               {"user", "lock", "--dry-run", "carla"},
               {"user", "delete", "anna", "bert"}});  // refused: without a terminal it cannot ask
    EXPECT_TRUE(PasswordIs("Anna", "secret one"));
    EXPECT_TRUE(PasswordIs("bert", ""));
    story.Run({"user", "delete", "--yes", "anna", "bert"});
    EXPECT_TRUE(PasswordIs("carla", "secret two"));
}

TEST_F(TavoctlAccounts, GroupsAreAddedChangedAndRenamed)
{
    test::CommandStory story(kFiles);
    story.Run({{"group", "add", "staff"},
               {"group", "modify", "staff", "--join", "ANNA,berta,anna"},
               {"group", "modify", "STAFF", "--leave", "Anna", "--description", "Us"},
               {"group", "modify", "staff", "--members", "", "--gid", "70000"},
               {"group", "rename", "--dry-run", "staff", "team"},
               {"group", "rename", "staff", "Team"},
               {"group", "show", "team", "--json"},
               {"group", "show", "users"},
               {"group", "delete", "--yes", "team"}});
}

TEST_F(TavoctlAccounts, ReadingVerbsSayTheSameAsTheFiles)
{
    test::CommandStory story(kFiles);
    story.Run({{"user", "show", "Anna", "--json"},
               {"user", "show", "--uid", Fields(passwd, "anna").at(2)},
               {"user", "show", "--uid", "2000", "berta"},
               {"user", "show", "admin"},
               {"user", "list"},
               {"user", "list", "--output", "name,Cannot Change Password,expired"},
               {"user", "list", "--prefix", "A"},
               {"user", "list", "--part", "ERT", "--json"},
               {"user", "list", "--part", "ERT", "--prefix", "a"},
               {"--complete", "user", "show", "an"}});
}

TEST_F(TavoctlAccounts, RefusalsChangeNothing)
{
    test::CommandStory story(kFiles);
    story.Run({
        {"user", "add", "--empty-password", "Anna"},
        {"user", "add", "--empty-password", "a:b"},
        {"user", "add", "--empty-password", "..", "--uid", "3000"},
        {"user", "add", "--empty-password", "eve", "--home", "/var/../etc"},
        {"user", "add", "--empty-password", "eve", "--shell", "/bin/sh:"},
        {"user", "add", "--empty-password", "eve", "--uid", "2000"},
        {"user", "modify", "anna", "--uid", "0"},
        {"user", "rename", "anna", "BERTA"},
        {"user", "rename", "anna", "an/na"},
        {"user", "passwd", "nemo"},
        {"user", "show", "nemo"},
        {"user", "delete", "--yes", "anna", "nemo"},
        {"user", "delete", "--yes", "anna", "Admin", "--system"},
        {"user", "delete", "--yes", "anna", "guest"},
        {"group", "delete", "--yes", "users", "--system"},
        {"user", "lock", "anna", "guest"},
        {"user", "unlock", "anna", "admin", "--system"},
        {"user", "aging", "anna"},
        {"user", "aging", "anna", "--min", "90", "--max", "90"},
        {"user", "aging", "berta", "--max", "90"},
        {"group", "add", "sixteen letters!"},
        {"group", "add", "Users"},
        {"group", "add", "staff", "--members", "anna,nemo"},
        {"group", "add", "staff", "--description", "a:b"},
        {"group", "add", "staff", "--gid", "100"},
        {"group", "modify", "administrators", "--leave", "anna"},
        {"group", "rename", "nemo", "nobodies"},
        {"quota", "set", "anna", "7", "1M"},
        {"quota", "get", "anna", "7"},
    });
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
    test::CommandStory story(kFiles);
    story.Run({{"user", "aging", "anna", "--min", "1", "--max", "90", "--warn", "14"},
               {"user", "lock", "anna", "berta"},
               {"user", "lock", "anna"},
               {"user", "modify", "anna", "--description", "away"},
               {"user", "rename", "anna", "anna2"},
               {"user", "show", "anna2"},
               {"user", "unlock", "anna2", "berta"}});
    EXPECT_TRUE(PasswordIs("anna2", "secret one"));
    // The password of berta is fixed by her ages.
    story.Run(
        {{"user", "aging", "berta", "--warn", "3"}, {"user", "modify", "berta", "--cannot-change-password", "no"}});
}

TEST_F(TavoctlAccounts, NamesThatMislead)
{
    test::CommandStory story({passwd, misc});
    story.Run({{"user", "add", "--empty-password", "0815"},
               {"user", "add", "--empty-password", "a b"},
               {"user", "rename", "a b", "\xD0\xB0nna"}});
    // All ids were assigned once, so the next one belonged to a deleted user.
    WriteFile(misc, "#$_@UID__INDEX@_$3072$\n" + ReadFile(misc).substr(ReadFile(misc).find('\n') + 1));
    story.Run({"user", "add", "--empty-password", "carla"});
    Succeeds({"user", "add", "--unknown-password", "dora"});
    EXPECT_FALSE(PasswordIs("dora", ""));
}

TEST_F(TavoctlAccounts, TheModelsLimitHolds)
{
    // Four are there: as many as the model allows, and then two too many; then room for one, and no limit.
    test::CommandStory story({passwd});
    for (const char *limit : {"maxaccounts=4", "maxaccounts=2", "maxaccounts=5", ""}) {
        story.Head(*limit ? limit : "no limit");
        WriteFile("/etc.defaults/tavoinfo.conf", std::string("supportguest=yes\n") + limit + "\n");
        story.Run({"user", "import", "-"}, "name,password\ncarla,x\ndora,x\n");
        story.Run({{"user", "add", "--empty-password", "carla"}, {"user", "delete", "--yes", "carla"}});
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
    Succeeds({"user", "modify", "anna", "--description", "A, \"B\": ' C"});
    std::vector<std::string> paths = kFiles;
    paths.emplace_back("/root/exported");
    ASSERT_EQ(::mkdir(paths.back().c_str(), 0700), 0);
    test::CommandStory story(paths);
    for (const bool as_json : {false, true}) {
        const std::string users = paths.back() + (as_json ? "/u.json" : "/u.csv");
        const std::string teams = paths.back() + (as_json ? "/g.json" : "/g.csv");
        Words export_users = {"user", "export", "--hashes", "--output", users};
        Words export_groups = {"group", "export", "--output", teams};
        if (as_json) {
            export_users.emplace_back("--json");
            export_groups.emplace_back("--json");
        }
        const std::string hashes = ReadFile(shadow);
        story.Run({{"group", "add", "staff", "--members", "berta,anna", "--description", "x, y"},
                   export_users,
                   export_groups,
                   export_users,  // a file that is there stays
                   {"user", "delete", "--yes", "anna", "berta"},
                   {"group", "delete", "--yes", "staff"},
                   {"user", "import", users},  // admin is there
                   {"user", "import", "--update", users},
                   {"group", "import", teams},
                   {"group", "delete", "--yes", "staff"}});
        EXPECT_EQ(ReadFile(shadow), hashes);
        struct stat state = {};
        EXPECT_EQ(::stat(users.c_str(), &state), 0);
        EXPECT_EQ(state.st_mode & 07777u, 0600u);
    }
    // Hashes are only exported on request.
    story.Run({{"user", "export"}, {"user", "export", "--json"}});
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
    // Rights of an earlier carla cannot be taken away.
    Succeeds({"user", "add", "carla", "--empty-password"});
    Succeeds({"group", "add", "crew"});
    WriteFile("/usr/tavo/etc/smb.conf", "[x]\n\tvalid users = carla,@crew\n");
    ASSERT_EQ(::mkdir("/usr/tavo/etc/smb.conf.tmp", 0700), 0);
    Succeeds({"user", "delete", "--yes", "carla"});
    Succeeds({"group", "delete", "--yes", "crew"});
    test::CommandStory story({passwd, groups});
    const std::string list = "name,password\nx,1\ncarla,1\nanna,\n";
    story.Run({"user", "import", "--update", "--json", "--dry-run", "-"}, list);
    story.Run({"user", "import", "--update", "--json", "-"}, list);
    EXPECT_TRUE(PasswordIs("x", "1"));
    story.Run({"user", "import", "-"}, "name,password\ncarla,1\ny,1\n");
    story.Run({"group", "import", "--json", "-"}, "name,members\ncrew,anna\ntwo,\n");
    ASSERT_EQ(::rmdir("/usr/tavo/etc/smb.conf.tmp"), 0);

    // An account that has no line in the shadow file has nothing to lock.
    std::string hashes = ReadFile(shadow);
    hashes.erase(hashes.find("\nx:"), hashes.find('\n', hashes.find("\nx:") + 1) - hashes.find("\nx:"));
    WriteFile(shadow, hashes);
    story.Run({{"user", "lock", "--json", "x", "ANNA", "y"}, {"user", "delete", "--yes", "--json", "Y", "x"}});
}

TEST_F(TavoctlAccounts, AListThatIsWrongAnywhereIsRefusedWhole)
{
    std::vector<std::string> paths = kFiles;
    paths.emplace_back(samba);
    test::CommandStory story(paths);
    for (const char *list : {
             "name,password\nx,1\nanna,1\n",
             "name,password\nx,1\nX,1\n",
             "name,password\nx,1\ny,\n",
             "name,password\nx,1\ny\n",
             "name,colour\nx,red\n",
             "name,name\nx,y\n",
             "password\n1\n",
             "name,password\nx,\"1\n",
             "name,password\nx,1\na:b,1\n",
             "name,password,uid\nx,1,1024\n",
             "name,password,uid\nx,1,-5\n",
             "name,password,uid\nx,1,1500\ny,1,1500\n",
             "name,password,expires\nx,1,2026/13/01\n",
             "name,password_hash\nx,$1$ab$c\n",
             R"([{"name":"x","password":"1"},3])",
             R"([{"name":"x","password":{}}])",
             R"({"name":"x"})",
             R"([{"name":"x","password":"1"})",
         }) {
        story.Head(list);
        story.Run({"user", "import", "-"}, list);
    }
    for (const char *list : {"name,members\nnew,anna\nodd,\"anna,nemo\"\n", "name,gid\nnew,70000\nodd,70000\n"}) {
        story.Head(list);
        story.Run({"group", "import", "-"}, list);
    }
    story.Run({"user", "import", "--dry-run", "-"}, "name,password\nx,1\n");
    story.Run({"user", "import", "/none"});

    // What is not a list of accounts is not read to its end.
    ASSERT_EQ(::mkfifo("/root/fifo", 0600), 0);
    WriteFile("/root/large", "name\n");
    ASSERT_EQ(::truncate("/root/large", off_t{1} << 30), 0);
    for (const char *path : {"/dev/zero", "/root/fifo", "/root/large"})
        story.Run({{"user", "import", path},
                   {"group", "import", path},
                   {"net", "apply", path},
                   {"state", "diff", path},
                   {"conf", "list", "--file", path},
                   {"conf", "get", "--file", path, "k"},
                   {"conf", "set", "--file", path, "k", "v"},
                   {"section", "list", "--file", path},
                   {"section", "get", "--file", path, "s"}});
    EXPECT_EQ(test::ShellStatus(std::system("tavoctl user import - </dev/zero 2>/dev/null")), 2);
    EXPECT_EQ(test::ShellStatus(std::system("tr '\\0' x </dev/zero | tavoctl user import - 2>/dev/null")), 2);
}

TEST_F(TavoctlAccounts, ChangesAreShownBeforeAndSaidAfter)
{
    test::CommandStory story(kFiles);
    const ino_t inode = test::InodeOf(passwd);
    story.Run({{"user", "modify", "anna", "--json", "--dry-run", "--mail", "a@example.com"},
               {"group", "add", "--dry-run", "staff", "--members", "anna"},
               {"user", "delete", "--dry-run", "anna"},
               {"user", "modify", "anna", "--json", "--mail", "anna@example.com", "--privilege", "35"},
               {"user", "expire", "anna", "--json", "2037/01/31"},
               {"user", "rename", "anna", "anna", "--json"}});
    EXPECT_EQ(test::InodeOf(passwd), inode) << "nothing was written";
    story.Run({{"user", "modify", "anna", "--json", "--mail", "a@example.com"},
               {"user", "add", "carla", "--json", "--empty-password"},
               {"group", "add", "staff", "--json"}});
}

TEST_F(TavoctlAccounts, CheckNamesEveryDifferenceAndRepairsNone)
{
    Succeeds({"group", "add", "staff", "--members", "anna"});
    test::CommandStory story({});
    const struct {
        const char *family;
        const char *command;
    } cases[] = {
        {"user", "sed -i 's,^\\(anna:.*\\):/bin/sh,\\1:/bin/bash,' /etc/passwd"},
        {"user", "sed -i 's,^berta:[^:]*:,berta:x:,' /etc/shadow"},
        {"user", "sed -i /^berta:/d /etc/passwd"},
        {"user", "sed -i /^berta:/d /etc/shadow"},
        {"user", "echo 'eve:x:0:0:::/bin/sh' >>/etc/passwd"},
        {"user", "echo 'Anna:x:9:0:::/bin/sh' >>/etc/passwd"},
        {"user", "echo eve:0 >>/etc/tavouser.conf"},
        {"user", "rm /usr/tavo/etc/private/smbpasswd"},
        {"user", "rm /tmp/.db.user.shadow.1379"},
        {"user", "echo garbage >/tmp/.db.user.misc.1379"},
        {"user", "rm /tmp/.db.user.uid.1379; mkfifo /tmp/.db.user.uid.1379"},
        {"group", "sed -i 's,^staff:.*,&;x,' /etc/group"},
        {"group", "echo nobody:here >>/etc/group_desc"},
    };
    for (const auto &[family, command] : cases) {
        ASSERT_EQ(Tavoctl({family, "list"}).status, 0);
        ASSERT_EQ(Tavoctl({family, "check"}).status, 0) << command;
        ASSERT_EQ(std::system("rm -rf /root/kept; cp -a /etc /root/kept; cp -a /usr/tavo/etc/private /root/kept"), 0);
        ASSERT_EQ(std::system(command), 0) << command;
        const std::vector<std::string> before = AccountFiles();
        story.Head(command);
        story.Run({{family, "check"}, {family, "check", "--json"}});  // nor are the stores repaired
        EXPECT_EQ(AccountFiles(), before) << command;
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
