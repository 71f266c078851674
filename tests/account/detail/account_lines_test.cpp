// The lines of the account files, the keys of the stores, and the settings of password hashes.
#include "account/detail/account_name.h"
#include "account/detail/btree.h"
#include "account/detail/colon_fields.h"
#include "account/detail/commit_marker.h"
#include "account/detail/group_texts.h"
#include "account/detail/home_steps.h"
#include "account/detail/id_index.h"
#include "account/detail/misc_line.h"
#include "account/detail/passwd_line.h"
#include "account/detail/password_hash.h"
#include "account/detail/samba_latecomers.h"
#include "account/detail/shadow_line.h"
#include "account/detail/smbpasswd_line.h"
#include "account/detail/user_texts.h"
#include "core/detail/open_file.h"
#include "support/test.h"

#include <sys/file.h>

using namespace std::string_literals;

namespace {

TEST(PasswdLine, ReadsWhatItWrites)
{
    const tavo::PasswdLine line{"Bob", 1030, 100, "a:b, c%3A", "/home/bob", "/bin/sh"};
    const std::string text = tavo::FormatPasswdLine(line);
    EXPECT_EQ(text, "Bob:x:1030:100:a%3Ab, c%253A:/home/bob:/bin/sh");
    const auto read = tavo::ParsePasswdLine(text + '\0');
    ASSERT_TRUE(read);
    EXPECT_EQ(read->description, line.description);
    EXPECT_EQ(tavo::FormatPasswdLine(*read), text);

    const struct {
        const char *text;
        int code;
    } rows[] = {
        {"a:x:1:2:::", 0},
        {"a:x:1:2:::/bin/sh:extra", ERR_FORMAT_ERROR},
        {"a:x:1:2:/home", ERR_FORMAT_ERROR},
        {":x:1:2:::", ERR_INVALID_USERNAME},
        {"a:x::2:::", ERR_FORMAT_ERROR},
        {"a:x:1x:2:::", ERR_FORMAT_ERROR},
        {"a:x:4294967294:2:::", 0},
        {"a:x:4294967296:2:::", ERR_FORMAT_ERROR},
        {"", ERR_FORMAT_ERROR},
    };
    for (const auto &row : rows)
        EXPECT_EQ(tavo::ParsePasswdLine(row.text).Failure(), row.code) << row.text;
}

TEST(ShadowLine, AgesCarryTheFlag)
{
    EXPECT_EQ(tavo::FormatShadowLine({"a", "$1$x", -1, false}, 86400 * 10 + 5), "a:$1$x:10:0:99999:7:::");
    EXPECT_EQ(tavo::FormatShadowLine({"a", "", 0, true}, 86399), "a::0:100000:99999:7::0:");
    const struct {
        const char *text;
        int code;
        bool cannot_change;
        int expire;
    } rows[] = {
        {"a:h:1:0:99999:7:::", 0, false, -1},
        {"a:h:1:100000:99999:7::12:", 0, true, 12},
        {"a:h:1:5:5:7::0:", 0, true, 0},
        {"a:h:1:::7:::", 0, false, -1},  // other tools leave both ages empty
        {"a:h:::::::", 0, false, -1},
        {"a:h:1:0:99999:7::", ERR_FORMAT_ERROR, false, 0},
        {"a:h:1:0:99999:7::::", ERR_FORMAT_ERROR, false, 0},
    };
    for (const auto &row : rows) {
        const auto line = tavo::ParseShadowLine(row.text);
        ASSERT_EQ(line.Failure(), row.code) << row.text;
        if (line) {
            EXPECT_EQ(line->cannot_change, row.cannot_change) << row.text;
            EXPECT_EQ(line->expire, row.expire) << row.text;
        }
    }
    EXPECT_EQ(*tavo::ReplaceShadowHash("Bob:old:123:4:5:6:7:8:9", "new"), "Bob:new:123:4:5:7::8:");
    EXPECT_EQ(tavo::ReplaceShadowHash("Bob:old", "new").Failure(), ERR_FORMAT_ERROR);
}

TEST(MiscLine, MarkerOfTheLastId)
{
    EXPECT_EQ(tavo::FormatMarkerLine(tavo::kUidMarker, 1030), "#$_@UID__INDEX@_$1030$\n");
    EXPECT_EQ(tavo::ParseMarkerLine("#$_@UID__INDEX@_$1030$", tavo::kUidMarker), 1030);
    for (const char *other : {"#$_@GID__INDEX@_$1030$", "#$_@UID__INDEX@_$x$", "#$_@UID__INDEX@_$1030", "bob:0:"})
        EXPECT_EQ(tavo::ParseMarkerLine(other, tavo::kUidMarker), std::nullopt) << other;
    EXPECT_EQ(tavo::ParseMiscLine("bob:35:bob@example.org")->privilege, 35);
    EXPECT_EQ(tavo::ParseMiscLine("bob:35").Failure(), ERR_FORMAT_ERROR);
}

TEST(AccountName, KeysFoldCase)
{
    EXPECT_EQ(tavo::AccountKey("Bob"), "BOB\0"s);
    EXPECT_EQ(tavo::AccountKey("J\xC3\xBCrgen"), "J\xC3\x9CRGEN\0"s);
    EXPECT_EQ(tavo::AccountKey("\xFF"), std::nullopt);
    EXPECT_EQ(tavo::AccountKey(std::string(491, 'a'))->size(), 492u);
    EXPECT_EQ(tavo::AccountKey(std::string(492, 'a')), std::nullopt);
    EXPECT_EQ(tavo::AccountKey(std::string(128, 'a'), tavo::kGroupKeySize), std::nullopt);
}

// A setting with an empty salt would give all users with one password the same hash.
TEST(PasswordHash, SaltIsNeverEmpty)
{
    constexpr time_t now = 5;
    const struct {
        const char *previous;
        const char *setting;
    } rows[] = {
        {"", "$1$5F"},
        {"$1$salt$hash", "$1$salt$hash"},
        {"abJnggxhB/yWI", "$1$abJnggxhB/yWI"},
        {"$6$salt$hash", "$1$5F"},
        {"$1$$hash", "$1$5F"},
        {"$1$", "$1$5F"},
    };
    for (const auto &row : rows)
        EXPECT_EQ(tavo::HashSetting(row.previous, now), row.setting) << row.previous;
    // Locked accounts: crypt refuses such a salt with "*0", which must never be stored.
    for (const char *locked : {"*", "!", "!$1$salt$hash", "*LK*"})
        EXPECT_TRUE(tavo::HashPassword("secret", locked, now).starts_with("$1$5F$")) << locked;
    EXPECT_EQ(tavo::HashPassword("wonderland", "$1$0A$x", now), "$1$0A$2P/zHwtRxfVu92.q2Dyny.");
    EXPECT_EQ(tavo::HashPassword("", "", now).size(), 28u);
}

TEST(IdIndex, FindsTheNextFreeId)
{
    const test::ScratchDir dir;
    std::unique_ptr<tavo::Btree> index;
    ASSERT_EQ(tavo::Btree::Open((dir / "index").c_str(), {O_RDWR | O_CREAT, true, 0600}, index), 0);
    const tavo::IdRange range{tavo::kCurrentUidKey, 10, 20, ERR_TOO_MANY_USERS};
    int32_t id = 0;
    EXPECT_EQ(tavo::FindFreeId(*index, range, id), 0);
    EXPECT_EQ(id, 10) << "nothing handed out yet";
    ASSERT_EQ(index->Set(tavo::IdKey(14), "A"), 0);
    EXPECT_EQ(tavo::FindFreeId(*index, range, id), 0);
    EXPECT_EQ(id, 15) << "without the reserved key it follows the greatest one";
    const struct {
        int32_t current;
        int32_t next;
    } rows[] = {{500, 10}, {0, 10}, {9, 10}, {10, 11}, {13, 15}, {19, 20}, {20, 10}, {21, 10}, {-1, 10}};
    for (const auto &row : rows) {
        ASSERT_EQ(index->SetNumber(tavo::kCurrentUidKey, row.current), 0);
        EXPECT_EQ(tavo::FindFreeId(*index, range, id), 0);
        EXPECT_EQ(id, row.next) << row.current;
    }
    for (int32_t taken = 10; taken <= 20; ++taken)
        ASSERT_EQ(index->Set(tavo::IdKey(taken), "A"), 0);
    EXPECT_EQ(tavo::FindFreeId(*index, range, id), ERR_TOO_MANY_USERS);
}

std::string Value(const tavo::StoreEntries &entries, std::string_view key)
{
    const auto found = entries.find(std::string(key) + '\0');
    return found == entries.end() ? "(none)" : found->second;
}

// Files that other tools wrote: nothing that is an account may be lost, whatever it looks like.
TEST(UserTexts, ForeignFilesKeepTheirAccounts)
{
    const std::vector<tavo::StoreEntries> stores =
        tavo::UserStoreEntries({.passwd = "root:x:0:0:root:/root:/bin/sh\n"
                                          "toor:x:0:0::/root:/bin/sh\n"
                                          "Bob:x:1030:100::/home/bob:/bin/sh\n"
                                          "bob:x:1031:100::/home/bob2:/bin/sh\n"
                                          "bob:x:1032:100::/second:/bin/sh\n"
                                          "pc$:x:2000000:100:machine:/:/bin/false\n"
                                          "old:$1$ab$hash:1033:100::/home/old:/bin/sh\n"
                                          "+::::::\nno account\n\n# comment:x:1:1:::\n"
                                          "last:x:4294967294:65534::/:/bin/false",
                                .shadow = "root:*:1:0:99999:7:::\nbob\nbob:B:1:0:99999:7:::\nBob:b:1:0:99999:7:::\n"
                                          "ghost:*:1:0:99999:7:::\nroot:second:1:0:99999:7:::\n",
                                .misc = "#$_@UID__INDEX@_$2000$\n# record user misc\nBOB:3:mail\n",
                                .smb = "# samba\nbob:1031:X:Y:[U          ]:LCT-00000000:\n"});
    const auto &names = stores[tavo::kNameStore];
    EXPECT_EQ(names.size(), 8u) << "a line with an empty name or without seven fields is not an account";
    EXPECT_EQ(Value(names, "ROOT"), "root:x:0:0:root:/root:/bin/sh\0"s);
    EXPECT_EQ(Value(names, "BOB"), "Bob:x:1030:100::/home/bob:/bin/sh\0"s);
    EXPECT_EQ(Value(names, "bob"), "bob:x:1031:100::/home/bob2:/bin/sh\0"s) << "same name in other case, other account";
    EXPECT_EQ(Value(names, "OLD"), "old:x:1033:100::/home/old:/bin/sh\0"s);

    const auto &shadow = stores[tavo::kShadowStore];
    EXPECT_EQ(Value(shadow, "BOB"), "Bob:b:1:0:99999:7:::\0"s);
    EXPECT_EQ(Value(shadow, "bob"), "bob:B:1:0:99999:7:::\0"s) << "a line without fields hides no other";
    EXPECT_EQ(Value(shadow, "ROOT"), "root:*:1:0:99999:7:::\0"s) << "the first line is what the system reads";
    EXPECT_TRUE(Value(shadow, "OLD").starts_with("old:$1$ab$hash:")) << "the password is no longer in passwd";
    EXPECT_EQ(Value(shadow, "GHOST"), "(none)");

    const auto &index = stores[tavo::kUidStore];
    EXPECT_EQ(Value(index, "000000"), "ROOT\0"s) << "the first of two has the id";
    EXPECT_EQ(Value(index, "001031"), "bob\0"s);
    EXPECT_EQ(index.at("#CURRENT_UID"), tavo::NumberBytes(2000));
    EXPECT_EQ(Value(stores[tavo::kMiscStore], "BOB"), "BOB:3:mail\0"s);
    EXPECT_EQ(Value(stores[tavo::kSmbStore], "bob"), "bob:1031:X:Y:[U          ]:LCT-00000000:\0"s);

    const auto unmarked = tavo::UserStoreEntries({.passwd = "a:x:1050:1:::\nb:x:3073:1:::\nc:x:1040:1:::\n"});
    EXPECT_EQ(unmarked[tavo::kUidStore].at("#CURRENT_UID"), tavo::NumberBytes(1050)) << "the highest in range";
    EXPECT_EQ(tavo::UserStoreEntries({})[tavo::kUidStore].at("#CURRENT_UID"), tavo::NumberBytes(1023));
}

// The steps of a change, which another process may have to complete.
TEST(CommitMarker, ReadsWhatItWrites)
{
    tavo::Marker marker;
    EXPECT_TRUE(marker.IsEmpty());
    marker.files = {{tavo::kSambaLists, "/tmp/a b", "/etc/x%", "1:2:3.4", "-"}};
    EXPECT_FALSE(marker.HasMoreThanFiles() || marker.IsEmpty());
    marker.names = {{true, 6, 0, "%old name", ""}, {false, 9, 0, "a", "b"}};
    EXPECT_FALSE(marker.HasMoreThanFiles());
    marker.MakePending(tavo::kShareLists);
    EXPECT_TRUE(marker.HasMoreThanFiles());
    using Home = tavo::HomeStep;
    marker.homes = {
        {Home::kMake, "a", "", 1000, 100, 0}, {Home::kMove, "a", "b", -1, -1, 7}, {Home::kRemove, "c", "", -1, -1, 0}};
    marker.stages = {"/volume1/@tmp/\x7F\xC3\xA4!"};
    const std::string text = "file 1 /tmp/a%20b /etc/x%25 1:2:3.4 -\n"
                             "name group 6 2 %25old%20name %\nname user 9 0 a b\n"
                             "home make a % 1000 100 0\nhome move a b -1 -1 7\nhome remove c % -1 -1 0\n"
                             "stage /volume1/@tmp/%7F\xC3\xA4!\nend\n";
    EXPECT_EQ(tavo::FormatMarker(marker), text);
    tavo::Marker read;
    ASSERT_TRUE(tavo::ParseMarker(text + "after\n", read));
    EXPECT_EQ(read.names[0].old_name + "|" + read.names[0].new_name, "%old name|");
    EXPECT_EQ(tavo::FormatMarker(read), text);
    read.DropDone();
    ASSERT_EQ(read.names.size(), 1u);
    EXPECT_EQ(read.names[0].targets, 2u);
    for (const std::string line :
         {"", "what a b", "file 1 /a /b 1:2:3.4", "file 1 /a /b 1:2:3.4 - -", "name group 6 2 a", "name user 6 2 a b c",
          "home make a % 1 2", "home make a % 1 2 3 4", "stage", "stage /a b"}) {
        EXPECT_FALSE(tavo::ParseMarker("stage /a\n" + line + "\nend\n", read)) << line;
        EXPECT_TRUE(read.IsEmpty()) << line;
    }
    EXPECT_FALSE(tavo::ParseMarker(text.substr(0, text.size() - 4), read)) << "cut short";
    ASSERT_TRUE(tavo::ParseMarker("stage /a%4\nstage /b%zz\nstage %41%\nend\n", read));
    EXPECT_EQ(read.stages, (std::vector<std::string>{"/a4", "/bzz", "A"})) << "what is not a byte's number";

    // A second one takes the place of the first, and only root's counts.
    for (const bool durable : {false, true}) {
        EXPECT_TRUE(tavo::WriteMarker(text, durable));
        EXPECT_EQ(test::ReadFile(tavo::kCommitMarker), text);
    }
    EXPECT_EQ(tavo::ReadMarker(read), 0);
    EXPECT_EQ(tavo::FormatMarker(read), text);
    for (const mode_t mode : {0620, 0602}) {
        ASSERT_EQ(::chmod(tavo::kCommitMarker, mode), 0);
        EXPECT_EQ(tavo::ReadMarker(read), 0);
        EXPECT_TRUE(read.IsEmpty());
        EXPECT_FALSE(tavo::MarkerStands());
        test::WriteFile(tavo::kCommitMarker, text);
    }
    test::WriteFile(tavo::kCommitMarker, "stage /a\n", 0600);
    EXPECT_EQ(tavo::ReadMarker(read), 0);
    EXPECT_TRUE(read.IsEmpty());
    EXPECT_FALSE(tavo::MarkerStands()) << "it decides nothing";
    EXPECT_EQ(tavo::FileIdentity("/etc"), "-");
    EXPECT_EQ(tavo::FileIdentity("/none"), "-");
    EXPECT_TRUE(tavo::FileIdentity("/etc/passwd").find(":" + std::to_string(test::ReadFile("/etc/passwd").size())) !=
                std::string::npos);
}

TEST(GroupTexts, TheGroupOfAllUsersHasNoMembersOfItsOwn)
{
    const auto stores =
        tavo::GroupStoreEntries("users:x:100:ghost,a\nstaff:x:7:a\n", "staff\n:x\nstaff:a\0b\nSTAFF:1\nstaff:2\n"s);
    EXPECT_EQ(Value(stores[tavo::kGroupNameStore], "USERS"), "users:x:100:\0"s);
    EXPECT_EQ(Value(stores[tavo::kGroupNameStore], "STAFF"), "staff:x:7:a\0"s);
    EXPECT_EQ(Value(stores[tavo::kDescStore], "STAFF"), "STAFF:1\0"s) << "the first line that is one";
}

TEST(UserHomes, AStageThatAnotherProcessRemovesIsLeftAlone)
{
    const test::ScratchDir dir;
    const std::string stage = dir / "stage";
    test::WriteFile(dir / "file", "");
    ASSERT_EQ(::mkdir(stage.c_str(), 0700), 0);
    test::WriteFile(stage + "/letter", "x");
    bool theirs = false;
    {
        const tavo::Fd other = tavo::OpenFd(stage.c_str(), O_RDONLY);
        ASSERT_EQ(::flock(other.Get(), LOCK_EX), 0);
        EXPECT_TRUE(tavo::RemoveStage(stage, theirs));
        EXPECT_TRUE(theirs && std::filesystem::exists(stage));
    }
    for (const std::string &path : {stage, stage, dir / "file"}) {
        EXPECT_EQ(tavo::RemoveStage(path, theirs), path == stage) << path;
        EXPECT_FALSE(theirs || std::filesystem::exists(stage));
    }
    EXPECT_EQ(dir.Names(), (std::vector<std::string>{"file"}));
}

// What one of Samba's programs wrote into a file that had just been replaced.
TEST(SambaLatecomers, LinesThatDifferAreCarriedOver)
{
    const std::string before = "# comment\na:1:L:N:[U]:T:\nb:2:L:N:[U]:T:\nc:3:L:N:[U]:T:\n";
    const struct {
        const char *name;
        std::string now;
        std::string after;
        std::string expected;
    } rows[] = {
        {"a hash", before, "# comment\na:1:L:N:[U]:T:\nb:2:X:Y:[U]:Z:\nc:3:L:N:[U]:T:\n",
         "# comment\na:1:L:N:[U]:T:\nb:2:X:Y:[U]:Z:\nc:3:L:N:[U]:T:\n"},
        {"of one who has another name now", "r:2:L:N:[U]:T:\nb:4:L:N:[U]:T:\n",
         "a:1:L:N:[U]:T:\nc:3:L:N:[U]:T:\nb:2:X:Y:[U]:Z:\n", "r:2:X:Y:[U]:Z:\nb:4:L:N:[U]:T:\n"},
        {"of one who is gone", "c:3:L:N:[U]:T:\n", "b:2:X:Y:[U]:Z:\n", "c:3:L:N:[U]:T:\n"},
        {"a new account", "a:1:L:N:[U]:T:\n", before + "d:5:L:N:[U]:T:\n", "a:1:L:N:[U]:T:\nd:5:L:N:[U]:T:\n"},
        {"what the change wrote stays", "a:1:P:Q:[U]:V:\nb:2:L:N:[U]:T:\n",
         "a:1:L:N:[U]:T:\nb:2:L:N:[D]:T:\nc:3:L:N:[U]:T:\n", "a:1:P:Q:[U]:V:\nb:2:L:N:[D]:T:\n"},
        {"a torn line", "a:1:L:N:[U]:T:\n", "a:1:L:N:[U]:T:\nb\n\n", "a:1:L:N:[U]:T:\n"},
    };
    for (const auto &row : rows)
        EXPECT_EQ(tavo::WithLateLines(row.now, before, row.after), row.expected) << row.name;
}

}  // namespace
