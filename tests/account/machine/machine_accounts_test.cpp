// The files that the library writes, read by those who live on them: the C library, the login tools, Samba.
#include "tavo_group.h"
#include "tavo_user.h"

#include "account/group/group_fixture.h"
#include "account/user/user_fixture.h"
#include "support/machine.h"
#include "support/test.h"

namespace {

using test::LineOf;
using test::Shell;
using test::WriteFile;
using testing::HasSubstr;

constexpr char samba_file[] = "/usr/tavo/etc/private/smbpasswd";
constexpr char settings[] = "/root/smb.conf";
constexpr char juergen[] = "J\xC3\xBCrgen_M";

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
        test::DeleteUsers({"anna", juergen});
        ASSERT_EQ(
            test::AddUser({.name = "anna", .password = "secret one", .description = "One: of us", .shell = "/bin/sh"}),
            0);
        ASSERT_EQ(test::AddUser({.name = juergen, .password = "gr\xC3\xBC\xC3\x9F", .expire = 24502}), 0);
        WriteFile(settings, "[global]\npassdb backend = smbpasswd:" + std::string(samba_file) +
                                "\nlanman auth = yes\nprivate dir = /root\nlock directory = /root\nstate directory = "
                                "/root\ncache directory = /root\npid directory = /root\n");
    }
};

TEST_F(MachineAccounts, TheSystemsOwnToolsReadWhatTheLibraryWrites)
{
    ASSERT_EQ(test::AddGroup("staff", -1, {"anna"}), 0);

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

}  // namespace
