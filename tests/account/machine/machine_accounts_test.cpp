// The files that the library writes, read by those who live on them: the C library, the login tools, Samba.
#include "tavo_group.h"
#include "tavo_user.h"

#include "machine_users.h"
#include "support/machine.h"
#include "support/scratch_dir.h"

#include <gmock/gmock.h>

#include <filesystem>
#include <sstream>

namespace {

using test::ReadFile;
using test::Shell;
using test::WriteFile;
using testing::HasSubstr;
using testing::StartsWith;

constexpr char samba_file[] = "/usr/tavo/etc/private/smbpasswd";
constexpr char settings[] = "/root/smb.conf";
constexpr char juergen[] = "J\xC3\xBCrgen_M";

int AddUser(const char *name, const char *password, int expires = -1)
{
    TAVOUSER user = {};
    user.szName = const_cast<char *>(name);
    user.szPasswd = const_cast<char *>(password);
    user.szDesc = const_cast<char *>("One: of us");
    user.szShell = const_cast<char *>("/bin/sh");
    user.nUid = user.nGid = -1;
    user.nExpired = expires;
    TLIBErrSet(ERR_SUCCESS);
    return TAVOUserSetOne(nullptr, &user) == 0 ? TLIBErrGet() : -1;
}

std::string LineOf(const char *path, const std::string &name)
{
    std::istringstream lines(ReadFile(path));
    for (std::string line; std::getline(lines, line);)
        if (line.starts_with(name + ":"))
            return line;
    return {};
}

std::string Field(const std::string &line, int index)
{
    std::istringstream fields(line);
    std::string field;
    for (int i = 0; i <= index; ++i)
        std::getline(fields, field, ':');
    return field;
}

class MachineAccounts : public test::MachineTest {
  protected:
    void SetUp() override
    {
        test::MachineTest::SetUp();
        if (IsSkipped())
            return;
        test::DeleteUsers({"anna", juergen, "next"});
        ASSERT_EQ(AddUser("anna", "secret one"), 0);
        ASSERT_EQ(AddUser(juergen, "gr\xC3\xBC\xC3\x9F", 24502), 0);
        WriteFile(settings, "[global]\npassdb backend = smbpasswd:" + std::string(samba_file) +
                                "\nlanman auth = yes\nprivate dir = /root\nlock directory = /root\nstate directory = "
                                "/root\ncache directory = /root\npid directory = /root\n");
    }
};

TEST_F(MachineAccounts, TheSystemsOwnToolsReadWhatTheLibraryWrites)
{
    const char *const members[] = {"anna", nullptr};
    TAVOGROUP group = {};
    group.szName = const_cast<char *>("staff");
    group.nGid = -1;
    group.rgszMember = const_cast<char **>(members);
    ASSERT_EQ(TAVOGroupSet(nullptr, &group), 0);

    for (const char *name : {"anna", juergen}) {
        EXPECT_EQ(Shell("getent passwd " + std::string(name)).output, LineOf("/etc/passwd", name) + "\n");
        EXPECT_EQ(Shell("getent shadow " + std::string(name)).output, LineOf("/etc/shadow", name) + "\n");
    }
    EXPECT_EQ(Shell("getent group staff").output, LineOf("/etc/group", "staff") + "\n");
    EXPECT_THAT(Shell("id anna").output, HasSubstr("(staff)"));
    EXPECT_THAT(Shell("chage -l " + std::string(juergen)).output, HasSubstr("Jan 31, 2037"));
    EXPECT_THAT(Shell("chage -l anna").output, testing::ContainsRegex("Account expires[^\n]*never"));

    // A user other than root becomes anna with her password, and not with another.
    const std::string as_nobody = "setpriv --reuid 1023 --regid 1023 --clear-groups su anna -c 'id -un'";
    EXPECT_THAT(Shell("echo 'secret one' | " + as_nobody).output, HasSubstr("anna\n"));
    EXPECT_NE(Shell("echo 'secret two' | " + as_nobody).status, 0);
}

TEST_F(MachineAccounts, SambaReadsWhatTheLibraryWrites)
{
    const test::CommandResult listed = Shell("pdbedit -s " + std::string(settings) + " -L -w");
    EXPECT_EQ(listed.status, 0) << listed.output;
    for (const char *name : {"anna", juergen}) {
        std::string line = LineOf(samba_file, name);
        ASSERT_NE(line, "");
        line.replace(line.find(Field(line, 2)), 32, 32, 'X');  // it does not read LAN Manager hashes any more
        EXPECT_THAT(listed.output, HasSubstr(line + "\n"));
    }
    EXPECT_THAT(Shell("pdbedit -s " + std::string(settings) + " -L -v anna").output,
                testing::AllOf(HasSubstr("Unix username:        anna"), HasSubstr("Account Flags:        [U ")));
}

TEST_F(MachineAccounts, SambaHashesAsTheLibraryDoes)
{
    const struct {
        const char *name;
        const char *password;
    } cases[] = {{"anna", "Another Secret 14+"},
                 {juergen, "\xC3\xB6"
                           "ffne Dich"},
                 {"anna", "x"}};
    for (const auto &[name, password] : cases) {
        const std::string typed = std::string("printf '%s\\n%s\\n' '") + password + "' '" + password + "'";
        const test::CommandResult set = Shell(typed + " | LC_ALL=C.UTF-8 smbpasswd -c " + settings + " -s " + name);
        EXPECT_EQ(set.status, 0) << set.output;
        const std::string line = LineOf(samba_file, name);
        unsigned char hash[16];
        ASSERT_EQ(TLIBSmbMd4Hash(password, hash), 0);
        EXPECT_EQ(Field(line, 3), test::Hex(hash)) << password;
        // What Samba changed stays when the library writes the file the next time.
        test::DeleteUsers({"next"});
        ASSERT_EQ(AddUser("next", "p"), 0);
        EXPECT_EQ(Field(LineOf(samba_file, name), 3), Field(line, 3));
    }
}

}  // namespace
