// Arrays: read from the driver and the kernel's files, changed by exactly these commands.
#include "tavo_partition.h"
#include "tavo_raid.h"

#include "storage/storage_scene.h"

#include <gmock/gmock.h>

#include <cerrno>
#include <cstdlib>
#include <cstring>
#include <filesystem>
#include <functional>
#include <iterator>
#include <map>
#include <memory>
#include <sstream>

#include <linux/fs.h>
#include <linux/major.h>
#include <linux/raid/md_u.h>
#include <syslog.h>

using test::CommandReply;
using test::List;
using test::MakeList;
using test::Quiet;
using testing::ElementsAre;
using testing::IsEmpty;

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

class Raid : public test::StorageScene {
  protected:
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
    // The commands that change something, since the last ones were taken.
    std::vector<std::string> Changes()
    {
        std::vector<std::string> changes = commands_.Take();
        std::erase_if(changes, [](const std::string &command) {
            return command.find(" -E ") != command.npos || command.find(" -l ") != command.npos;
        });
        return changes;
    }

    const std::string superblock_{test::Capture("mdadm_E_1.2_raid5-mdadm-4.2")};
};

TEST_F(Raid, StatusDecide)
{
    struct Case {
        int level, slots;
        const char *states;  // of the members
    };
    const std::pair<int, std::vector<Case>> rows[] = {
        {RAID_STATUS_NORMAL, {{5, 4, "1111"}, {5, 3, "1111"}, {0, 2, "11"}, {-1, 2, "11"}}},
        {RAID_STATUS_DEGRADED,
         {{5, 4, "111"}, {5, 4, "1112"}, {5, 4, "1113"}, {5, 4, "1115"}, {6, 4, "11"}, {1, 4, "1"}, {10, 4, "11"}}},
        {RAID_STATUS_CRASHED,
         {{5, 4, "1188"},
          {5, 4, "11114"},
          {5, 4, ""},
          {6, 4, "1"},
          {1, 2, "22"},
          {10, 4, "1"},
          {0, 2, "1"},
          {-1, 2, "14"}}},
    };
    mdu_array_info_t array = {};
    for (const auto &[expected, cases] : rows) {
        for (const Case &row : cases) {
            std::vector<RAIDMEMBER> members(std::strlen(row.states) + 1);
            for (size_t i = 0; row.states[i]; ++i) {
                members[i].nState = row.states[i] - '0';
                members[i].pNext = row.states[i + 1] ? &members[i + 1] : nullptr;
            }
            array.level = row.level;
            array.raid_disks = row.slots;
            int status = 0;
            EXPECT_EQ(RAIDStatusDecide(&array, *row.states ? members.data() : nullptr, &status), 0);
            EXPECT_EQ(status, expected) << row.level << " of " << row.slots << ": " << row.states;
        }
    }
    EXPECT_EQ(log_.Take(), "");
    array.level = 4;
    int status = 7;
    EXPECT_EQ(RAIDStatusDecide(&array, nullptr, &status), -1);
    EXPECT_EQ(status, 7);
    EXPECT_EQ(log_.Take(), "raid_status_decide:# unknown raid level: 4");
}

TEST_F(Raid, ParityDiskCount)
{
    const struct {
        int level, disks, parity;
    } rows[] = {{1, 4, 0}, {2, 4, 3}, {4, 4, 1}, {8, 4, 2}, {16, 4, 2}, {16, 5, 2}, {32, 4, 0}, {0, 4, -1}, {3, 4, -1}};
    for (const auto &row : rows)
        EXPECT_EQ(RAIDParityDiskCount(row.level, row.disks), row.parity) << row.level;
    EXPECT_EQ(log_.Lines().at(0).priority, LOG_DEBUG);
    EXPECT_EQ(log_.Take(), "raid_parity_disk_count:# bad parameters: unknown raid level='0'\n"
                           "raid_parity_disk_count:# bad parameters: unknown raid level='3'");
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
    calls_.OnIoctl(Put(5, 3, {6, 1, 0}));
    tree_.Put("/sys/block/md5/md/sync_action", "recover\n");
    const Info info = Get();
    ASSERT_TRUE(info);
    // Of level 5, crashed, as one of three is in sync; active, failed and spare members.
    EXPECT_EQ(Text(*info), "5 /dev/md5 level 4 status 3/1 bytes 155189248/77594624 slots 3/2/1 "
                           "/dev/sda3:1 /dev/sdb3:8 /dev/sdc3:2");
    EXPECT_EQ(RAIDDiskCount(info->pMembers, RAID_MEMBER_ACTIVE | RAID_MEMBER_SPARE), 2);

    calls_.OnIoctl(Put(0, 3));
    tree_.Put("/sys/block/md5/md/array_state", "broken\n");
    EXPECT_EQ(Get()->nStatus, RAID_STATUS_CRASHED) << "its members keep their states";
    EXPECT_EQ(log_.Take(), "");
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
    EXPECT_EQ(RAIDInfoGet("/dev/md7", &info), 0);
    FakeArray array = Put();
    array.error = ENODEV;
    calls_.OnIoctl(array);
    EXPECT_EQ(RAIDInfoGet("/dev/md5", &info), 0) << "a node without an array";
    EXPECT_EQ(log_.Take(), "");
    array.error = EIO;
    const struct {
        FakeArray array;
        const char *path;
        int code;
    } rows[] = {{array, "/dev/md5", ERR_SIZE_UNKNOWN},
                {{4, 3, {}}, "/dev/md5", ERR_UNKNOWN},
                {{4, 3, {}}, "/dev/sda", ERR_BAD_PARAMETERS}};
    for (const auto &row : rows) {
        calls_.OnIoctl(row.array);
        EXPECT_EQ(RAIDInfoGet(row.path, &info), -1);
        EXPECT_EQ(test::LastFault(), (test::Fault{row.code, "raid_info_get"}));
        EXPECT_EQ(info, nullptr);
    }
}

