// Groups: names, records, what is refused, what the files say, and who else hears of it.
#include "account/group/group_fixture.h"
#include "support/container_text.h"
#include "support/story.h"
#include "support/test.h"

using namespace std::string_literals;
using test::AddGroup;
using test::DeleteGroups;
using test::GetGroup;
using test::GroupFile;
using test::Names;
using test::SetGroup;
using testing::ElementsAre;

namespace {

static_assert(sizeof(void *) != 4 || sizeof(TAVOGROUP) == 20, "programs of the appliance read these records");

const std::string kSystemGroups = "root:x:0:\nlp:x:7:lp\nusers:x:100:\nadministrators:x:101:admin\n";

// The appliance's groups, in files that the next call has to read.
void StartWith(int current_gid, const std::string &groups = kSystemGroups, const std::string &descriptions = "")
{
    test::WriteFile("/etc/group", "#$_@GID__INDEX@_$" + std::to_string(current_gid) + "$\n" + groups);
    test::WriteFile("/etc/group_desc", descriptions);
}

class Groups : public testing::Test {
  protected:
    void TellList(const char *text, const std::function<int(TLIBSZLIST **)> &list_into)
    {
        test::List list = test::MakeList({});
        const int count = story_.Tell(text, [&] { return test::Moving(list, list_into); });
        story_.Show("names", test::Items(list.get()));
        EXPECT_EQ(count, list->nItem);
    }

