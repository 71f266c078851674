// Groups: names, records, what is refused, what the files say, and who else hears of it.
#include "account/group/group_fixture.h"
#include "support/captured_log.h"
#include "support/container_text.h"
#include "support/fault_state.h"

#include <gmock/gmock.h>

#include <functional>

#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

using namespace std::string_literals;
using test::AddGroup;
using test::DeleteGroups;
using test::GetGroup;
using test::GroupFile;
using test::Names;
using test::SetGroup;
using testing::ElementsAre;
using testing::HasSubstr;

namespace {

static_assert(sizeof(void *) != 4 || sizeof(TAVOGROUP) == 20, "programs of the appliance read these records");

const std::string kSystemGroups = "root:x:0:\nlp:x:7:lp\nusers:x:100:\nadministrators:x:101:admin\n";

// The appliance's groups, in files that the next call has to read.
void StartWith(int current_gid, const std::string &groups = kSystemGroups, const std::string &descriptions = "")
{
    test::WriteFile("/etc/group", "#$_@GID__INDEX@_$" + std::to_string(current_gid) + "$\n" + groups);
    test::WriteFile("/etc/group_desc", descriptions);
}

Names Listed(const std::function<int(TLIBSZLIST **)> &list_into)
{
    test::List list = test::MakeList({});
    const int count = test::Moving(list, list_into);
    EXPECT_EQ(count, list->nItem);
    return test::Items(list.get());
}

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

TEST(GroupFiles, EveryChangeInTurn)
{
    StartWith(65536);
    ::chmod("/etc/group", 0640);
    ASSERT_EQ(AddGroup("Staff", -1, {"bob", "nobody", "", "alice"}), 0);
    ASSERT_EQ(AddGroup("early", 500), 0);
    ASSERT_EQ(TAVOGroupDescSet("STAFF", "Those who work, 100%"), 0);
    ASSERT_EQ(TAVOGroupDescSet("early", "Those who rise"), 0);
    EXPECT_EQ(GroupFile(), "#$_@GID__INDEX@_$65537$\nroot:x:0:\nlp:x:7:lp\nusers:x:100:\nadministrators:x:101:admin\n"
                           "early:x:500:\nStaff:x:65537:bob,alice\n");
    EXPECT_EQ(test::DescFile(), "early:Those who rise\nStaff:Those who work, 100%\n");
    struct stat st;
    ASSERT_EQ(::stat("/etc/group", &st), 0);
    EXPECT_EQ(st.st_mode & 07777, 0640u);

    ASSERT_EQ(SetGroup("staff", "Crew", -1, {"alice"}), 0);
    ASSERT_EQ(SetGroup("EARLY", "Early", 90000, {"carol"}), 0);
    ASSERT_EQ(SetGroup("users", "users", 100, {"alice"}), 0);
    EXPECT_EQ(GroupFile(), "#$_@GID__INDEX@_$65537$\nroot:x:0:\nlp:x:7:lp\nusers:x:100:\nadministrators:x:101:admin\n"
                           "Crew:x:65537:alice\nEarly:x:90000:carol\n");
    EXPECT_EQ(test::DescFile(), "Crew:Those who work, 100%\nEarly:Those who rise\n");
    EXPECT_FALSE(GetGroup("staff"));

    ASSERT_EQ(TAVOGroupDescSet("early", nullptr), 0);
    ASSERT_EQ(TAVOGroupDescSet("early", ""), 0) << "there is none any more";
    ASSERT_EQ(DeleteGroups({"CREW"}), 0);
    EXPECT_EQ(GroupFile(), "#$_@GID__INDEX@_$65537$\nroot:x:0:\nlp:x:7:lp\nusers:x:100:\nadministrators:x:101:admin\n"
                           "Early:x:90000:carol\n");
    EXPECT_EQ(test::DescFile(), "");
    for (const char *path : {"/etc/group_tmp", "/etc/group_desc.tmp", "/etc/.tavoaccount.commit"})
        EXPECT_NE(::access(path, F_OK), 0) << path;
}

TEST(GroupSet, RefusalsLeaveTheFiles)
{
    StartWith(65600);
    ASSERT_EQ(AddGroup("staff"), 0);
    ASSERT_EQ(TAVOGroupDescSet("staff", "kept"), 0);
    const std::string before = GroupFile();
    const struct {
        const char *old_name;
        std::string name;
        int gid;
        Names members;
        int code;
    } rows[] = {
        {nullptr, "STAFF", -1, {}, ERR_GROUP_EXISTS},
        {"lp", "Staff", 7, {}, ERR_GROUP_EXISTS},
        {"ghost", "staff", -1, {}, ERR_NO_SUCH_GROUP},
        {nullptr, std::string(16, 'g'), -1, {}, ERR_INVALID_GROUPNAME},
        {nullptr, "a:b", -1, {}, ERR_INVALID_GROUPNAME},
        {nullptr, "a\nroot:x:0:eve", -1, {}, ERR_INVALID_GROUPNAME},
        {nullptr, "..", -1, {}, ERR_INVALID_GROUPNAME},
        {nullptr, "", -1, {}, ERR_INVALID_GROUPNAME},
        {nullptr, "\xFF\xFE", -1, {}, ERR_INVALID_GROUPNAME},
        {nullptr, std::string(4096, 'g'), -1, {}, ERR_INVALID_GROUPNAME},
        {nullptr, "new", -2, {}, ERR_BAD_PARAMETERS},
        {nullptr, "new", -1, {"a,b"}, ERR_BAD_PARAMETERS},
        {nullptr, "new", -1, {"a:b"}, ERR_BAD_PARAMETERS},
        {nullptr, "new", -1, {"alice", "eve\nroot:x:0:eve"}, ERR_BAD_PARAMETERS},
        {nullptr, "new", -1, {"a\x1B[2J"}, ERR_BAD_PARAMETERS},
        {nullptr, "new", -1, {".."}, ERR_BAD_PARAMETERS},
        {nullptr, "new", -1, {std::string(4096, 'm')}, ERR_BAD_PARAMETERS},
        {"staff", "staff", -1, {"a,b"}, ERR_BAD_PARAMETERS},
    };
    for (const auto &row : rows)
        EXPECT_EQ(SetGroup(row.old_name, row.name, row.gid, row.members), row.code) << row.name.substr(0, 20);
    EXPECT_EQ(test::CodeOf(TAVOGroupSet(nullptr, nullptr)), ERR_BAD_PARAMETERS);
    for (const std::string &text : {std::string("a:b"), std::string("a\nb:c"), std::string(513, 'd')})
        EXPECT_EQ(test::CodeOf(TAVOGroupDescSet("staff", text.c_str())), ERR_BAD_PARAMETERS) << text.substr(0, 9);
    EXPECT_EQ(test::CodeOf(TAVOGroupDescSet("ghost", "d")), ERR_NO_SUCH_GROUP);
    EXPECT_EQ(GroupFile(), before);
    EXPECT_EQ(test::DescFile(), "staff:kept\n");

    test::CapturedLog log;
    EXPECT_EQ(AddGroup("DOM\\staff"), ERR_INVALID_GROUPNAME);
    ASSERT_EQ(log.Lines().size(), 1u);
    EXPECT_THAT(log.Texts()[0], HasSubstr("Cannot set not-local group. group name=[DOM\\staff]"));

    char small[4];
    EXPECT_EQ(test::CodeOf(TAVOGroupDescGet("staff", small, 4)), ERR_NOT_ENOUGH_MEMORY);
    EXPECT_EQ(TAVOGroupDescGet("staff", nullptr, 0), 5);
    char text[5];
    EXPECT_EQ(TAVOGroupDescGet("STAFF", text, 5), 5);
    EXPECT_STREQ(text, "kept");
    EXPECT_EQ(TAVOGroupDescGet("lp", text, 5), 1);
    EXPECT_STREQ(text, "");
    EXPECT_EQ(test::CodeOf(TAVOGroupDescGet("ghost", text, 5)), ERR_NO_SUCH_GROUP);
}

TEST(GroupSet, GidsOfTheRange)
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

TEST(GroupDelete, SkipsWhatFails)
{
    StartWith(65536);
    for (const char *name : {"one", "two", "three"})
        ASSERT_EQ(AddGroup(name), 0);
    test::CapturedLog log;
    EXPECT_EQ(DeleteGroups({"one", "ghost", "ONE", "DOM\\two", "three"}), ERR_NO_SUCH_GROUP);
    EXPECT_FALSE(GetGroup("one"));
    EXPECT_TRUE(GetGroup("two"));
    EXPECT_FALSE(GetGroup("three"));
    EXPECT_THAT(log.Texts(), testing::Contains(HasSubstr("Duplicate group name:[ONE]")));
    EXPECT_EQ(test::CodeOf(TAVOGroupDelete(nullptr, 1)), ERR_BAD_PARAMETERS);
    EXPECT_EQ(TAVOGroupDelete(nullptr, 0), 0);
}

TEST(GroupGet, ByNameAndGid)
{
    StartWith(65536, "root:x:0:\nTwin:x:300:a\nother:x:300:b\nSystemd-Journal-Remote:x:301:\n");
    EXPECT_STREQ(GetGroup("tWIN")->szName, "Twin");
    TAVOGROUP *group = nullptr;
    ASSERT_EQ(TAVOGroupGetByGID(300, &group), 0);
    EXPECT_STREQ(group->szName, "Twin") << "the first of two with one id";
    ASSERT_EQ(DeleteGroups({"twin"}), 0);
    ASSERT_EQ(TAVOGroupGetByGID(300, &group), 0);
    EXPECT_STREQ(group->szName, "other");
    const TAVOGROUP *untouched = group;
    EXPECT_EQ(test::CodeOf(TAVOGroupGetByGID(999, &group)), ERR_NO_SUCH_GROUP);
    EXPECT_EQ(test::CodeOf(TAVOGroupGet("ghost", &group)), ERR_NO_SUCH_GROUP);
    EXPECT_EQ(test::CodeOf(TAVOGroupGet("DOM\\a", &group)), ERR_NO_SUCH_GROUP);
    EXPECT_EQ(test::CodeOf(TAVOGroupGet("\xFF", &group)), ERR_INVALID_GROUPNAME);
    EXPECT_EQ(test::CodeOf(TAVOGroupGet("", &group)), ERR_BAD_PARAMETERS);
    EXPECT_EQ(test::CodeOf(TAVOGroupGet("other", nullptr)), ERR_BAD_PARAMETERS);
    EXPECT_EQ(group, untouched);
    TAVOGroupFree(group);
    EXPECT_EQ(GroupFile(), "#$_@GID__INDEX@_$65536$\nroot:x:0:\nother:x:300:b\nSystemd-Journal-Remote:x:301:\n");
}

TEST(GroupEnum, ListsByFlagAndText)
{
    StartWith(65536, "root:x:0:\nzero:x:0:\nlp:x:7:\nusers:x:100:\nedge:x:65535:\nAlpha:x:65536:\nbeta:x:70000:\n"
                     "nogid:x:-1:\nUSERS2:x:101:\n");
    EXPECT_THAT(Listed([](TLIBSZLIST **list) { return TAVOGroupEnum(list, TAVO_GROUP_LOCAL); }),
                ElementsAre("Alpha", "beta", "nogid", "users"));
    EXPECT_THAT(Listed([](TLIBSZLIST **list) { return TAVOGroupEnum(list, TAVO_GROUP_DOMAIN); }), ElementsAre());
    EXPECT_EQ(TAVOGroupTotalNum(TAVO_GROUP_LOCAL | TAVO_GROUP_DOMAIN), 4);
    const auto by_prefix = [](const char *text) {
        return Listed([=](TLIBSZLIST **list) { return TAVOGroupEnumByPrefix(list, TAVO_GROUP_LOCAL, text); });
    };
    const auto by_substr = [](const char *text) {
        return Listed([=](TLIBSZLIST **list) { return TAVOGroupEnumBySubstr(list, TAVO_GROUP_LOCAL, text); });
    };
    EXPECT_THAT(by_prefix("aL"), ElementsAre("Alpha"));
    EXPECT_THAT(by_prefix("ta"), ElementsAre());
    EXPECT_THAT(by_substr("TA"), ElementsAre("beta"));
    EXPECT_EQ(by_substr("").size(), 4u);
    TLIBSZLIST *list = nullptr;
    EXPECT_EQ(test::CodeOf(TAVOGroupEnum(&list, TAVO_GROUP_LOCAL)), ERR_BAD_PARAMETERS);
    EXPECT_EQ(test::CodeOf(TAVOGroupTotalNum(0)), ERR_BAD_PARAMETERS);
}

Names MembersOf(const char *group)
{
    return Listed([=](TLIBSZLIST **list) { return TAVOGroupListMember(group, list); });
}

TEST(GroupMembers, AreUsersThatExist)
{
    StartWith(65536);
    for (const char *name : {"alice", "bob"})
        ASSERT_EQ(test::AddUser(name), 0);
    ASSERT_EQ(AddGroup("staff", -1, {"bob", "ghost", "ALICE"}), 0);
    ASSERT_EQ(AddGroup("empty"), 0);
    EXPECT_THAT(MembersOf("Staff"), ElementsAre("bob", "ALICE"));
    EXPECT_THAT(MembersOf("empty"), ElementsAre());
    EXPECT_THAT(MembersOf("USERS"), testing::IsSupersetOf({"alice", "bob"}));
    EXPECT_THAT(GroupFile(), HasSubstr("users:x:100:\n"));
    TLIBSZLIST *list = PslTLIBSzListAlloc(512);
    EXPECT_EQ(test::CodeOf(TAVOGroupListMember("ghosts", &list)), ERR_NO_SUCH_GROUP);
    TLIBSzListFree(list);
}

TEST(GroupMembers, FollowTheUsers)
{
    StartWith(65536);
    for (const char *name : {"alice", "bob", "carol"})
        ASSERT_EQ(test::AddUser(name), 0);
    ASSERT_EQ(AddGroup("one", -1, {"carol", "Alice", "bob"}), 0);
    ASSERT_EQ(AddGroup("two", -1, {"bob"}), 0);
    ASSERT_EQ(test::SetUsers({{"alice", "Alicia"}}, ""), 0);
    EXPECT_THAT(GroupFile(), HasSubstr("one:x:65537:carol,Alicia,bob\ntwo:x:65538:bob\n"));
    ASSERT_EQ(test::DeleteUser("BOB"), 0);
    EXPECT_THAT(GroupFile(), HasSubstr("one:x:65537:carol,Alicia\ntwo:x:65538:\n"));

    // Nothing to change: the file is not even touched.
    struct stat before;
    struct stat after;
    ASSERT_EQ(::stat("/etc/group", &before), 0);
    TLIBSZHASH *hash = PshTLIBSzHashAlloc(512);
    TLIBSzHashSetValue(&hash, "DAVE", "eve");
    EXPECT_EQ(TAVOUserModifyGroup(hash), 0);
    TLIBSzHashFree(hash);
    ASSERT_EQ(::stat("/etc/group", &after), 0);
    EXPECT_EQ(before.st_ino, after.st_ino);
    EXPECT_EQ(test::CodeOf(TAVOUserModifyGroup(nullptr)), ERR_BAD_PARAMETERS);
}

TEST(GroupFollowUp, SharesAndSamba)
{
    StartWith(65536);
    const std::string shares = "# mine\n[photo]\npath=/volume1/@staff\nreadonly=\"@staff, staff,@STAFF2\"\n"
                               "readwrite = bob , @Staff\ndeny=@staff\n[x]\ndescription=@staff,a";
    test::WriteFile("/usr/tavo/etc/share.conf", shares, 0640);
    test::WriteFile("/usr/tavo/etc/smb.conf", "[s]\nvalid users = staff, @staff, +Staff\n");
    ASSERT_EQ(AddGroup("staff"), 0);
    EXPECT_EQ(test::ReadFile("/usr/tavo/etc/share.conf"), shares);
    ASSERT_EQ(SetGroup("STAFF", "crew"), 0);
    EXPECT_EQ(test::ReadFile("/usr/tavo/etc/share.conf"),
              "# mine\n[photo]\npath=/volume1/@staff\nreadonly=\"@crew, staff,@STAFF2\"\n"
              "readwrite = bob , @crew\ndeny=@crew\n[x]\ndescription=@staff,a");
    EXPECT_THAT(test::ReadFile("/usr/tavo/etc/smb.conf"), HasSubstr("crew"));
    ASSERT_EQ(DeleteGroups({"crew"}), 0);
    EXPECT_EQ(test::ReadFile("/usr/tavo/etc/share.conf"),
              "# mine\n[photo]\npath=/volume1/@staff\nreadonly=\" staff,@STAFF2\"\n"
              "readwrite = bob \ndeny=\n[x]\ndescription=@staff,a");
    EXPECT_EQ(test::ReadFile("/usr/tavo/etc/smb.conf"), "[s]\nvalid users = staff\n");
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
    EXPECT_EQ(test::CodeOf(TAVOGroupDBGetFreeGid(nullptr)), ERR_BAD_PARAMETERS);
}

}  // namespace