TEST_F(Raid, EnumByNumber)
{
    calls_.OnIoctl(Put());
    for (const std::string name : {"md10", "md2", "md_d1", "md7"})
        tree_.Put("/sys/block/" + name + "/md/array_state", name == "md7" ? "clear\n" : "clean\n");
    PutNodes({"md10"});
    List paths = MakeList({});
    EXPECT_EQ(test::Moving(paths, RAIDPathEnum), 3);
    EXPECT_THAT(test::Items(paths.get()), ElementsAre("/dev/md2", "/dev/md5", "/dev/md10"));
    RAIDLIST *list = nullptr;
    EXPECT_EQ(RAIDInfoEnum(&list), 2) << "md2 has no node";
    EXPECT_EQ(RAIDListCount(list), 2);
    RAIDINFO *found = nullptr;
    EXPECT_EQ(RAIDListSearch(list, "/dev/md10", &found), 1);
    EXPECT_EQ(found->nArray, 10);
    EXPECT_EQ(RAIDListSearch(list, "/dev/md2", &found), 0);
    EXPECT_EQ(log_.Take(), "raid_info_enum:# RAID not exist /dev/md2");
    RAIDListFree(list);
    calls_.OnIoctl(FakeArray(4, 3, {}));
    EXPECT_EQ(RAIDInfoEnum(&list), -1);
    EXPECT_EQ(list, nullptr);
    EXPECT_THAT(log_.Take(), testing::EndsWith("_enum:# Failed to get RAID information /dev/md5, errno=0X8000"));
}

