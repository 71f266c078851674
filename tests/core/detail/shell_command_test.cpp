// Composing commands: what is inserted unchanged, what is quoted, and what is refused.
#include "core/detail/shell_command.h"

#include "core/detail/command_output.h"
#include "support/test.h"

using tavo::ShellCommand;

namespace {

TEST(ShellCommand, PlainArgumentsAreUnchanged)
{
    EXPECT_EQ(
        ShellCommand("/sbin/sfdisk -N%d -uS -q -f -j%llu -z-1 -t%x -F %s >/dev/null 2>&1", 3, 63ull, 0xfdu, "/dev/sda"),
        "/sbin/sfdisk -N3 -uS -q -f -j63 -z-1 -tfd -F /dev/sda >/dev/null 2>&1");
    EXPECT_EQ(ShellCommand("/sbin/lvcreate %s -n %s -l100%%VG", std::string("vg1"), std::string_view("lv_1@a+b=c:d,e")),
              "/sbin/lvcreate vg1 -n lv_1@a+b=c:d,e -l100%VG");
    EXPECT_EQ(ShellCommand("mdadm -C %s %s %d %s", "/dev/md2", tavo::ComposedPiece{"-pls -c64"}, -1,
                           tavo::ComposedPiece{"a 'b c'"}),
              "mdadm -C /dev/md2 -pls -c64 -1 a 'b c'");
}

// Each argument must come out of the shell unchanged and alone, also within the format's own quotes.
TEST(ShellCommand, HostileArgumentsComeOutOfTheShellUnchanged)
{
    for (const std::string text :
         {"",  " ",     "a b", "$(reboot)", "`id`",  "a;b|c&d", "it's", "''",       "'",   "\"x\"", "\\",  "a\\'b",
          "*", "~root", "#x",  "!",         "$PATH", "{a,b}",   "a\tb", "\xC3\xA9", "x>y", "x-",    "%s%n"}) {
        for (const auto &command :
             {ShellCommand("printf '<%%s>' %s after", text), ShellCommand("printf '<%%s>' '%s' after", text)}) {
            ASSERT_TRUE(command);
            tavo::CommandOutput output(*command);
            std::string line;
            output.Next(line);
            EXPECT_EQ(line, "<" + text + "><after>") << *command;
            EXPECT_EQ(output.Status(), 0);
        }
    }
    EXPECT_EQ(ShellCommand("mv '%s' '%s' > /dev/null 2>&1", "/a b", "/it's"), "mv '/a b' '/it'\\''s' > /dev/null 2>&1");
}

TEST(ShellCommand, RefusesOptionsAndNulBytes)
{
    for (const std::string_view text : {std::string_view("-"), std::string_view("-rf"),
                                        std::string_view("--zero-superblock /"), std::string_view("a\0b", 3)}) {
        EXPECT_EQ(ShellCommand("rm %s", text), std::nullopt) << text;
        EXPECT_EQ(ShellCommand("rm '%s' %s", text, "x"), std::nullopt) << text;
    }
}

}  // namespace