    test::CapturedLog log_;
    test::Story story_{TEST_GOLDEN,
                       {test::LogOf(log_, LOG_NOTICE)},
                       {"/etc/group", "/etc/group_desc", "/usr/tavo/etc/share.conf", "/usr/tavo/etc/smb.conf"}};
};

TEST(GroupName, Rule)
{
    std::string umlauts;  // characters count, not bytes
    for (int i = 0; i < 15; ++i)
        umlauts += "\xC3\xBC";
    for (const std::string &good : {"a"s, std::string(15, 'g'), "a b.c-d_e"s, "J\xC3\xBC"s, umlauts})
        EXPECT_EQ(BlTLIBIsGroupName(good.c_str()), 1) << good;
    for (const std::string &bad :
         {std::string(16, 'g'), ""s, "-a"s, " a"s, "a "s, "a:b"s, "a,b"s, "a\nb"s, "@a"s, "D\\a"s, umlauts + "x"})
        EXPECT_EQ(BlTLIBIsGroupName(bad.c_str()), 0) << bad;
    EXPECT_EQ(BlTLIBIsGroupName(nullptr), 0);
}

TEST(GroupRecord, BuiltFromPartsAndFromLines)
{
    TAVOGROUP *group = nullptr;
    const char *members[] = {"bob", "nobody", "", "Alice", nullptr};
    ASSERT_EQ(TAVOGroupAlloc2(&group, "Staff", 70000, members), 0);
    EXPECT_STREQ(group->szName, "Staff");
    EXPECT_EQ(group->nGid, 70000);
    EXPECT_EQ(group->nKind, TAVO_GROUP_KIND_LOCAL);
    EXPECT_THAT(test::Members(*group), ElementsAre("bob", "Alice"));
    EXPECT_GT(group->cbBlock, static_cast<int>(sizeof(TAVOGROUP) + 3 * sizeof(char *)));
    // Refilled from its own strings.
    ASSERT_EQ(TAVOGroupAlloc2(&group, group->rgszMember[1], 5, group->rgszMember), 0);
    EXPECT_STREQ(group->szName, "Alice");
    EXPECT_THAT(test::Members(*group), ElementsAre("bob", "Alice"));
    ASSERT_EQ(TAVOGroupAlloc2(&group, "DOM\\staff", 5, nullptr), 0);
    EXPECT_EQ(group->nKind, TAVO_GROUP_KIND_DOMAIN);
    EXPECT_EQ(group->rgszMember[0], nullptr);

    const struct {
        const char *line;
        int code;
    } rows[] = {{"a:x:1:", 0},
                {"a:x:1:b,,nobody,c\n", 0},
                {"a:x:1", ERR_FORMAT_ERROR},
                {"a:x:1:b:c", ERR_FORMAT_ERROR},
                {"a:x:one:", ERR_FORMAT_ERROR},
                {"", ERR_FORMAT_ERROR},
                {":x:1:", ERR_INVALID_GROUPNAME}};
    for (const auto &row : rows)
        EXPECT_EQ(test::CodeOf(TAVOGroupAlloc(&group, row.line)), row.code) << row.line;
    EXPECT_THAT(test::Members(*group), ElementsAre("b", "c")) << "the last line that was one";
    TAVOGroupFree(group);
    TAVOGroupFree(nullptr);
}

TEST_F(Groups, EveryChangeInTurn)
{
    StartWith(65536);
    ::chmod("/etc/group", 0640);
    TELL(AddGroup("Staff", -1, {"bob", "nobody", "", "alice"}));
    TELL(AddGroup("early", 500));
    TELL(AddGroup("EARLIER", 500));  // of two with one id the first has the index
    TELL(TAVOGroupDescSet("STAFF", "Those who work, 100%"));
    TELL(TAVOGroupDescSet("early", "Those who rise"));
    struct stat st;
    ASSERT_EQ(::stat("/etc/group", &st), 0);
    EXPECT_EQ(st.st_mode & 07777, 0640u);

    TELL(SetGroup("staff", "Crew", -1, {"alice"}));
    TELL(SetGroup("EARLY", "Early", 90000, {"carol"}));
    TELL(SetGroup("users", "users", 100, {"alice"}));
    EXPECT_FALSE(GetGroup("staff"));
    TELL(TAVOGroupDescSet("early", nullptr));
    TELL(TAVOGroupDescSet("early", ""));  // there is none any more
    TELL(DeleteGroups({"CREW"}));
    for (const char *path : {"/etc/group_tmp", "/etc/group_desc.tmp", "/etc/.tavoaccount.commit"})
        EXPECT_NE(::access(path, F_OK), 0) << path;
}

TEST_F(Groups, RefusalsLeaveTheFiles)
{
    StartWith(65600);
    ASSERT_EQ(AddGroup("staff"), 0);
    ASSERT_EQ(TAVOGroupDescSet("staff", "kept"), 0);
    for (const std::string &name : {"STAFF"s, std::string(16, 'g'), "a:b"s, "a\nroot:x:0:eve"s, ".."s, ""s, "\xFF\xFE"s,
                                    std::string(4096, 'g'), "DOM\\staff"s}) {
        story_.Head(name.substr(0, 20));
        TELL(AddGroup(name));
    }
    for (const Names &members :
         {Names{"a,b"}, {"a:b"}, {"alice", "eve\nroot:x:0:eve"}, {"a\x1B[2J"}, {".."}, {std::string(4096, 'm')}}) {
        story_.Head("with " + members.back().substr(0, 20));
        TELL(AddGroup("new", -1, members));
    }
    TELL(AddGroup("new", -2));
    TELL(SetGroup("lp", "Staff", 7));
    TELL(SetGroup("ghost", "staff"));
    TELL(SetGroup("staff", "staff", -1, {"a,b"}));
    TELL(TAVOGroupSet(nullptr, nullptr));
    for (const std::string &text : {std::string("a:b"), std::string("a\nb:c"), std::string(513, 'd')})
        TELL(TAVOGroupDescSet("staff", text.c_str()));
    TELL(TAVOGroupDescSet("ghost", "d"));

    char text[5] = "";
    TELL(TAVOGroupDescGet("staff", text, 4));
    TELL(TAVOGroupDescGet("staff", nullptr, 0));
    for (const char *name : {"STAFF", "lp", "ghost"}) {
        TELL(TAVOGroupDescGet(name, text, 5));
        story_.Show("description", text);
    }
}

TEST_F(Groups, GidsOfTheRange)
{
    const struct {
        int current;
        std::string more;
        int gid;
    } rows[] = {
        {65536, "", 65537}, {95535, "", 95536},   {95536, "", 65536},
        {1000, "", 65536},  {2000000, "", 65536}, {95534, "a:x:95535:\nb:x:95536:\nc:x:65536:\n", 65537},
    };
    for (const auto &row : rows) {
        StartWith(row.current, kSystemGroups + row.more);
        ASSERT_EQ(AddGroup("new"), 0);
        EXPECT_EQ(GetGroup("new")->nGid, row.gid) << row.current;
        EXPECT_THAT(GroupFile(), testing::StartsWith("#$_@GID__INDEX@_$" + std::to_string(row.gid) + "$\n"));
    }
    // Without its first line the next id follows the greatest one in the file.
    test::WriteFile("/etc/group", "root:x:0:\na:x:70000:\n");
    ASSERT_EQ(AddGroup("new"), 0);
    EXPECT_EQ(GetGroup("new")->nGid, 70001);

    std::string full;
    for (int gid = TAVO_GROUP_GID_MIN; gid <= TAVO_GROUP_GID_MAX; ++gid)
        full += "g" + std::to_string(gid) + ":x:" + std::to_string(gid) + ":\n";
    StartWith(80000, full);
    EXPECT_EQ(AddGroup("g80000"), ERR_TOO_MANY_GROUPS) << "before the name is looked at";
    EXPECT_EQ(AddGroup("late", 500), 0);
    ASSERT_EQ(DeleteGroups({"g70000"}), 0);
    EXPECT_EQ(AddGroup("last"), 0);
    EXPECT_EQ(GetGroup("last")->nGid, 70000);
}

TEST_F(Groups, DeletingSkipsWhatFails)
{
    StartWith(65536);
    for (const char *name : {"one", "two", "three"})
        ASSERT_EQ(AddGroup(name), 0);
    TELL(DeleteGroups({"one", "ghost", "ONE", "DOM\\two", "three"}));
    TELL(TAVOGroupDelete(nullptr, 0));
}

TEST_F(Groups, ByNameAndGid)
{
    StartWith(65536, "root:x:0:\nTwin:x:300:a\nother:x:300:b\nSystemd-Journal-Remote:x:301:\n");
    EXPECT_STREQ(GetGroup("tWIN")->szName, "Twin");
    TAVOGROUP *group = nullptr;
    TELL(TAVOGroupGetByGID(300, &group));
    story_.Show("name", group->szName);  // the first of two with one id
    TELL(DeleteGroups({"twin"}));
    TELL(TAVOGroupGetByGID(300, &group));
    story_.Show("name", group->szName);
    const TAVOGROUP *untouched = group;
    TELL(TAVOGroupGetByGID(999, &group));
    TELL(TAVOGroupGet("ghost", &group));
    TELL(TAVOGroupGet("DOM\\a", &group));
    EXPECT_EQ(group, untouched);
    TAVOGroupFree(group);
}

TEST_F(Groups, ListsByFlagAndText)
{
    StartWith(65536, "root:x:0:\nzero:x:0:\nlp:x:7:\nusers:x:100:\nedge:x:65535:\nAlpha:x:65536:\nbeta:x:70000:\n"
                     "nogid:x:-1:\nUSERS2:x:101:\n");
    TellList("local", [](TLIBSZLIST **list) { return TAVOGroupEnum(list, TAVO_GROUP_LOCAL); });
    TellList("domain", [](TLIBSZLIST **list) { return TAVOGroupEnum(list, TAVO_GROUP_DOMAIN); });
    TELL(TAVOGroupTotalNum(TAVO_GROUP_LOCAL | TAVO_GROUP_DOMAIN));
    for (const char *text : {"aL", "ta"})
        TellList(text, [=](TLIBSZLIST **list) { return TAVOGroupEnumByPrefix(list, TAVO_GROUP_LOCAL, text); });
    for (const char *text : {"TA", ""})
        TellList(text, [=](TLIBSZLIST **list) { return TAVOGroupEnumBySubstr(list, TAVO_GROUP_LOCAL, text); });
    TELL(TAVOGroupTotalNum(0));
}

TEST_F(Groups, MembersAreUsersThatExist)
{
    StartWith(65536);
    for (const char *name : {"alice", "bob"})
        ASSERT_EQ(test::AddUser(name), 0);
    ASSERT_EQ(AddGroup("staff", -1, {"bob", "ghost", "ALICE"}), 0);
    ASSERT_EQ(AddGroup("empty"), 0);
    for (const char *group : {"Staff", "empty", "USERS", "ghosts"})
        TellList(group, [=](TLIBSZLIST **list) {
            const int count = TAVOGroupListMember(group, list);
            return count < 0 ? 0 : count;
        });
    EXPECT_THAT(GroupFile(), testing::HasSubstr("users:x:100:\n"));
}

TEST_F(Groups, MembersFollowTheUsers)
{
    StartWith(65536);
    for (const char *name : {"alice", "bob", "carol"})
        ASSERT_EQ(test::AddUser(name), 0);
    TELL(AddGroup("one", -1, {"carol", "Alice", "bob"}));
    TELL(AddGroup("two", -1, {"bob"}));
    TELL(test::SetUsers({{"alice", "Alicia"}}, ""));
    TELL(test::DeleteUser("BOB"));

    // Nothing to change: the file is not even touched.
    struct stat before;
    struct stat after;
    ASSERT_EQ(::stat("/etc/group", &before), 0);
    TLIBSZHASH *hash = PshTLIBSzHashAlloc(512);
    TLIBSzHashSetValue(&hash, "DAVE", "eve");
    TELL(TAVOUserModifyGroup(hash));
    TLIBSzHashFree(hash);
    ASSERT_EQ(::stat("/etc/group", &after), 0);
    EXPECT_EQ(before.st_ino, after.st_ino);
}

TEST_F(Groups, SharesAndSambaFollow)
{
    StartWith(65536);
    test::WriteFile("/usr/tavo/etc/share.conf",
                    "# mine\n[photo]\npath=/volume1/@staff\nreadonly=\"@staff, staff,@STAFF2\"\n"
                    "readwrite = bob , @Staff\ndeny=@staff\n[x]\ndescription=@staff,a",
                    0640);
    test::WriteFile("/usr/tavo/etc/smb.conf", "[s]\nvalid users = staff, @staff, +Staff\n");
    TELL(AddGroup("staff"));
    TELL(SetGroup("STAFF", "crew"));
    TELL(DeleteGroups({"crew"}));
    struct stat st;
    ASSERT_EQ(::stat("/usr/tavo/etc/share.conf", &st), 0);
    EXPECT_EQ(st.st_mode & 07777, 0640u);
}

TEST(GroupStores, OpenDatabaseByHand)
{
    StartWith(95536);
    ASSERT_TRUE(GetGroup("root"));
    TAVOGROUPDB db = {TAVOBDbOpen(TAVO_GROUP_DB_NAME, O_RDWR, 1), TAVOBDbOpen(TAVO_GROUP_DB_ID, O_RDWR, 1),
                      TAVOBDbOpen(TAVO_GROUP_DB_DESC, O_RDWR, 1)};
    EXPECT_EQ(TAVOGroupDBGetFreeGid(&db), 65536);
    const test::GroupRecord record("by hand", 70000, {"a"});
    EXPECT_EQ(TAVOGroupDBSet(&db, nullptr, &record.record), 0);
    EXPECT_EQ(test::CodeOf(TAVOGroupDBSet(&db, nullptr, &record.record)), ERR_GROUP_EXISTS);
    void *value = nullptr;
    int length = 0;
    ASSERT_EQ(TAVOBDbGet(db.pName, "BY HAND", 8, &value, &length), 0);
    EXPECT_EQ(std::string(static_cast<char *>(value), static_cast<size_t>(length)),
              std::string("by hand:x:70000:a") + '\0');
    TAVOBDbFree(value);
    ASSERT_EQ(TAVOBDbGet(db.pGid, "070000", 7, &value, &length), 0);
    EXPECT_STREQ(static_cast<char *>(value), "BY HAND");
    TAVOBDbFree(value);
    for (TAVOBDB *store : {db.pName, db.pGid, db.pDesc})
        EXPECT_EQ(TAVOBDbClose(store), 0);
    // A group that a program has taken out of the store alone: no file loses its line.
    ASSERT_TRUE(GetGroup("root"));
    TAVOBDB *const names = TAVOBDbOpen(TAVO_GROUP_DB_NAME, O_RDWR, 1);
    EXPECT_EQ(TAVOBDbDelete(names, "LP", 3), 0);
    EXPECT_EQ(TAVOBDbClose(names), 0);
    EXPECT_EQ(AddGroup("other"), ERR_WRITE_FAILED);
    std::filesystem::remove("/tmp/.db.group.seal");
}

}  // namespace
