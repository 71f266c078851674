// Names in the user lists of Samba's settings file.
#include "core/detail/smb_user_lists.h"

#include "support/test.h"

namespace {

// alice becomes "al", bob is removed, the group staff becomes "the staff".
std::optional<std::string> Change(std::string_view name, bool is_group)
{
    if (!is_group && name == "alice")
        return "al";
    if (!is_group && name == "bob")
        return "";
    if (is_group && name == "staff")
        return "the staff";
    return std::nullopt;
}

TEST(SmbUserLists, OnlyNamesInUserListsChange)
{
    const struct {
        const char *before;
        const char *after;
    } rows[] = {
        {"valid users = alice\n", "valid users = al\n"},
        {"\tvalid users=alice,bob,carol\n", "\tvalid users=al,carol\n"},
        {"Invalid  Users = bob, carol\n", "Invalid  Users = carol\n"},
        {"read list = carol, bob\n", "read list = carol\n"},
        {"read list = carol bob  dave\n", "read list = carol dave\n"},
        {"write list = bob\n", "write list = \n"},
        {"admin users = @staff, +staff, staff\n", "admin users = @\"the staff\", +\"the staff\", staff\n"},
        {"admin users = \"@staff\" \"alice\"\n", "admin users = \"@the staff\" \"al\"\n"},
        {"valid users = alice2, malice, \"alice b\"\n", "valid users = alice2, malice, \"alice b\"\n"},
        {"valid users = carol, \\\n  alice, \\\n  bob\n[alice]\n", "valid users = carol, \\\n  al, \\\n  \n[alice]\n"},
        {"# valid users = alice\n; read list = bob\n", "# valid users = alice\n; read list = bob\n"},
        {"[alice]\npath = /alice\nforce user = alice\ncomment = valid users = alice\n",
         "[alice]\npath = /alice\nforce user = alice\ncomment = valid users = alice\n"},
        {"valid users", "valid users"},
        {"valid users = alice\r\n", "valid users = al\r\n"},
        {"valid users = \"alice", "valid users = \"al"},
        {"", ""},
    };
    for (const auto &row : rows)
        EXPECT_EQ(tavo::ChangeSmbUserLists(row.before, Change), row.after) << row.before;
}

}  // namespace