TEST_F(Raid, RequestsOfTheAppliancesDriver)
{
    const struct {
        int answer, error, result, value, code;
    } rows[] = {{0, 0, 0, 1, 0},
                {1, 0, 0, 2, 0},
                {2, 0, 0, 3, 0},
                {3, 0, -1, -9, 0x8000},
                {0, ENODEV, -1, -9, 0x0600},
                {0, ENOTTY, -1, -9, 0x8000}};
    for (const auto &row : rows) {
        test::ForgetFault();
        calls_.OnIoctl([&](int, unsigned long request, void *argument) {
            EXPECT_EQ(request, 0x80040961u);
            *static_cast<int *>(argument) = row.answer;
            errno = row.error;
            return row.error ? -1 : 0;
        });
        int status = -9;
        EXPECT_EQ(RAIDIoctlStatus(0, &status), row.result);
        EXPECT_EQ(status, row.value);
        EXPECT_EQ(TLIBErrGet(), row.code);
    }
    const struct {
        int flag;
        int64_t done;
        int state;
    } progress_rows[] = {{0, 5, 0}, {1, 5, 1}, {1, 0, 2}};
    for (const auto &row : progress_rows) {
        calls_.OnIoctl([&](int, unsigned long request, void *argument) {
            EXPECT_EQ(request, 0x80140960u);
            const RAIDPROGRESS answer = {row.flag, row.done, int64_t{1} << 40};
            std::memcpy(argument, &answer, 20);
            return 0;
        });
        RAIDPROGRESS progress = {};
        EXPECT_EQ(RAIDRebuildStatusGet(0, &progress), 0);
        EXPECT_EQ(progress.nState, row.state);
        EXPECT_EQ(int64_t{progress.cDone}, row.done);
        EXPECT_EQ(int64_t{progress.cSector}, int64_t{1} << 40);
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
    EXPECT_EQ(RAIDRebuildingWait("/dev/md5"), 0);
    EXPECT_THAT(calls_.Take(), ElementsAre("sleep 30", "sleep 30", "sleep 30"));

    calls_.OnIoctl(Put(5, 3, {6, 6, 0}));
    EXPECT_EQ(RAIDRebuildingWait("/dev/md5"), -1) << "all members are there and nothing happens";
    EXPECT_EQ(calls_.Take().size(), 6u);
    EXPECT_EQ(log_.Take(), "raid_rebuilding_wait:# /dev/md5 build error, status is 2, rebuilding: 0");

    const List paths = MakeList({"/dev/md7", "/dev/md5"});
    test::ForgetFault();
    EXPECT_EQ(RAIDRebuildingMultiWait(paths.get()), -1);
    EXPECT_EQ(calls_.Take().size(), 4u);
    EXPECT_EQ(log_.Take(), "raid_rebuilding_wait:# Failed to get /dev/md7 info, error=[0x0], return=0, retry=5\n"
                           "raid_rebuilding_multi_wait:# Failed to wait RAID status: /dev/md7");
}

TEST_F(Raid, Superblocks)
{
    commands_.Print({{"/sbin/mdadm -E /dev/sda3 2>/dev/null", superblock_},
                     {"/sbin/mdadm -E /dev/sdb 2>/dev/null", "Name : nas:101\n"},
                     {"/sbin/mdadm -E /dev/sdc 2>/dev/null", "Name : nas:100\n"}},
                    1);
    RAIDSUPERBLOCK superblock;
    EXPECT_EQ(RAIDSBGet("/dev/sda3", &superblock), 1);
    EXPECT_STREQ(superblock.szArray, "/dev/md5");
    EXPECT_EQ(RAIDSBGet("/dev/sdd", &superblock), 0);
    EXPECT_STREQ(superblock.szArray, "");
    const List members = MakeList({"/dev/sdd", "/dev/sda3", "/dev/sdb"});
    RAIDSBENTRY *entries = nullptr;
    EXPECT_EQ(RAIDSBEnum(members.get(), &entries), 1);
    EXPECT_STREQ(entries->szMember, "/dev/sda3");
    std::free(entries);
    const struct {
        const char *disk;
        int used, array;
        size_t commands;
    } rows[] = {{"/dev/sda", 1, 5, 1}, {"/dev/sdb", 1, 101, 3}, {"/dev/sdc", 0, -9, 3}, {"/dev/sdd", 0, -9, 3}};
    for (const auto &row : rows) {
        commands_.Clear();
        int array = -9;
        EXPECT_EQ(RAIDDiskIsUsedByRAID(row.disk, &array), row.used) << row.disk;
        EXPECT_EQ(array, row.array);
        EXPECT_EQ(commands_.Commands().size(), row.commands);
    }
    EXPECT_THAT(commands_.Take(),
                ElementsAre("/sbin/mdadm -E /dev/sdd3 2>/dev/null", "/sbin/mdadm -E /dev/sdd5 2>/dev/null",
                            "/sbin/mdadm -E /dev/sdd 2>/dev/null"));
}

TEST_F(Raid, CleansTheMembersOfOneArrayAlone)
{
    const char *const uuid = "b7e9ed0e:bf1ea758:5bf5fba6:7c359649";
    commands_.Print({{"/bin/grep sd /proc/partitions",
                      "   8        0      98304 sda\n   8        3      76800 sda3\n   8       16      98304 sdb\n"
                      "   8       17       1 sdb;x\n   9  1 5 mdsd\n"},
                     {"/sbin/mdadm -E /dev/sda3 2>/dev/null", superblock_},
                     {"/sbin/mdadm -E /dev/sdb 2>/dev/null", std::string(test::Capture("mdadm_E_1.2-mdadm-4.2"))},
                     {Quiet("/sbin/mdadm --zero-superblock /dev/sda3"), ""}},
                    1);
    EXPECT_EQ(RAIDSBCleanByUUID(nullptr, uuid), 0);
    EXPECT_THAT(commands_.Take(),
                ElementsAre("/bin/grep sd /proc/partitions", "/sbin/mdadm -E /dev/sda 2>/dev/null",
                            "/sbin/mdadm -E /dev/sda3 2>/dev/null", Quiet("/sbin/mdadm --zero-superblock /dev/sda3"),
                            "/sbin/mdadm -E /dev/sdb 2>/dev/null"));
    EXPECT_EQ(log_.Take(), "raid_sb_clean_by_uuid:# [Info] Clean RAID superblock on '/dev/sda3'");
    for (const char *none : {"", "b7e9ed0e", "b7e9ed0e:bf1ea758:5bf5fba6:7c35964"})
        EXPECT_EQ(RAIDSBCleanByUUID(nullptr, none), -1) << none;
    EXPECT_THAT(commands_.Take(), IsEmpty()) << "every disk without a superblock has the empty UUID";
    EXPECT_EQ(RAIDSBCleanByUUID(nullptr, "495E879A:4e806313:a484c744:9c844bd2"), -1) << "mdadm fails on sdb";
    EXPECT_THAT(log_.Take(), testing::EndsWith("raid_sb_clean_by_uuid:# Failed to clean suerblock of '/dev/sdb'"));
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
        std::string words;  // of the command, after the array
    } rows[] = {
        {4, 1, 3, nullptr, 0, 1, "", "-e 1.1 -amd  -R -l5  -n3  -x1   /dev/sda3 /dev/sdb3 /dev/sdc3 /dev/sdd3"},
        {4, 0, 4, nullptr, 1 << 20, 0, "raidsizelimit=7\n",
         "-e 1.1 -amd --assume-clean -R -l5  -n4  -x0 -z 1024  /dev/sda3 /dev/sdb3 /dev/sdc3 missing"},
        {2, 0, 1, &old, 0, 1, "raidsizelimit=7\n", "-e 0.90 -amd  -R -l1 -f -n1  -x0 -z 7  /dev/sda1"},
        {8, 0, 5, nullptr, 0, 1, "", "-e 1.1 -amd  -R -l6  -n5  -x0   /dev/sda /dev/sdb /dev/sdc missing missing"},
        {1, 0, 2, nullptr, 0, 0, "", "-e 1.1 -amd  -R -l0  -n2     /dev/sda3 /dev/sdb3"},
        {32, 0, 1, nullptr, 0, 0, "", "-e 1.1 -amd  -R -llinear -f -n1     /dev/sda3"},
        {16, 0, 2, nullptr, 0, 0, "", "-e 1.1 -amd --assume-clean -R -l10  -n2 -pn2    /dev/sda3 /dev/sdb3"},
    };
    for (const auto &row : rows) {
        Model(row.limit);
        std::istringstream words(row.words);
        std::vector<std::string> paths = {std::istream_iterator<std::string>(words), {}};
        std::erase_if(paths, [](const std::string &word) { return !word.starts_with("/dev/"); });
        const List members = MakeList(paths);
        const RAIDREQUEST request = {"/dev/md2", row.version, row.level,     row.spare,
                                     row.slots,  row.bytes,   members.get(), row.sync};
        EXPECT_EQ(RAIDCreate(&request), 0);
        EXPECT_THAT(commands_.Take(), ElementsAre(Quiet("/sbin/mdadm -C /dev/md2 " + row.words)));
        const std::string untuned = "raid_md_tuning_performance:# Failed to get RAID information /dev/md2";
        const std::string alone =
            "\nraid_create:# [Info] /dev/md2 has one slot: it is normal, but loses everything with its disk";
        EXPECT_EQ(log_.Take(), untuned + (row.level == RAID_LEVEL_1 ? alone : ""));
    }
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
    const auto fails = [&] {
        EXPECT_THAT(log_.Texts().back(), testing::StartsWith("raid_create:124 Failed to do '/sbin/mdadm -C /dev/md2"));
    };
    RAIDREQUEST request = {"/dev/md2", nullptr, 2, 0, 200, 0, three.get(), 1};
    EXPECT_EQ(RAIDCreate(&request), -1) << "a longer command would be cut";
    fails();
    EXPECT_THAT(commands_.Take(), IsEmpty());
    log_.Take();
    request.nSlot = 3;
    commands_.Exit(1);
    EXPECT_EQ(RAIDCreate(&request), -1);
    fails();
}

