// Arrays: read from the driver and the kernel's files, changed by exactly these commands.
#include "tavo_partition.h"
#include "tavo_raid.h"

#include "storage/storage_scene.h"
#include "support/test.h"

#include <linux/fs.h>
#include <linux/major.h>
#include <linux/raid/md_u.h>
#include <syslog.h>

using test::CommandReply;
using test::List;
using test::MakeList;
using test::Quiet;

namespace {

using Info = std::unique_ptr<RAIDINFO, decltype(&RAIDInfoFree)>;

struct FakeDisk {
    int number, major, minor, state;
};

// An array as the driver describes it.
struct FakeArray {
    mdu_array_info_t info = {};
    std::vector<FakeDisk> disks;
    uint64_t cbDevice = 0;  // of every device that is asked for its size
    int error = 0;          // of GET_ARRAY_INFO

    FakeArray(int level, int slots, std::vector<FakeDisk> members) : disks(std::move(members))
    {
        info.level = level;
        info.raid_disks = slots;
        info.nr_disks = static_cast<int>(disks.size());
        for (const FakeDisk &disk : disks)
            ++((disk.state & 1) ? info.failed_disks : info.working_disks);
    }

    int operator()(int, unsigned long request, void *argument) const
    {
        if (request == GET_ARRAY_INFO && error == 0) {
            *static_cast<mdu_array_info_t *>(argument) = info;
            return 0;
        }
        if (request == BLKGETSIZE64) {
            *static_cast<uint64_t *>(argument) = cbDevice;
            return 0;
        }
        if (request == GET_DISK_INFO) {
            auto *disk = static_cast<mdu_disk_info_t *>(argument);
            for (const FakeDisk &known : disks) {
                if (known.number == disk->number)
                    disk->major = known.major, disk->minor = known.minor, disk->state = known.state;
            }
            return 0;
        }
        errno = request == GET_ARRAY_INFO ? error : ENOTTY;
        return -1;
    }
};

// Every field.
std::string Text(const RAIDINFO &info)
{
    std::ostringstream text;
    text << info.nArray << " " << info.szPath << " level " << info.fLevel << " status " << info.nStatus << "/"
         << info.fRebuilding << " bytes " << info.cbArray << "/" << info.cbMember << " slots " << info.nSlot << "/"
         << info.nWorking << "/" << info.nFailed;
    for (const RAIDMEMBER *member = info.pMembers; member; member = member->pNext)
        text << " " << member->szPath << ":" << member->nState;
    return text.str();
}

class Raid : public test::StorageStory {
  protected:
    explicit Raid(const std::string &without = "") : StorageStory(without) {}
    // md5 of sda3, sdb3, sdc3; the kernel's number 1 is unused, as after a rebuild.
    FakeArray Put(int level = 5, int slots = 3, std::vector<int> states = {6, 6, 6})
    {
        std::vector<FakeDisk> disks;
        for (int i = 0; i < static_cast<int>(states.size()); ++i) {
            disks.push_back({i == 0 ? 0 : i + 1, 8, 16 * i + 3, states[static_cast<size_t>(i)]});
            const std::string device = "sd" + std::string(1, static_cast<char>('a' + i)) + "3";
            const std::string link = "/sys/dev/block/8:" + std::to_string(16 * i + 3);
            tree_.Remove(link);
            tree_.Link(link, "../../devices/x/block/" + device);
        }
        tree_.Put("/dev/md5", "");
        tree_.Put("/sys/block/md5/size", "303104\n");
        tree_.Put("/sys/block/md5/md/component_size", "75776\n");
        tree_.Put("/sys/block/md5/md/array_state", "clean\n");
        tree_.Put("/sys/block/md5/md/sync_action", "idle\n");
        tree_.Put("/sys/block/md5/md/chunk_size", "65536\n");
        return FakeArray(level, slots, disks);
    }
    Info Get(const char *path = "/dev/md5")
    {
        RAIDINFO *info = nullptr;
        EXPECT_EQ(RAIDInfoGet(path, &info), 1);
        return {info, RAIDInfoFree};
    }
    RAIDINFO Record(int level, RAIDMEMBER *members = nullptr)
    {
        return {5, "/dev/md5", level, 1, 0, 1 << 30, 1 << 20, 4, 4, 0, members};
    }
    // The size of every device.
    void Size(uint64_t bytes)
    {
        FakeArray sizes(5, 3, {});
        sizes.cbDevice = bytes;
        calls_.OnIoctl(sizes);
    }
    const std::string superblock_{test::Capture("mdadm_E_1.2_raid5-mdadm-4.2")};
};

TEST_F(Raid, StatusDecide)
{
    const struct {
        int level, slots;
        const char *states;  // of the members
    } rows[] = {{5, 4, "1111"}, {5, 3, "1111"}, {0, 2, "11"},   {-1, 2, "11"}, {5, 4, "111"},
                {5, 4, "1112"}, {5, 4, "1113"}, {5, 4, "1115"}, {6, 4, "11"},  {1, 4, "1"},
                {10, 4, "11"},  {5, 4, "1188"}, {5, 4, ""},     {6, 4, "1"},   {5, 4, "11114"},
                {1, 2, "22"},   {10, 4, "1"},   {0, 2, "1"},    {-1, 2, "14"}, {4, 4, "1111"}};
    mdu_array_info_t array = {};
    for (const auto &row : rows) {
        std::vector<RAIDMEMBER> members(std::strlen(row.states) + 1);
        for (size_t i = 0; row.states[i]; ++i) {
            members[i].nState = row.states[i] - '0';
            members[i].pNext = row.states[i + 1] ? &members[i + 1] : nullptr;
        }
        array.level = row.level;
        array.raid_disks = row.slots;
        int status = 7;
        story_.Head("level " + std::to_string(row.level) + ", " + std::to_string(row.slots) + " slots: " + row.states);
        TELL(RAIDStatusDecide(&array, *row.states ? members.data() : nullptr, &status));
        story_.Show("status", status);
    }
}

TEST_F(Raid, ParityDiskCount)
{
    const std::pair<int, int> rows[] = {{1, 4}, {2, 4}, {4, 4}, {8, 4}, {16, 4}, {16, 5}, {32, 4}, {0, 4}, {3, 4}};
    for (const auto &[level, disks] : rows) {
        story_.Head("level " + std::to_string(level) + " of " + std::to_string(disks));
        TELL(RAIDParityDiskCount(level, disks));
    }
}

TEST_F(Raid, InfoDupCopiesEveryField)
{
    RAIDMEMBER second = {"/dev/sdb3", 8, nullptr};
    RAIDMEMBER first = {"/dev/sda3", 1, &second};
    RAIDINFO info = {11, "/dev/md11", 12, 13, 14, uint64_t{15} << 40, uint64_t{16} << 40, 17, 18, 19, &first};
    const Info copy(RAIDInfoDup(&info), RAIDInfoFree);
    ASSERT_TRUE(copy);
    EXPECT_EQ(Text(*copy), Text(info));
    EXPECT_NE(copy->pMembers, &first);
    EXPECT_EQ(RAIDInfoDup(nullptr), nullptr);
}

TEST_F(Raid, InfoOfAnArray)
{
    const struct {
        int level;
        std::vector<int> states;  // of the members, as the kernel has them
        const char *action, *state;
    } rows[] = {{5, {6, 1, 0}, "recover", "clean"}, {5, {6, 2, 6}, "check", "clean"},
                {6, {6, 6, 6}, "resync", "clean"},  {0, {6, 1, 6}, "idle", "clean"},
                {0, {6, 6, 6}, "idle", "broken"},   {1, {6, 6, 4}, "reshape", "clean"}};
    for (const auto &row : rows) {
        calls_.OnIoctl(Put(row.level, 3, row.states));
        tree_.Put("/sys/block/md5/md/sync_action", row.action + std::string("\n"));
        tree_.Put("/sys/block/md5/md/array_state", row.state + std::string("\n"));
        RAIDINFO *info = nullptr;
        story_.Head("level " + std::to_string(row.level) + ", " + row.action + ", " + row.state);
        TELL(RAIDInfoGet("/dev/md5", &info));
        story_.Show("array", Text(*info));
        TELL(RAIDDiskCount(info->pMembers, RAID_MEMBER_ACTIVE | RAID_MEMBER_SPARE));
        RAIDInfoFree(info);
    }
    RAIDInfoFree(nullptr);
}

// md5 whose second disk was pulled: neither a node nor its number is left, only md's name.
TEST_F(Raid, AMemberWithoutANodeHasTheNameThatMdKeeps)
{
    calls_.OnIoctl(Put(5, 3, {6, 1, 6}));
    for (const char *name : {"sda3", "sdb3", "sdc3"})
        tree_.Put(std::string("/sys/block/md5/md/dev-") + name + "/state", "in_sync\n");
    tree_.Remove("/sys/dev/block/8:19");
    EXPECT_STREQ(Get()->pMembers->pNext->szPath, "/dev/sdb3");
    // A number that says nothing about the name: the name that no other member has.
    calls_.OnIoctl(FakeArray(5, 3, {{0, 8, 3, 6}, {1, 259, 7, 1}, {2, 8, 35, 6}}));
    EXPECT_STREQ(Get()->pMembers->pNext->szPath, "/dev/sdb3");
    calls_.OnIoctl(FakeArray(5, 3, {{0, 259, 7, 1}}));
    tree_.Remove("/sys/block/md5/md");
    EXPECT_STREQ(Get()->pMembers->szPath, "/dev/block/259:7");
    EXPECT_EQ(log_.Take(), "");
}

TEST_F(Raid, InfoOfNoArray)
{
    RAIDINFO *info = nullptr;
    TELL(RAIDInfoGet("/dev/md7", &info));
    FakeArray array = Put();
    for (const int error : {ENODEV, EIO}) {
        array.error = error;
        calls_.OnIoctl(array);
        TELL(RAIDInfoGet("/dev/md5", &info));
    }
    calls_.OnIoctl(FakeArray(4, 3, {}));
    TELL(RAIDInfoGet("/dev/md5", &info));
    EXPECT_EQ(info, nullptr);
}

TEST_F(Raid, EnumByNumber)
{
    calls_.OnIoctl(Put());
    for (const std::string name : {"md10", "md2", "md_d1", "md7"})
        tree_.Put("/sys/block/" + name + "/md/array_state", name == "md7" ? "clear\n" : "clean\n");
    PutNodes({"md10"});
    List paths = MakeList({});
    TELL(test::Moving(paths, RAIDPathEnum));
    story_.Show("paths", test::Items(paths.get()));
    RAIDLIST *list = nullptr;
    TELL(RAIDInfoEnum(&list));  // md2 has no node
    TELL(RAIDListCount(list));
    RAIDINFO *found = nullptr;
    TELL(RAIDListSearch(list, "/dev/md10", &found));
    story_.Show("number", found->nArray);
    TELL(RAIDListSearch(list, "/dev/md2", &found));
    RAIDListFree(list);
    calls_.OnIoctl(FakeArray(4, 3, {}));
    TELL(RAIDInfoEnum(&list));
    EXPECT_EQ(list, nullptr);
}

TEST_F(Raid, RequestsOfTheAppliancesDriver)
{
    const struct {
        int state;
        int64_t done;
        int error;
    } rows[] = {{0, 5, 0}, {1, 5, 0}, {1, 0, 0}, {2, 5, 0}, {3, 5, 0}, {0, 5, ENODEV}, {0, 5, ENOTTY}};
    for (const auto &row : rows) {
        calls_.OnIoctl([&](int, unsigned long request, void *argument) {
            const RAIDPROGRESS answer = {row.state, row.done, int64_t{1} << 40};
            EXPECT_TRUE(request == 0x80040961u || request == 0x80140960u) << request;
            std::memcpy(argument, &answer, request == 0x80040961u ? 4 : 20);
            errno = row.error;
            return row.error ? -1 : 0;
        });
        story_.Head("state " + std::to_string(row.state) + ", errno " + std::to_string(row.error));
        int status = -9;
        TELL(RAIDIoctlStatus(0, &status));
        story_.Show("status", status);
        RAIDPROGRESS progress = {};
        TELL(RAIDRebuildStatusGet(0, &progress));
        story_.Show("state", progress.nState);
        story_.Show("done", int64_t{progress.cDone});
        story_.Show("of", int64_t{progress.cSector});
    }
}

TEST_F(Raid, WaitsForTheRebuild)
{
    FakeArray array = Put(5, 3, {6, 6, 0});
    tree_.Put("/sys/block/md5/md/sync_action", "recover\n");
    int asked = 0;
    calls_.OnIoctl([&](int fd, unsigned long request, void *argument) {
        if (request == GET_ARRAY_INFO && ++asked == 4) {
            array.disks[2].state = 6;
            tree_.Put("/sys/block/md5/md/sync_action", "idle\n");
        }
        return array(fd, request, argument);
    });
    TELL(RAIDRebuildingWait("/dev/md5"));
    calls_.OnIoctl(Put(5, 3, {6, 6, 0}));
    TELL(RAIDRebuildingWait("/dev/md5"));  // all members are there and nothing happens
    TELL(RAIDRebuildingWait("/dev/md7"));
    const List paths = MakeList({"/dev/md7", "/dev/md5"});
    TELL(RAIDRebuildingMultiWait(paths.get()));
}

TEST_F(Raid, Superblocks)
{
    commands_.Print({{"/sbin/mdadm -E /dev/sda3 2>/dev/null", superblock_},
                     {"/sbin/mdadm -E /dev/sdb 2>/dev/null", "Name : nas:101\n"},
                     {"/sbin/mdadm -E /dev/sdc 2>/dev/null", "Name : nas:100\n"}},
                    1);
    RAIDSUPERBLOCK superblock;
    for (const char *path : {"/dev/sda3", "/dev/sdd"}) {
        TELL(RAIDSBGet(path, &superblock));
        story_.Show("array", superblock.szArray);
        story_.Show("events", superblock.nEvent);
    }
    const List members = MakeList({"/dev/sdd", "/dev/sda3", "/dev/sdb"});
    RAIDSBENTRY *entries = nullptr;
    TELL(RAIDSBEnum(members.get(), &entries));
    story_.Show("member", entries->szMember);
    std::free(entries);
    TELL(RAIDSBEnum(MakeList({"/dev/sdd"}).get(), &entries));
    EXPECT_EQ(entries, nullptr);
    for (const char *disk : {"/dev/sda", "/dev/sdb", "/dev/sdc", "/dev/sdd"}) {
        int array = -9;
        TELL(RAIDDiskIsUsedByRAID(disk, &array));
        story_.Show("array", array);
    }
    calls_.OnIoctl(Put());
    for (const int size : {64, 36, 35, 1}) {
        char uuid[64] = "?";
        TELL(RAIDUUIDGet("/dev/md5", uuid, size));
        story_.Show("UUID", uuid);
    }
    for (const std::string bad :
         {" Version : 1", " Version : 1.x", " Device Role : Journal", " Device Role : Active device x", "this is"}) {
        commands_.Print({{"/sbin/mdadm -E /dev/sde 2>/dev/null", "Name : nas:7\n" + bad + "\nEvents : 5\n"}});
        TELL(RAIDSBGet("/dev/sde", &superblock));
        story_.Show("array", superblock.szArray);
        story_.Show("events", superblock.nEvent);
    }
    commands_.Exit(-9);
    story_.Mask("errno=[A-Z][a-z ]*", "errno=...");  // of an earlier call
    TELL(RAIDSBGet("/dev/sda3", &superblock));
    TELL(RAIDSBEnum(members.get(), &entries));
    TELL(RAIDDiskIsUsedByRAID("/dev/sda", nullptr));
}

TEST_F(Raid, CleansTheMembersOfOneArrayAlone)
{
    commands_.Print({{"/bin/grep sd /proc/partitions",
                      "   8        0      98304 sda\n   8        3      76800 sda3\n   8       16      98304 sdb\n"
                      "   8       17       1 sdb;x\n   9  1 5 mdsd\n"},
                     {"/sbin/mdadm -E /dev/sda3 2>/dev/null", superblock_},
                     {"/sbin/mdadm -E /dev/sdb 2>/dev/null", std::string(test::Capture("mdadm_E_1.2-mdadm-4.2"))},
                     {Quiet("/sbin/mdadm --zero-superblock /dev/sda3"), ""}},
                    1);
    TELL(RAIDSBCleanByUUID(nullptr, "b7e9ed0e:bf1ea758:5bf5fba6:7c359649"));
    // Every disk without a superblock has the empty UUID.
    for (const char *none : {"", "b7e9ed0e", "b7e9ed0e:bf1ea758:5bf5fba6:7c35964",
                             "b7e9ed0e-bf1ea758-5bf5fba6-7c359649", "b7e9ed0e:bf1ea758:5bf5fba6:7c359648"})
        TELL(RAIDSBCleanByUUID(nullptr, none));
    TELL(RAIDSBCleanByUUID(nullptr, "495E879A:4e806313:a484c744:9c844bd2"));  // mdadm fails on sdb
}

TEST_F(Raid, CreateRunsExactlyTheseCommands)
{
    const RAIDVERSION old = {0, 90};
    const struct {
        int level, spare, slots;
        const RAIDVERSION *version;
        uint64_t bytes;
        int sync;
        const char *limit;
        std::vector<std::string> members;
    } rows[] = {
        {4, 1, 3, nullptr, 0, 1, "", {"/dev/sda3", "/dev/sdb3", "/dev/sdc3", "/dev/sdd3"}},
        {4, 0, 4, nullptr, 1 << 20, 0, "raidsizelimit=7\n", {"/dev/sda3", "/dev/sdb3", "/dev/sdc3"}},
        {2, 0, 1, &old, 0, 1, "raidsizelimit=7\n", {"/dev/sda1"}},
        {8, 0, 5, nullptr, 0, 1, "", {"/dev/sda", "/dev/sdb", "/dev/sdc"}},
        {1, 0, 2, nullptr, 0, 0, "", {"/dev/sda3", "/dev/sdb3"}},
        {32, 0, 1, nullptr, 0, 0, "", {"/dev/sda3"}},
        {16, 0, 2, nullptr, 0, 0, "", {"/dev/sda3", "/dev/sdb3"}},
    };
    for (const auto &row : rows) {
        Model(row.limit);
        const List members = MakeList(row.members);
        const RAIDREQUEST request = {"/dev/md2", row.version, row.level,     row.spare,
                                     row.slots,  row.bytes,   members.get(), row.sync};
        story_.Head("level " + std::to_string(row.level));
        TELL(RAIDCreate(&request));
    }
    log_.Clear();
    const List one = MakeList({"/dev/sda3"});
    const List three = MakeList({"/dev/sda3", "/dev/sdb3", "/dev/sdc3"});
    const struct {
        const char *path;
        int spare, slots;
        const List &members;
        int line;
    } refused[] = {{nullptr, 0, 1, one, 47},    {"/dev/md2", -1, 1, one, 47}, {"/dev/md2", 0, 0, one, 47},
                   {"/dev/sda", 0, 1, one, 47}, {"/dev/md2", 1, 1, one, 54},  {"/dev/md2", 0, 2, three, 54}};
    for (const auto &row : refused) {
        const RAIDREQUEST request = {row.path, nullptr, 2, row.spare, row.slots, 0, row.members.get(), 1};
        EXPECT_EQ(RAIDCreate(&request), -1);
        EXPECT_EQ(log_.Texts().back(), "raid_create:" + std::to_string(row.line) + " Bad parameters");
    }
    // A longer command would be cut.
    RAIDREQUEST request = {"/dev/md2", nullptr, 2, 0, 200, 0, three.get(), 1};
    EXPECT_EQ(RAIDCreate(&request), -1);
    EXPECT_THAT(log_.Texts().back(), testing::StartsWith("raid_create:124 Failed to do '/sbin/mdadm -C /dev/md2"));
    EXPECT_THAT(commands_.Take(), testing::IsEmpty());
    request.nSlot = 3;
    commands_.Exit(1);
    TELL(RAIDCreate(&request));
    request.fLevel = 3;
    TELL(RAIDCreate(&request));
}

TEST_F(Raid, ChangesRunExactlyTheseCommands)
{
    tree_.Put("/sys/block/md5/md/stripe_cache_size", "256\n");
    const RAIDINFO raid5 = Record(RAID_LEVEL_5);
    const RAIDINFO linear = Record(RAID_LEVEL_LINEAR);
    const RAIDINFO stripes = Record(RAID_LEVEL_0);
    RAIDMEMBER second = {"/dev/sdb3", 1, nullptr};
    RAIDMEMBER first = {"/dev/sda3", 1, &second};
    const RAIDINFO members = Record(RAID_LEVEL_5, &first);
    for (const int status : {0, 2, -9}) {
        commands_.Exit(status);
        story_.Head("the commands end with " + std::to_string(status));
        TELL(RAIDAdd(&raid5, "/dev/sdd3"));
        TELL(RAIDAdd(&linear, "/dev/sdd3"));
        TELL(RAIDAdd(&stripes, "/dev/sdd3"));
        TELL(RAIDRemoveDisk(&raid5, "/dev/sdd3"));
        TELL(RAIDDevCountChange(&raid5, 5));
        TELL(RAIDStop("/dev/md5"));
        TELL(RAIDAssemble("/dev/md5", "b7e9ed0e:bf1ea758:5bf5fba6:7c359649"));
        TELL(RAIDAssembleByInfo(&members));
        TELL(RAIDSBClean("/dev/sdd3"));
        TELL(TAVORAIDMdStripeCacheSizeSet("/dev/md5", 512));
        TELL(TAVORAIDMdStripeCacheSizeSet("/dev/md6", 512));  // an array without such a cache
        TELL(RAIDBadSectorRemap("/dev/md5", 3));
        TELL(RAIDBadSectorRemap("/dev/md5", 0));
    }
}

TEST_F(Raid, RemovesAMemberForGood)
{
    const RAIDINFO info = Record(RAID_LEVEL_5);
    tree_.Put("/sys/block/md5/md/dev-sdd3/state", "faulty\n");
    PutNodes({"sdd3"});
    TELL(RAIDRemoveDisk(&info, "/dev/sdd3"));  // it is still there
    // Pulled: mdadm finds it by the kernel's name alone.
    tree_.Remove("/dev/sdd3");
    const std::string held = tree_.Place("/sys/block/md5/md/dev-sdd3");
    commands_.OnCommand([&](const std::string &command) {
        if (command == Quiet("/sbin/mdadm --remove /dev/md5 sdd3"))
            std::filesystem::remove_all(held);
        return CommandReply{command == Quiet("/sbin/mdadm --remove /dev/md5 /dev/sdd3")};
    });
    TELL(RAIDRemoveDisk(&info, "/dev/sdd3"));
    // Pulled while nothing was written: md does not know yet.
    tree_.Put("/sys/block/md5/md/dev-sdd3/state", "in_sync\n");
    TELL(RAIDRemoveDisk(&info, "/dev/sdd3"));
}

// A member whose superblock is read, and what is done with the array.
TEST_F(Raid, AssemblesWhatIsLeftOfTheMembers)
{
    const std::string all = Quiet("/sbin/mdadm -A /dev/md5 /dev/sda3 /dev/sdb3 /dev/sdc3");
    RAIDMEMBER members[] = {{"/dev/sda3", 1, &members[1]}, {"/dev/sdb3", 1, &members[2]}, {"/dev/sdc3", 1, nullptr}};
    RAIDINFO info = Record(RAID_LEVEL_5, members);
    info.nSlot = 3;
    const struct {
        std::string there;  // disks with a node
        std::string named;  // those with a superblock of this array
        const char *state;  // of the array after the first try
        int third;          // state of sdc3
    } rows[] = {{"ab", "ab", "clear", 1},   {"abc", "ab", "inactive", 1}, {"abc", "abc", "clear", 2},
                {"abc", "abc", "clear", 1}, {"ac", "ac", "clear", 2},     {"a", "a", "inactive", 1},
                {"", "", "clear", 1}};
    for (const auto &row : rows) {
        for (const char letter : {'a', 'b', 'c'})
            tree_.Remove(std::string("/dev/sd") + letter + "3");
        for (const char letter : row.there)
            tree_.Put(std::string("/dev/sd") + letter + "3", "");
        tree_.Put("/sys/block/md5/md/array_state", row.state + std::string("\n"));
        members[2].nState = row.third;
        commands_.OnCommand([&](const std::string &command) -> CommandReply {
            for (const char letter : row.named) {
                if (command == std::string("/sbin/mdadm -E /dev/sd") + letter + "3 2>/dev/null")
                    return {0, superblock_};
            }
            return {command == all};
        });
        story_.Head("there are " + row.there + ", with superblocks " + row.named + ", then it is " + row.state);
        TELL(RAIDAssembleByInfo(&info));
    }
}

// The kernel has started them for reading only: a rebuild waits for the first write, and so do readers of a reshape.
TEST_F(Raid, WhatWasInterruptedGoesOn)
{
    RAIDMEMBER member = {"/dev/sda3", 1, nullptr};
    const RAIDINFO info = Record(RAID_LEVEL_5, &member);
    const struct {
        const char *state, *reshape, *resync, *degraded, *member;
    } rows[] = {
        {"read-auto", "30720", "none", "0", "in_sync"}, {"read-auto", "none", "none", "1", "spare"},
        {"read-auto", "none", "2048", "0", "in_sync"},  {"read-auto", "none", "none", "0", "spare"},
        {"read-auto", "none", "none", "1", "in_sync"},  // a pulled disk may come back
        {"read-auto", "none", "0", "", "in_sync"},      // without redundancy
        {"clean", "30720", "none", "1", "spare"},
    };
    for (const auto &row : rows) {
        const std::string folder = "/sys/block/md5/md/";
        tree_.Put(folder + "array_state", row.state + std::string("\n"));
        tree_.Put(folder + "reshape_position", row.reshape + std::string("\n"));
        tree_.Put(folder + "resync_start", row.resync + std::string("\n"));
        tree_.Put(folder + "degraded", row.degraded + std::string("\n"));
        tree_.Put(folder + "dev-sda3/state", row.member + std::string("\n"));
        story_.Head(row.state + std::string(", reshape at ") + row.reshape + ", resync at " + row.resync +
                    ", degraded '" + row.degraded + "', its member " + row.member);
        TELL(RAIDAssemble("/dev/md5", "b7e9ed0e:bf1ea758:5bf5fba6:7c359649"));
        TELL(RAIDAssembleByInfo(&info));
    }
}

// mdadm changes a RAID 6 that was a RAID 5 only with the option that keeps the parity where it is.
TEST_F(Raid, SlotsOfAMigratedArray)
{
    const RAIDINFO info = Record(RAID_LEVEL_6);
    const std::string stated = "/sbin/mdadm --grow /dev/md5 -n 5 >/dev/null 2>&1\n";
    const std::pair<const char *, const char *> rows[] = {{"raid6", "18"}, {"raid6", "2"}, {"raid10", "258"}};
    for (const auto &row : rows) {
        tree_.Put("/sys/block/md5/md/level", row.first + std::string("\n"));
        tree_.Put("/sys/block/md5/md/layout", row.second + std::string("\n"));
        for (const bool refused : {true, false}) {
            commands_.OnCommand([&](const std::string &command) {
                return CommandReply{refused && command == stated, ""};
            });
            story_.Head(row.first + std::string(" with layout ") + row.second + (refused ? ", refused" : ""));
            TELL(RAIDDevCountChange(&info, 5));
        }
    }
}

TEST_F(Raid, AddsOnlyMembersThatAreLargeEnough)
{
    RAIDINFO info = Record(RAID_LEVEL_5);
    info.cbMember = 1000 * 512 - 255;  // with the rounding 1000 sectors
    PutNodes({"sdd3"});
    tree_.AddAbsent("/dev/sde3");
    const struct {
        const char *member;
        uint64_t sectors;
        int status;
    } rows[] = {{"/dev/sdd3", 999, 0},
                {"/dev/sdd3", 1000, 0},
                {"/dev/sde3", 0, 0},
                {"/dev/sdf3", 0, 0},
                {"/dev/sdd3", 1000, 1}};
    for (const auto &row : rows) {
        Size(row.sectors * 512);
        commands_.Exit(row.status);
        story_.Head(row.member + std::string(" of ") + std::to_string(row.sectors));
        TELL(RAIDAddRobustCheck(&info, row.member));
    }
}

TEST_F(Raid, RoomToGrow)
{
    Size(uint64_t{8} << 30);
    RAIDMEMBER pulled = {"/dev/sdb3", 8, nullptr};
    RAIDMEMBER member = {"/dev/sda3", 1, &pulled};
    PutNodes({"sda3"});
    const uint64_t kib = (8 << 20) - 1024;
    const struct {
        int level;
        uint64_t member_kib;
        const char *limit;
    } rows[] = {{4, kib - 1, ""}, {4, kib, ""}, {8, 5, ""}, {2, 5, "raidsizelimit=2048\n"}, {1, 5, ""}, {16, 5, ""}};
    RAIDINFO info = {};
    const auto ask = [&] {
        uint64_t found = 0;
        TELL(RAIDExpansible(&info, &found));
        story_.Show("KiB of a member", found);
        TELL(RAIDSizeUnallocGet(&info, &found));
        story_.Show("bytes", found);
    };
    for (const auto &row : rows) {
        Model(row.limit);
        info = Record(row.level, &member);
        info.cbArray = 77;
        info.cbMember = row.member_kib * 1024;
        story_.Head("level " + std::to_string(row.level) + " of " + std::to_string(row.member_kib) + " KiB, '" +
                    row.limit + "'");
        ask();
    }
    info.fLevel = RAID_LEVEL_5;
    calls_.OnIoctl([](int, unsigned long, void *) {
        errno = EIO;
        return -1;
    });
    ask();
}

TEST_F(Raid, StripesAndTuning)
{
    const std::pair<int, int> rows[] = {{5, 4}, {6, 4}, {0, 4}, {1, 4}, {-1, 4}, {10, 4}};
    for (const auto &row : rows) {
        calls_.OnIoctl(Put(row.first, row.second));
        tree_.Put("/sys/block/md5/md/stripe_cache_size", "256\n");
        story_.Head("level " + std::to_string(row.first));
        TELL(RAIDMdStripeSizeGet("/dev/md5"));
        TELL(TAVORAIDMdTuningPerformance("/dev/md5"));
    }
    TELL(TAVORAIDMdTuningPerformance(nullptr));
}

TEST_F(Raid, MigratesToRaid6)
{
    calls_.OnIoctl(Put(6, 3));
    const RAIDINFO info = Record(RAID_LEVEL_5);
    const List two = MakeList({"/dev/sdd3", "/dev/sde3"});
    const List one = MakeList({"/dev/sdd3"});
    TELL(RAIDMigrate2RAID6(&info, two.get()));
    TELL(RAIDMigrate2RAID6(&info, one.get()));
    for (const char *failing : {"echo raid6", "-a /dev/sdd3", "-a /dev/sde3", "--grow"}) {
        commands_.Fail(failing);
        story_.Head(failing + std::string(" fails"));
        TELL(RAIDMigrate2RAID6(&info, two.get()));
    }
    commands_.Exit(0);
    calls_.OnIoctl(Put(6, 3, {6, 6, 1}));
    TELL(RAIDMigrate2RAID6(&info, two.get()));  // it is not rebuilt
    // The level cannot be changed back.
    PutNodes({"sde3"});
    Size(info.cbMember - 512);
    TELL(RAIDMigrate2RAID6(&info, two.get()));
    tree_.AddBusy("/dev/sdd3");
    TELL(RAIDMigrate2RAID6(&info, one.get()));
    const RAIDINFO mirror = Record(RAID_LEVEL_1);
    TELL(RAIDMigrate2RAID6(&mirror, one.get()));
}

// md5 of sda3, sdb3 (pulled) and sdc3, whose disks have the current layout; the new disk is sdd.
class RaidReplace : public Raid {
  protected:
    RaidReplace() : Raid(" -[El] ")
    {
        Model("supportraid=yes\n");
        PutNodes({"sda3", "sdc3", "sdd", "sdd3"});
        tree_.Put("/sys/block/md5/md/dev-sda3/offset", "2048\n");
        info_.nSlot = 3;
        info_.cbMember = uint64_t{4000000} * 512;
        Size((9437184 + 2048 + 4000000) * uint64_t{512});
        LayOut("ac");
        commands_.OnCommand([this](const std::string &command) -> CommandReply {
            if (const auto found = outputs_.find(command); found != outputs_.end())
                return {0, found->second};
            return {command.find("sfdisk -l") != command.npos ||
                    (!fails_.empty() && command.find(fails_) != command.npos)};
        });
    }