TEST_F(Raid, ChangesRunExactlyTheseCommands)
{
    tree_.Put("/sys/block/md5/md/stripe_cache_size", "256\n");
    const RAIDINFO raid5 = Record(RAID_LEVEL_5);
    const RAIDINFO linear = Record(RAID_LEVEL_LINEAR);
    RAIDMEMBER second = {"/dev/sdb3", 1, nullptr};
    RAIDMEMBER first = {"/dev/sda3", 1, &second};
    const RAIDINFO members = Record(RAID_LEVEL_5, &first);
    const std::string uuid = "b7e9ed0e:bf1ea758:5bf5fba6:7c359649";
    const std::pair<std::function<int()>, std::string> rows[] = {
        {[&] { return RAIDAdd(&raid5, "/dev/sdd3"); }, Quiet("/sbin/mdadm /dev/md5 -a /dev/sdd3")},
        {[&] { return RAIDAdd(&linear, "/dev/sdd3"); }, Quiet("/sbin/mdadm --grow /dev/md5 -a /dev/sdd3")},
        {[&] { return RAIDRemoveDisk(&raid5, "/dev/sdd3"); }, Quiet("/sbin/mdadm /dev/md5 -r /dev/sdd3")},
        {[&] { return RAIDDevCountChange(&raid5, 5); }, "/sbin/mdadm --grow /dev/md5 -n 5 >/dev/null 2>&1\n"},
        {[&] { return RAIDStop("/dev/md5"); }, Quiet("/sbin/mdadm -S /dev/md5")},
        {[&] { return RAIDAssemble("/dev/md5", uuid.c_str()); }, Quiet("/sbin/mdadm -A /dev/md5 -u " + uuid)},
        {[&] { return RAIDAssembleByInfo(&members); }, Quiet("/sbin/mdadm -A /dev/md5 /dev/sda3 /dev/sdb3")},
        {[&] { return RAIDSBClean("/dev/sdd3"); }, Quiet("/sbin/mdadm --zero-superblock /dev/sdd3")},
        {[&] { return TAVORAIDMdStripeCacheSizeSet("/dev/md5", 512); },
         "/bin/echo 512 > /sys/block/md5/md/stripe_cache_size"},
        {[&] { return RAIDBadSectorRemap("/dev/md5", 3); }, "sysctl -w kernel.tavo_raid_sync_flag=1"},
    };
    for (const auto &[call, command] : rows) {
        commands_.Exit(0);
        EXPECT_EQ(call(), 0) << command;
        EXPECT_THAT(commands_.Take(), ElementsAre(command));
        EXPECT_THAT(log_.Lines(), IsEmpty());
        commands_.Exit(2);
        EXPECT_EQ(call(), -1) << command;
        EXPECT_EQ(log_.Lines().size(), 1u) << command;
        log_.Clear();
        commands_.Clear();
    }
    EXPECT_EQ(RAIDAdd(&raid5, "/dev/sdd3"), -1);
    const RAIDINFO stripes = Record(RAID_LEVEL_0);
    EXPECT_EQ(RAIDAdd(&stripes, "/dev/sdd3"), -1);
    EXPECT_EQ(log_.Take(), "raid_add:# Failed to add '/dev/sdd3' into '/dev/md5', WEXITSTATUS(err) = 2, err = 512\n"
                           "raid_add:# Bad raid level to add disk: 1");
    EXPECT_EQ(TAVORAIDMdStripeCacheSizeSet("/dev/md6", 512), 0) << "an array without such a cache";
}

TEST_F(Raid, RemovesAMemberForGood)
{
    const RAIDINFO info = Record(RAID_LEVEL_5);
    tree_.Put("/sys/block/md5/md/dev-sdd3/state", "faulty\n");
    PutNodes({"sdd3"});
    const std::string shortly = Quiet("/sbin/mdadm /dev/md5 -r /dev/sdd3");
    const std::string by_path = Quiet("/sbin/mdadm --remove /dev/md5 /dev/sdd3");
    const std::string by_name = Quiet("/sbin/mdadm --remove /dev/md5 sdd3");
    EXPECT_EQ(RAIDRemoveDisk(&info, "/dev/sdd3"), -1) << "it is still there";
    EXPECT_THAT(commands_.Take(), ElementsAre(shortly, by_path));

    // Pulled: mdadm finds it by the kernel's name alone.
    tree_.Remove("/dev/sdd3");
    const std::string held = tree_.Place("/sys/block/md5/md/dev-sdd3");
    commands_.OnCommand([&](const std::string &command) {
        if (command == by_name)
            std::filesystem::remove_all(held);
        return CommandReply{command == by_path};
    });
    EXPECT_EQ(RAIDRemoveDisk(&info, "/dev/sdd3"), 0);
    EXPECT_THAT(commands_.Take(), ElementsAre(shortly, by_path, by_name));

    // Pulled while nothing was written: md does not know yet.
    tree_.Put("/sys/block/md5/md/dev-sdd3/state", "in_sync\n");
    EXPECT_EQ(RAIDRemoveDisk(&info, "/dev/sdd3"), 0);
    EXPECT_THAT(commands_.Take(), ElementsAre(shortly, by_path, Quiet("/sbin/mdadm /dev/md5 -f sdd3"), by_name));
}