    // These disks alone have partitions, the others of an older version.
    void LayOut(const std::string &disks, const std::string &others = "")
    {
        outputs_.clear();
        for (const char disk : disks + others) {
            const TAVOPARTLAYOUT &layout = grgAllTavoPartLayout[others.find(disk) == others.npos ? 9 : 8];
            const TAVOPARTPLACE places[] = {layout.place1, layout.place2, {9437184, 5000000, 0xFD}};
            for (const int i : {0, 1, 2})
                outputs_["/sbin/sfdisk -l -uS -N" + std::to_string(i + 1) + " /dev/sd" + disk] =
                    "/dev/x " + std::to_string(places[i].nStart) + " 0 " + std::to_string(places[i].cSector) +
                    " fd x\n";
        }
    }

    std::map<std::string, std::string> outputs_;
    std::string fails_;
    RAIDMEMBER members_[3] = {
        {"/dev/sda3", 1, &members_[1]}, {"/dev/sdb3", 1, &members_[2]}, {"/dev/sdc3", 1, nullptr}};
    RAIDINFO info_ = Record(RAID_LEVEL_5, members_);
};

TEST_F(RaidReplace, PartitionsAndAddsTheNewDisk)
{
    TELL(RAIDReplaceDisk(&info_, "/dev/sdb3", "/dev/sdd"));
    TELL(RAIDReplaceDisk(&info_, nullptr, "/dev/sdd"));
    // A free slot; the disk has its partitions, and an old superblock in the third.
    members_[1] = members_[2];
    LayOut("acd");
    outputs_["/sbin/mdadm -E /dev/sdd3 2>/dev/null"] = superblock_;
    TELL(RAIDReplaceDisk(&info_, nullptr, "/dev/sdd"));
    LayOut("ac", "d");
    TELL(RAIDReplaceDisk(&info_, nullptr, "/dev/sdd"));
    // Disks of more than 2^32 sectors end with a copy of their table.
    LayOut("ac");
    for (const uint64_t beyond : {0, 1}) {
        for (const uint64_t more : {0, 1}) {
            const uint64_t sectors = (uint64_t{1} << 32) + beyond;
            Size(sectors * 512);
            info_.cbMember = (sectors - 9437184 - 33 * beyond - 2048 + more) * 512;
            TELL(RAIDReplaceDisk(&info_, nullptr, "/dev/sdd"));
        }
    }
    // An array of the first partitions.
    for (RAIDMEMBER &member : members_)
        *std::strchr(member.szPath, '3') = '1';
    PutNodes({"sda1", "sdc1", "sdd1"});
    info_.cbMember = uint64_t{4000000} * 512;
    TELL(RAIDReplaceDisk(&info_, nullptr, "/dev/sdd"));
    info_.cbMember = uint64_t{4980480 - 1} * 512;
    TELL(RAIDReplaceDisk(&info_, nullptr, "/dev/sdd"));
}

TEST_F(RaidReplace, AnArrayOfWholeDisks)
{
    RAIDMEMBER second = {"/dev/sdb", RAID_MEMBER_FAILED, nullptr};
    RAIDMEMBER first = {"/dev/sdc", 1, &second};
    info_.pMembers = &first;
    info_.nSlot = 2;
    PutNodes({"sdc"});
    TELL(RAIDReplaceDisk(&info_, nullptr, "/dev/sdd"));
}

TEST_F(RaidReplace, RefusesBeforeTheFirstChange)
{
    TELL(RAIDReplaceDisk(&info_, "/dev/sda3", "/dev/sdd"));
    TELL(RAIDReplaceDisk(&info_, "/dev/sde3", "/dev/sdd"));
    Size((9437184 + 2048 + 4000000 - 1) * uint64_t{512});
    TELL(RAIDReplaceDisk(&info_, nullptr, "/dev/sdd"));
    Size(uint64_t{1} << 49);
    tree_.Put("/sys/class/block/sdd1/holders/md0", "");
    TELL(RAIDReplaceDisk(&info_, nullptr, "/dev/sdd"));
    tree_.Remove("/sys/class/block");
    LayOut("c");
    TELL(RAIDReplaceDisk(&info_, nullptr, "/dev/sdd"));
    LayOut("ac");
    tree_.Remove("/dev/sdc3");
    TELL(RAIDReplaceDisk(&info_, nullptr, "/dev/sdd"));
    tree_.Remove("/dev/sda3");
    TELL(RAIDReplaceDisk(&info_, "/dev/sdb3", "/dev/sdd"));
    PutNodes({"sda3", "sdb3", "sdc3"});
    TELL(RAIDReplaceDisk(&info_, nullptr, "/dev/sdd"));
    for (const char *disk : {"/dev/sdd3", "sdd", "/dev/sd d", ""})
        TELL(RAIDReplaceDisk(&info_, nullptr, disk));
    info_.fLevel = RAID_LEVEL_0;
    TELL(RAIDReplaceDisk(&info_, nullptr, "/dev/sdd"));
}

TEST_F(RaidReplace, StopsAtTheFirstFailure)
{
    fails_ = "/sbin/sfdisk -N1";
    TELL(RAIDReplaceDisk(&info_, nullptr, "/dev/sdd"));
    // md does not let go of it.
    fails_ = "/sbin/mdadm /dev/md5 -r";
    tree_.Put("/sys/block/md5/md/dev-sdb3/state", "faulty\n");
    TELL(RAIDReplaceDisk(&info_, nullptr, "/dev/sdd"));
    tree_.Remove("/sys/block/md5/md/dev-sdb3");
    fails_ = "/sbin/mdadm /dev/md5 -a";
    TELL(RAIDReplaceDisk(&info_, nullptr, "/dev/sdd"));
}

TEST_F(Raid, RemoveStopsAndCleans)
{
    calls_.OnIoctl(Put());
    commands_.Print({{"/bin/grep sd /proc/partitions", "   8        3      76800 sda3\n"},
                     {"/sbin/mdadm -E /dev/sda3 2>/dev/null", superblock_}});
    const List paths = MakeList({"/dev/md9", "/dev/md5"});
    TELL(RAIDRemoveMultiple(paths.get()));
    commands_.Fail("-S");
    TELL(RAIDRemoveMultiple(paths.get()));
}

}  // namespace