TEST_F(Raid, AssemblesWhatIsLeftOfTheMembers)
{
    const std::string all = Quiet("/sbin/mdadm -A /dev/md5 /dev/sda3 /dev/sdb3 /dev/sdc3");
    const std::string stop = Quiet("/sbin/mdadm -S /dev/md5");
    const std::string by_uuid = Quiet("/sbin/mdadm -A /dev/md5 -u b7e9ed0e:bf1ea758:5bf5fba6:7c359649");
    RAIDMEMBER members[] = {{"/dev/sda3", 1, &members[1]}, {"/dev/sdb3", 1, &members[2]}, {"/dev/sdc3", 1, nullptr}};
    RAIDINFO info = Record(RAID_LEVEL_5, members);
    info.nSlot = 3;
    const struct {
        std::string there;  // disks with a node
        std::string named;  // those with a superblock of this array
        const char *state;  // of the array after the first try
        int third;          // state of sdc3
        int result;
        std::vector<std::string> changes;
    } rows[] = {
        {"ab", "ab", "clear\n", 1, 0, {all, by_uuid}},
        {"abc", "ab", "inactive\n", 1, 0, {all, stop, by_uuid}},
        {"abc", "abc", "clear\n", 2, 0, {all, by_uuid}},
        {"abc", "abc", "clear\n", 1, -1, {all}},
        {"ac", "ac", "clear\n", 2, -1, {all}},
        {"a", "a", "inactive\n", 1, -1, {all, stop}},
        {"", "", "clear\n", 1, -1, {all}},
    };
    for (const auto &row : rows) {
        for (const char letter : {'a', 'b', 'c'})
            tree_.Remove(std::string("/dev/sd") + letter + "3");
        for (const char letter : row.there)
            tree_.Put(std::string("/dev/sd") + letter + "3", "");
        tree_.Put("/sys/block/md5/md/array_state", row.state);
        members[2].nState = row.third;
        commands_.OnCommand([&](const std::string &command) -> CommandReply {
            for (const char letter : row.named) {
                if (command == std::string("/sbin/mdadm -E /dev/sd") + letter + "3 2>/dev/null")
                    return {0, superblock_};
            }
            return {command == all};
        });
        EXPECT_EQ(RAIDAssembleByInfo(&info), row.result) << row.there;
        EXPECT_EQ(Changes(), row.changes);
        EXPECT_EQ(log_.Lines().size(), row.result == 0 ? 0u : 1u);
        log_.Clear();
    }
}

// Readers of an array in the middle of a reshape, which the kernel has started for reading only, wait for its first write.
TEST_F(Raid, AReshapeThatWasInterruptedGoesOn)
{
    const std::string uuid = "b7e9ed0e:bf1ea758:5bf5fba6:7c359649";
    RAIDMEMBER member = {"/dev/sda3", 1, nullptr};
    const RAIDINFO info = Record(RAID_LEVEL_5, &member);
    const std::string goes_on = "/bin/echo active > /sys/block/md5/md/array_state";
    const struct {
        const char *state, *position;
        bool changes;
    } rows[] = {{"read-auto\n", "30720\n", true}, {"read-auto\n", "none\n", false}, {"clean\n", "30720\n", false}};
    for (const auto &row : rows) {
        tree_.Put("/sys/block/md5/md/array_state", row.state);
        tree_.Put("/sys/block/md5/md/reshape_position", row.position);
        commands_.Exit(0);
        for (const bool by_info : {false, true}) {
            EXPECT_EQ(by_info ? RAIDAssembleByInfo(&info) : RAIDAssemble("/dev/md5", uuid.c_str()), 0);
            const std::vector<std::string> commands = commands_.Take();
            EXPECT_EQ(commands.size(), row.changes ? 2u : 1u) << row.state << row.position;
            EXPECT_EQ(commands.back() == goes_on, row.changes) << row.state << row.position;
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
        int status, code;
    } rows[] = {{"/dev/sdd3", 999, 0, 0x2900},
                {"/dev/sdd3", 1000, 0, 0},
                {"/dev/sde3", 0, 0, 0x0600},
                {"/dev/sdf3", 0, 0, 0x8100},
                {"/dev/sdd3", 1000, 1, 0x8100}};
    for (const auto &row : rows) {
        Size(row.sectors * 512);
        commands_.Exit(row.status);
        test::ForgetFault();
        EXPECT_EQ(RAIDAddRobustCheck(&info, row.member), row.code ? -1 : 0) << row.member << row.sectors;
        EXPECT_EQ(TLIBErrGet(), row.code);
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
        uint64_t kib, bytes;
    } rows[] = {{4, kib - 1, "", kib, kib * 3 * 1024},
                {4, kib, "", 0, 77},
                {8, 5, "", kib, kib * 2 * 1024},
                {2, 5, "raidsizelimit=2048\n", 1024, 1024 * 1024},
                {1, 5, "", 0, 77},
                {16, 5, "", 0, 77}};
    for (const auto &row : rows) {
        Model(row.limit);
        RAIDINFO info = Record(row.level, &member);
        info.cbArray = 77;
        info.cbMember = row.member_kib * 1024;
        uint64_t found = 0;
        EXPECT_EQ(RAIDExpansible(&info, &found), row.kib > 0) << row.level;
        EXPECT_EQ(found, row.kib);
        uint64_t bytes = 0;
        EXPECT_EQ(RAIDSizeUnallocGet(&info, &bytes), 0);
        EXPECT_EQ(bytes, row.bytes);
    }
}

TEST_F(Raid, StripesAndTuning)
{
    const std::vector<std::string> tune = {"/bin/echo 1024 > /sys/block/md5/md/stripe_cache_size"};
    const struct {
        int level, slots, stripe;
        bool tuned;
    } rows[] = {{5, 4, 192, true}, {6, 4, 128, true}, {0, 4, 256, false},
                {1, 4, 0, false},  {-1, 4, 0, false}, {10, 4, -1, false}};
    for (const auto &row : rows) {
        calls_.OnIoctl(Put(row.level, row.slots));
        tree_.Put("/sys/block/md5/md/stripe_cache_size", "256\n");
        EXPECT_EQ(RAIDMdStripeSizeGet("/dev/md5"), row.stripe) << row.level;
        EXPECT_EQ(TAVORAIDMdTuningPerformance("/dev/md5"), 0);
        EXPECT_EQ(commands_.Take(), row.tuned ? tune : std::vector<std::string>());
    }
    log_.Clear();
    EXPECT_EQ(TAVORAIDMdTuningPerformance(nullptr), -1);
    EXPECT_EQ(log_.Take(), "raid_md_tuning_performance:# illegal device path: NULL ");
}

TEST_F(Raid, MigratesToRaid6)
{
    calls_.OnIoctl(Put(6, 3));
    const RAIDINFO info = Record(RAID_LEVEL_5);
    const List two = MakeList({"/dev/sdd3", "/dev/sde3"});
    EXPECT_EQ(RAIDMigrate2RAID6(&info, two.get()), 0);
    EXPECT_THAT(commands_.Take(),
                ElementsAre("/bin/echo raid6  > /sys/block/md5/md/level", Quiet("/sbin/mdadm /dev/md5 -a /dev/sdd3"),
                            Quiet("/sbin/mdadm /dev/md5 -a /dev/sde3"),
                            "/sbin/mdadm --grow /dev/md5 -n 1 >/dev/null 2>&1\n"));
    const List one = MakeList({"/dev/sdd3"});
    EXPECT_EQ(RAIDMigrate2RAID6(&info, one.get()), 0);
    EXPECT_EQ(commands_.Take().size(), 2u);
    PutNodes({"sde3"});
    Size(info.cbMember - 512);
    EXPECT_EQ(RAIDMigrate2RAID6(&info, two.get()), -1) << "too small";
    tree_.AddBusy("/dev/sdd3");
    EXPECT_EQ(RAIDMigrate2RAID6(&info, one.get()), -1) << "in use";
    EXPECT_THAT(commands_.Take(), IsEmpty()) << "the level cannot be changed back";
    EXPECT_EQ(log_.Take(), "raid_migrate2_raid6:# '/dev/sde3' is too small for '/dev/md5'\n"
                           "raid_migrate2_raid6:# /dev/sdd3 is in use: a file system or swap");
    const RAIDINFO mirror = Record(RAID_LEVEL_1);
    EXPECT_EQ(RAIDMigrate2RAID6(&mirror, one.get()), -1);
}

// md5 of sda3, sdb3 (pulled) and sdc3, whose disks have the current layout; the new disk is sdd.
class RaidReplace : public Raid {
  protected:
    RaidReplace()
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
            return {command.find("sfdisk -l") != command.npos || command == fails_};
        });
    }

    // These disks alone have partitions.
    void LayOut(const std::string &disks)
    {
        outputs_.clear();
        const TAVOPARTLAYOUT &layout = grgAllTavoPartLayout[9];
        const TAVOPARTPLACE places[] = {layout.place1, layout.place2, {9437184, 5000000, 0xFD}};
        for (const char disk : disks) {
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

const std::string kRemoved = Quiet("/sbin/mdadm /dev/md5 -r /dev/sdb3");
const std::string kMakeFirst = Quiet("/sbin/sfdisk -N1 -uS -q -f -j256 -z4980480 -tfd -F /dev/sdd");
const std::string kAdded = Quiet("/sbin/mdadm /dev/md5 -a /dev/sdd3");

TEST_F(RaidReplace, PartitionsAndAddsTheNewDisk)
{
    for (const char *old : {"/dev/sdb3", static_cast<const char *>(nullptr)}) {
        EXPECT_EQ(RAIDReplaceDisk(&info_, old, "/dev/sdd"), 0);
        EXPECT_THAT(Changes(),
                    ElementsAre(kRemoved, Quiet("/sbin/sfdisk -M1 /dev/sdd"), kMakeFirst,
                                Quiet("/sbin/sfdisk -N2 -uS -q -f -j0 -z4194304 -tfd -F /dev/sdd"),
                                "/sbin/sfdisk -N3 -uS -q -f -j262144 -z-1 -tfd -F /dev/sdd >/dev/null 2>&1", kAdded));
        EXPECT_EQ(log_.Take(), "partition_check_layout:# /dev/sdd: dont contain partition [1]\n"
                               "raid_replace_disk:# [Info] /dev/sdb3 removed from /dev/md5\n"
                               "raid_replace_disk:# [Info] /dev/sdd partitioned as /dev/sda3\n"
                               "raid_replace_disk:# [Info] /dev/sdd3 added to /dev/md5");
    }
    // A free slot; the disk has its partitions, and an old superblock in the third.
    members_[1] = members_[2];
    LayOut("acd");
    outputs_["/sbin/mdadm -E /dev/sdd3 2>/dev/null"] = superblock_;
    EXPECT_EQ(RAIDReplaceDisk(&info_, nullptr, "/dev/sdd"), 0);
    EXPECT_THAT(Changes(), ElementsAre(Quiet("/sbin/mdadm --zero-superblock /dev/sdd3"), kAdded));
}

TEST_F(RaidReplace, AnArrayOfWholeDisks)
{
    RAIDMEMBER second = {"/dev/sdb", RAID_MEMBER_FAILED, nullptr};
    RAIDMEMBER first = {"/dev/sdc", 1, &second};
    info_.pMembers = &first;
    info_.nSlot = 2;
    PutNodes({"sdc"});
    EXPECT_EQ(RAIDReplaceDisk(&info_, nullptr, "/dev/sdd"), 0);
    EXPECT_THAT(Changes(),
                ElementsAre(Quiet("/sbin/mdadm /dev/md5 -r /dev/sdb"), Quiet("/sbin/mdadm /dev/md5 -a /dev/sdd")));
}

TEST_F(RaidReplace, RefusesBeforeTheFirstChange)
{
    const auto refused = [&](const char *old, const char *log, int code = 0) {
        test::ForgetFault();
        EXPECT_EQ(RAIDReplaceDisk(&info_, old, "/dev/sdd"), -1) << log;
        EXPECT_EQ(TLIBErrGet(), code);
        EXPECT_THAT(Changes(), IsEmpty()) << log;
        EXPECT_THAT(log_.Take(), testing::HasSubstr(log));
    };
    refused("/dev/sda3", "/dev/sda3 is in order in /dev/md5");
    refused("/dev/sde3", "/dev/sde3 is not a member of /dev/md5");
    Size((9437184 + 2048 + 4000000 - 1) * uint64_t{512});
    refused(nullptr, "'/dev/sdd3' is too small for '/dev/md5'", 0x2900);
    Size(uint64_t{1} << 49);
    tree_.Put("/sys/class/block/sdd1/holders/md0", "");
    refused(nullptr, "/dev/sdd1 is in use: md0");
    tree_.Remove("/sys/class/block");
    LayOut("c");
    refused(nullptr, "/dev/sda has no partitions of the system");
    LayOut("ac");
    tree_.Remove("/dev/sdc3");
    refused(nullptr, "lost more than one member");
    tree_.Remove("/dev/sda3");
    refused("/dev/sdb3", "has no member that is in order");
    PutNodes({"sda3", "sdb3", "sdc3"});
    refused(nullptr, "no failed or pulled member, and no free slot");
    for (const char *disk : {"/dev/sdd3", "sdd", "/dev/sd d", ""})
        EXPECT_EQ(RAIDReplaceDisk(&info_, nullptr, disk), -1) << disk;
    info_.fLevel = RAID_LEVEL_0;
    refused(nullptr, "Bad parameters", 0x0D00);
}

TEST_F(RaidReplace, StopsAtTheFirstFailure)
{
    fails_ = kMakeFirst;
    EXPECT_EQ(RAIDReplaceDisk(&info_, nullptr, "/dev/sdd"), -1);
    EXPECT_EQ(Changes().size(), 3u);
    fails_ = kRemoved;
    tree_.Put("/sys/block/md5/md/dev-sdb3/state", "faulty\n");
    EXPECT_EQ(RAIDReplaceDisk(&info_, nullptr, "/dev/sdd"), -1) << "md does not let go of it";
    EXPECT_THAT(Changes(), testing::Each(testing::HasSubstr("/sbin/mdadm ")));
    tree_.Remove("/sys/block/md5/md/dev-sdb3");
    fails_ = kAdded;
    EXPECT_EQ(RAIDReplaceDisk(&info_, nullptr, "/dev/sdd"), -1);
    EXPECT_EQ(TLIBErrGet(), 0x8100);
}

TEST_F(Raid, RemoveStopsAndCleans)
{
    calls_.OnIoctl(Put());
    const std::string examine = "/sbin/mdadm -E /dev/sda3 2>/dev/null";
    const std::string grep = "/bin/grep sd /proc/partitions";
    commands_.Print({{grep, "   8        3      76800 sda3\n"}, {examine, superblock_}});
    const List paths = MakeList({"/dev/md9", "/dev/md5"});
    EXPECT_EQ(RAIDRemoveMultiple(paths.get()), 0);
    EXPECT_THAT(commands_.Take(), ElementsAre(examine, Quiet("/sbin/mdadm -S /dev/md5"), grep, examine,
                                              Quiet("/sbin/mdadm --zero-superblock /dev/sda3")));
    EXPECT_THAT(log_.Take(), testing::HasSubstr("raid_remove:# [Info] clean RAID superblock of /dev/md5"));
}

}  // namespace
