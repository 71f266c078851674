// Arrays: read from the driver and the kernel's files, changed by exactly these commands.
#include "tavo_partition.h"
#include "tavo_raid.h"

#include "support/captured_log.h"
#include "support/captures.h"
#include "support/container_text.h"
#include "support/device_tree.h"
#include "support/fault_state.h"
#include "support/hostile_names.h"
#include "support/recorded_calls.h"
#include "support/recorded_commands.h"

#include <gmock/gmock.h>

#include <cerrno>
#include <cstdlib>
#include <cstring>
#include <filesystem>
#include <memory>

#include <linux/fs.h>
#include <linux/major.h>
#include <linux/raid/md_u.h>
#include <syslog.h>
#include <unistd.h>

using test::List;
using test::MakeList;
using testing::Contains;
using testing::ElementsAre;
using testing::IsEmpty;
using testing::MatchesRegex;

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

TEST(RAIDStatusDecide, Table)
{
    const test::CapturedLog log;
    const struct {
        int level, slots;
        std::vector<int> states;
        int status;
    } rows[] = {
        {5, 4, {1, 1, 1, 1}, RAID_STATUS_NORMAL},
        {5, 4, {1, 1, 1}, RAID_STATUS_DEGRADED},
        {5, 4, {1, 1, 1, 2}, RAID_STATUS_DEGRADED},
        {5, 4, {1, 1, 1, 3}, RAID_STATUS_DEGRADED},
        {5, 4, {1, 1, 1, 5}, RAID_STATUS_DEGRADED},
        {5, 4, {1, 1, 8, 8}, RAID_STATUS_CRASHED},
        {5, 4, {1, 1, 1, 1, 4}, RAID_STATUS_CRASHED},
        {5, 4, {}, RAID_STATUS_CRASHED},
        {5, 3, {1, 1, 1, 1}, RAID_STATUS_NORMAL},
        {6, 4, {1, 1}, RAID_STATUS_DEGRADED},
        {6, 4, {1}, RAID_STATUS_CRASHED},
        {1, 4, {1}, RAID_STATUS_DEGRADED},
        {1, 2, {2, 2}, RAID_STATUS_CRASHED},
        {10, 4, {1, 1}, RAID_STATUS_DEGRADED},
        {10, 4, {1}, RAID_STATUS_CRASHED},
        {0, 2, {1, 1}, RAID_STATUS_NORMAL},
        {0, 2, {1}, RAID_STATUS_CRASHED},
        {-1, 2, {1, 1}, RAID_STATUS_NORMAL},
        {-1, 2, {1, 4}, RAID_STATUS_CRASHED},
    };
    for (const auto &row : rows) {
        std::vector<RAIDMEMBER> members(row.states.size());
        for (size_t i = 0; i < members.size(); ++i) {
            members[i].nState = row.states[i];
            members[i].pNext = i + 1 < members.size() ? &members[i + 1] : nullptr;
        }
        mdu_array_info_t array = {};
        array.level = row.level;
        array.raid_disks = row.slots;
        int status = 0;
        EXPECT_EQ(RAIDStatusDecide(&array, members.empty() ? nullptr : members.data(), &status), 0);
        EXPECT_EQ(status, row.status) << row.level << " of " << row.slots << ": " << testing::PrintToString(row.states);
    }
    EXPECT_THAT(log.Lines(), IsEmpty());
    mdu_array_info_t array = {};
    array.level = 4;
    int status = 7;
    EXPECT_EQ(RAIDStatusDecide(&array, nullptr, &status), -1);
    EXPECT_EQ(status, 7);
    EXPECT_THAT(log.Texts(), ElementsAre(MatchesRegex("raid_status_decide:[0-9]+ unknown raid level: 4")));
}

TEST(RAIDParityDiskCount, Table)
{
    const test::CapturedLog log;
    const struct {
        int level, disks, parity;
    } rows[] = {{1, 4, 0}, {2, 4, 3}, {4, 4, 1}, {8, 4, 2}, {16, 4, 2}, {16, 5, 2}, {32, 4, 0}, {3, 4, -1}, {0, 4, -1}};
    for (const auto &row : rows)
        EXPECT_EQ(RAIDParityDiskCount(row.level, row.disks), row.parity) << row.level;
    EXPECT_THAT(log.Texts(), Contains(MatchesRegex(".* bad parameters: unknown raid level='3'")));
    EXPECT_EQ(log.Lines()[0].priority, LOG_DEBUG);
}

TEST(RAIDInfoDup, CopiesEveryField)
{
    RAIDMEMBER second = {"/dev/sdb3", 8, nullptr};
    RAIDMEMBER first = {"/dev/sda3", 1, &second};
    RAIDINFO info = {11, "/dev/md11", 12, 13, 14, uint64_t{15} << 40, uint64_t{16} << 40, 17, 18, 19, &first};
    const Info copy(RAIDInfoDup(&info), RAIDInfoFree);
    ASSERT_TRUE(copy);
    EXPECT_EQ(copy->nArray, 11);
    EXPECT_STREQ(copy->szPath, "/dev/md11");
    EXPECT_EQ(copy->fLevel, 12);
    EXPECT_EQ(copy->nStatus, 13);
    EXPECT_EQ(copy->fRebuilding, 14);
    EXPECT_EQ(copy->cbArray, uint64_t{15} << 40);
    EXPECT_EQ(copy->cbMember, uint64_t{16} << 40);
    EXPECT_EQ(copy->nSlot, 17);
    EXPECT_EQ(copy->nWorking, 18);
    EXPECT_EQ(copy->nFailed, 19);
    ASSERT_TRUE(copy->pMembers && copy->pMembers->pNext);
    EXPECT_NE(copy->pMembers, &first);
    EXPECT_STREQ(copy->pMembers->szPath, "/dev/sda3");
    EXPECT_EQ(copy->pMembers->nState, 1);
    EXPECT_STREQ(copy->pMembers->pNext->szPath, "/dev/sdb3");
    EXPECT_EQ(copy->pMembers->pNext->nState, 8);
    EXPECT_EQ(copy->pMembers->pNext->pNext, nullptr);
    EXPECT_EQ(RAIDInfoDup(nullptr), nullptr);
}

class Raid : public testing::Test {
  protected:
    // md5 of sda3, sdb3, sdc3; the kernel's number 1 is unused, as after a rebuild.
    FakeArray Put(int level = 5, int slots = 3, std::vector<int> states = {6, 6, 6})
    {
        std::vector<FakeDisk> disks;
        for (int i = 0; i < static_cast<int>(states.size()); ++i) {
            disks.push_back({i == 0 ? 0 : i + 1, 8, 16 * i + 3, states[static_cast<size_t>(i)]});
            const std::string device = "sd" + std::string(1, static_cast<char>('a' + i)) + "3";
            if (!linked_)
                tree_.Link("/sys/dev/block/8:" + std::to_string(16 * i + 3), "../../devices/x/block/" + device);
        }
        linked_ = true;
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
    RAIDINFO Record(int level) { return {5, "/dev/md5", level, 1, 0, 1 << 30, 1 << 20, 4, 4, 0, nullptr}; }

    bool linked_ = false;
    test::DeviceTree tree_;
    test::CapturedLog log_;
    test::RecordedCalls calls_;
    test::RecordedCommands commands_;
};

TEST_F(Raid, InfoOfAnArray)
{
    calls_.OnIoctl(Put(5, 3, {6, 1, 0}));
    tree_.Put("/sys/block/md5/md/sync_action", "recover\n");
    const Info info = Get();
    ASSERT_TRUE(info);
    EXPECT_EQ(info->nArray, 5);
    EXPECT_STREQ(info->szPath, "/dev/md5");
    EXPECT_EQ(info->fLevel, RAID_LEVEL_5);
    EXPECT_EQ(info->nStatus, RAID_STATUS_CRASHED) << "one of three is in sync";
    EXPECT_EQ(info->fRebuilding, 1);
    EXPECT_EQ(info->cbArray, uint64_t{303104} * 512);
    EXPECT_EQ(info->cbMember, uint64_t{75776} * 1024);
    EXPECT_EQ(info->nSlot, 3);
    EXPECT_EQ(info->nWorking, 2);
    EXPECT_EQ(info->nFailed, 1);
    std::vector<std::pair<std::string, int>> members;
    for (const RAIDMEMBER *member = info->pMembers; member; member = member->pNext)
        members.emplace_back(member->szPath, member->nState);
    EXPECT_THAT(members,
                ElementsAre(std::pair("/dev/sda3", RAID_MEMBER_ACTIVE), std::pair("/dev/sdb3", RAID_MEMBER_FAILED),
                            std::pair("/dev/sdc3", RAID_MEMBER_SPARE)));
    EXPECT_EQ(RAIDDiskCount(info->pMembers, RAID_MEMBER_ACTIVE | RAID_MEMBER_SPARE), 2);

    calls_.OnIoctl(Put(0, 3));
    tree_.Put("/sys/block/md5/md/array_state", "broken\n");
    EXPECT_EQ(Get()->nStatus, RAID_STATUS_CRASHED) << "its members keep their states";
    EXPECT_THAT(log_.Lines(), IsEmpty());
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
    EXPECT_THAT(log_.Lines(), IsEmpty());
}

TEST_F(Raid, InfoOfNoArray)
{
    RAIDINFO *info = nullptr;
    EXPECT_EQ(RAIDInfoGet("/dev/md7", &info), 0);
    FakeArray array = Put();
    array.error = ENODEV;
    calls_.OnIoctl(array);
    EXPECT_EQ(RAIDInfoGet("/dev/md5", &info), 0) << "a node without an array";
    EXPECT_THAT(log_.Lines(), IsEmpty());
    array.error = EIO;
    calls_.OnIoctl(array);
    EXPECT_EQ(RAIDInfoGet("/dev/md5", &info), -1);
    EXPECT_EQ(test::LastFault(), (test::Fault{ERR_SIZE_UNKNOWN, "raid_info_get"}));
    calls_.OnIoctl(FakeArray(4, 3, {}));
    EXPECT_EQ(RAIDInfoGet("/dev/md5", &info), -1);
    EXPECT_EQ(test::LastFault(), (test::Fault{ERR_UNKNOWN, "raid_info_get"}));
    EXPECT_EQ(RAIDInfoGet("/dev/sda", &info), -1);
    EXPECT_EQ(test::LastFault(), (test::Fault{ERR_BAD_PARAMETERS, "raid_info_get"}));
    EXPECT_EQ(info, nullptr);
}

TEST_F(Raid, EnumByNumber)
{
    calls_.OnIoctl(Put());
    for (const char *name : {"md10", "md2", "md_d1", "md7"})
        tree_.Put(std::string("/sys/block/") + name + "/md/array_state",
                  name == std::string("md7") ? "clear\n" : "clean\n");
    tree_.Put("/dev/md10", "");
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
    EXPECT_THAT(log_.Texts(), ElementsAre(MatchesRegex("raid_info_enum:[0-9]+ RAID not exist /dev/md2")));
    RAIDListFree(list);
    calls_.OnIoctl(FakeArray(4, 3, {}));
    EXPECT_EQ(RAIDInfoEnum(&list), -1);
    EXPECT_EQ(list, nullptr);
    EXPECT_THAT(log_.Texts(), Contains(MatchesRegex(".* Failed to get RAID information /dev/md5, errno=0X8000")));
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
    EXPECT_THAT(calls_.Calls(), ElementsAre("sleep 30", "sleep 30", "sleep 30"));

    calls_.Clear();
    calls_.OnIoctl(Put(5, 3, {6, 6, 0}));
    EXPECT_EQ(RAIDRebuildingWait("/dev/md5"), -1) << "all members are there and nothing happens";
    EXPECT_EQ(calls_.Calls().size(), 6u);
    EXPECT_THAT(log_.Texts(), ElementsAre(MatchesRegex(".* /dev/md5 build error, status is 2, rebuilding: 0")));

    calls_.Clear();
    log_.Clear();
    const List paths = MakeList({"/dev/md7", "/dev/md5"});
    EXPECT_EQ(RAIDRebuildingMultiWait(paths.get()), -1);
    EXPECT_EQ(calls_.Calls().size(), 4u);
    EXPECT_THAT(log_.Texts(),
                ElementsAre(MatchesRegex(".* Failed to get /dev/md7 info, error=\\[0x[0-9A-F]+\\], return=0, retry=5"),
                            MatchesRegex(".* Failed to wait RAID status: /dev/md7")));
}

TEST_F(Raid, Superblocks)
{
    commands_.OnCommand([](const std::string &command) -> test::CommandReply {
        if (command == "/sbin/mdadm -E /dev/sda3 2>/dev/null")
            return {0, std::string(test::Capture("mdadm_E_1.2_raid5-mdadm-4.2"))};
        if (command == "/sbin/mdadm -E /dev/sdb 2>/dev/null")
            return {0, "Name : nas:101\n"};
        if (command == "/sbin/mdadm -E /dev/sdc 2>/dev/null")
            return {0, "Name : nas:100\n"};
        return {1, ""};
    });
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
    EXPECT_THAT(commands_.Commands(),
                ElementsAre("/sbin/mdadm -E /dev/sdd3 2>/dev/null", "/sbin/mdadm -E /dev/sdd5 2>/dev/null",
                            "/sbin/mdadm -E /dev/sdd 2>/dev/null"));
}

TEST_F(Raid, CleansTheMembersOfOneArrayAlone)
{
    const char *const uuid = "b7e9ed0e:bf1ea758:5bf5fba6:7c359649";
    commands_.OnCommand([](const std::string &command) -> test::CommandReply {
        if (command == "/bin/grep sd /proc/partitions")
            return {0, "   8        0      98304 sda\n   8        3      76800 sda3\n   8       16      98304 sdb\n"
                       "   8       17       1 sdb;x\n   9  1 5 mdsd\n"};
        if (command == "/sbin/mdadm -E /dev/sda3 2>/dev/null")
            return {0, std::string(test::Capture("mdadm_E_1.2_raid5-mdadm-4.2"))};
        if (command == "/sbin/mdadm -E /dev/sdb 2>/dev/null")
            return {0, std::string(test::Capture("mdadm_E_1.2-mdadm-4.2"))};
        return {command == "/sbin/mdadm --zero-superblock /dev/sda3 > /dev/null 2>&1" ? 0 : 1, ""};
    });
    EXPECT_EQ(RAIDSBCleanByUUID(nullptr, uuid), 0);
    EXPECT_THAT(commands_.Commands(),
                ElementsAre("/bin/grep sd /proc/partitions", "/sbin/mdadm -E /dev/sda 2>/dev/null",
                            "/sbin/mdadm -E /dev/sda3 2>/dev/null",
                            "/sbin/mdadm --zero-superblock /dev/sda3 > /dev/null 2>&1",
                            "/sbin/mdadm -E /dev/sdb 2>/dev/null"));
    EXPECT_THAT(log_.Texts(), ElementsAre(MatchesRegex(
                                  "raid_sb_clean_by_uuid:[0-9]+ \\[Info\\] Clean RAID superblock on '/dev/sda3'")));
    commands_.Clear();
    for (const char *none : {"", "b7e9ed0e", "b7e9ed0e:bf1ea758:5bf5fba6:7c35964"})
        EXPECT_EQ(RAIDSBCleanByUUID(nullptr, none), -1) << none;
    EXPECT_THAT(commands_.Commands(), IsEmpty()) << "every disk without a superblock has the empty UUID";
    log_.Clear();
    EXPECT_EQ(RAIDSBCleanByUUID(nullptr, "495E879A:4e806313:a484c744:9c844bd2"), -1) << "mdadm fails on sdb";
    EXPECT_THAT(log_.Texts(), Contains(MatchesRegex(".* Failed to clean suerblock of '/dev/sdb'")));
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
        const char *words;  // of the command, up to the members
        const char *missing;
    } rows[] = {
        {4, 1, 3, nullptr, 0, 1, "", {"sda3", "sdb3", "sdc3", "sdd3"}, "-e 1.1 -amd  -R -l5  -n3  -x1  ", ""},
        {4,
         0,
         4,
         nullptr,
         1 << 20,
         0,
         "raidsizelimit=7\n",
         {"sda3", "sdb3", "sdc3"},
         "-e 1.1 -amd --assume-clean -R -l5  -n4  -x0 -z 1024 ",
         " missing"},
        {2, 0, 1, &old, 0, 1, "raidsizelimit=7\n", {"sda1"}, "-e 0.90 -amd  -R -l1 -f -n1  -x0 -z 7 ", ""},
        {8, 0, 5, nullptr, 0, 1, "", {"sda", "sdb", "sdc"}, "-e 1.1 -amd  -R -l6  -n5  -x0  ", " missing missing"},
        {1, 0, 2, nullptr, 0, 0, "", {"sda3", "sdb3"}, "-e 1.1 -amd  -R -l0  -n2    ", ""},
        {32, 0, 1, nullptr, 0, 0, "", {"sda3"}, "-e 1.1 -amd  -R -llinear -f -n1    ", ""},
        {16, 0, 2, nullptr, 0, 0, "", {"sda3", "sdb3"}, "-e 1.1 -amd --assume-clean -R -l10  -n2 -pn2   ", ""},
    };
    for (const auto &row : rows) {
        tree_.Put("/etc.defaults/tavoinfo.conf", row.limit);
        std::vector<std::string> paths;
        std::string command = std::string("/sbin/mdadm -C /dev/md2 ") + row.words;
        for (const std::string &member : row.members) {
            paths.push_back("/dev/" + member);
            command += " " + paths.back();
        }
        command += std::string(row.missing) + " > /dev/null 2>&1";
        const List members = MakeList(paths);
        const RAIDREQUEST request = {"/dev/md2", row.version, row.level,     row.spare,
                                     row.slots,  row.bytes,   members.get(), row.sync};
        commands_.Clear();
        log_.Clear();
        EXPECT_EQ(RAIDCreate(&request), 0);
        EXPECT_THAT(commands_.Commands(), ElementsAre(command));
        const bool alone = row.level == RAID_LEVEL_1 && row.slots == 1;
        EXPECT_THAT(log_.Texts(), Contains(testing::HasSubstr("/dev/md2 has one slot")).Times(alone ? 1 : 0));
    }
    commands_.Clear();
    log_.Clear();
    const List one = MakeList({"/dev/sda3"});
    const struct {
        const char *path;
        int spare, slots, line;
    } refused[] = {{nullptr, 0, 1, 47},
                   {"/dev/md2", -1, 1, 47},
                   {"/dev/md2", 0, 0, 47},
                   {"/dev/sda", 0, 1, 47},
                   {"/dev/md2", 1, 1, 54}};
    for (const auto &row : refused) {
        const RAIDREQUEST request = {row.path, nullptr, 2, row.spare, row.slots, 0, one.get(), 1};
        EXPECT_EQ(RAIDCreate(&request), -1);
        EXPECT_EQ(log_.Texts().back(), "raid_create:" + std::to_string(row.line) + " Bad parameters");
    }
    const List three = MakeList({"/dev/sda3", "/dev/sdb3", "/dev/sdc3"});
    RAIDREQUEST request = {"/dev/md2", nullptr, 2, 0, 2, 0, three.get(), 1};
    EXPECT_EQ(RAIDCreate(&request), -1);
    EXPECT_EQ(log_.Texts().back(), "raid_create:54 Bad parameters");
    request.nSlot = 200;
    EXPECT_EQ(RAIDCreate(&request), -1) << "a longer command would be cut";
    EXPECT_THAT(log_.Texts().back(), testing::StartsWith("raid_create:124 Failed to do '/sbin/mdadm -C /dev/md2"));
    EXPECT_THAT(commands_.Commands(), IsEmpty());
    request.nSlot = 3;
    commands_.OnCommand([](const std::string &) -> test::CommandReply { return {1, ""}; });
    EXPECT_EQ(RAIDCreate(&request), -1);
    EXPECT_THAT(log_.Texts().back(), testing::StartsWith("raid_create:124 Failed to do '/sbin/mdadm -C /dev/md2"));
}

TEST_F(Raid, ChangesRunExactlyTheseCommands)
{
    tree_.Put("/sys/block/md5/md/stripe_cache_size", "256\n");
    const RAIDINFO raid5 = Record(RAID_LEVEL_5);
    const RAIDINFO linear = Record(RAID_LEVEL_LINEAR);
    RAIDMEMBER second = {"/dev/sdb3", 1, nullptr};
    RAIDMEMBER first = {"/dev/sda3", 1, &second};
    RAIDINFO members = raid5;
    members.pMembers = &first;
    const char *const uuid = "b7e9ed0e:bf1ea758:5bf5fba6:7c359649";
    const std::pair<std::function<int()>, std::string> rows[] = {
        {[&] { return RAIDAdd(&raid5, "/dev/sdd3"); }, "/sbin/mdadm /dev/md5 -a /dev/sdd3 > /dev/null 2>&1"},
        {[&] { return RAIDAdd(&linear, "/dev/sdd3"); }, "/sbin/mdadm --grow /dev/md5 -a /dev/sdd3 > /dev/null 2>&1"},
        {[&] { return RAIDRemoveDisk(&raid5, "/dev/sdd3"); }, "/sbin/mdadm /dev/md5 -r /dev/sdd3 > /dev/null 2>&1"},
        {[&] { return RAIDDevCountChange(&raid5, 5); }, "/sbin/mdadm --grow /dev/md5 -n 5 >/dev/null 2>&1\n"},
        {[&] { return RAIDStop("/dev/md5"); }, "/sbin/mdadm -S /dev/md5 > /dev/null 2>&1"},
        {[&] { return RAIDAssemble("/dev/md5", uuid); },
         std::string("/sbin/mdadm -A /dev/md5 -u ") + uuid + " > /dev/null 2>&1"},
        {[&] { return RAIDAssembleByInfo(&members); }, "/sbin/mdadm -A /dev/md5 /dev/sda3 /dev/sdb3 > /dev/null 2>&1"},
        {[&] { return RAIDSBClean("/dev/sdd3"); }, "/sbin/mdadm --zero-superblock /dev/sdd3 > /dev/null 2>&1"},
        {[&] { return TAVORAIDMdStripeCacheSizeSet("/dev/md5", 512); },
         "/bin/echo 512 > /sys/block/md5/md/stripe_cache_size"},
        {[&] { return RAIDBadSectorRemap("/dev/md5", 3); }, "sysctl -w kernel.tavo_raid_sync_flag=1"},
    };
    for (const auto &[call, command] : rows) {
        commands_.OnCommand({});
        commands_.Clear();
        log_.Clear();
        EXPECT_EQ(call(), 0) << command;
        EXPECT_THAT(commands_.Commands(), ElementsAre(command));
        EXPECT_THAT(log_.Lines(), IsEmpty());
        commands_.OnCommand([](const std::string &) -> test::CommandReply { return {2, ""}; });
        EXPECT_EQ(call(), -1) << command;
        EXPECT_EQ(log_.Lines().size(), 1u) << command;
    }
    log_.Clear();
    EXPECT_EQ(RAIDAdd(&raid5, "/dev/sdd3"), -1);
    const RAIDINFO stripes = Record(RAID_LEVEL_0);
    EXPECT_EQ(RAIDAdd(&stripes, "/dev/sdd3"), -1);
    EXPECT_THAT(log_.Texts(), ElementsAre(MatchesRegex("raid_add:[0-9]+ Failed to add '/dev/sdd3' into '/dev/md5', "
                                                       "WEXITSTATUS\\(err\\) = 2, err = 512"),
                                          MatchesRegex("raid_add:[0-9]+ Bad raid level to add disk: 1")));
    EXPECT_EQ(TAVORAIDMdStripeCacheSizeSet("/dev/md6", 512), 0) << "an array without such a cache";
}

TEST_F(Raid, RemovesAMemberForGood)
{
    const RAIDINFO info = Record(RAID_LEVEL_5);
    tree_.Put("/sys/block/md5/md/dev-sdd3/state", "faulty\n");
    tree_.Put("/dev/sdd3", "");
    const std::string shortly = "/sbin/mdadm /dev/md5 -r /dev/sdd3 > /dev/null 2>&1";
    const std::string by_path = "/sbin/mdadm --remove /dev/md5 /dev/sdd3 > /dev/null 2>&1";
    const std::string by_name = "/sbin/mdadm --remove /dev/md5 sdd3 > /dev/null 2>&1";
    EXPECT_EQ(RAIDRemoveDisk(&info, "/dev/sdd3"), -1) << "it is still there";
    EXPECT_THAT(commands_.Commands(), ElementsAre(shortly, by_path));

    // Pulled: mdadm finds it by the kernel's name alone.
    tree_.Remove("/dev/sdd3");
    commands_.Clear();
    const std::string held = tree_.Place("/sys/block/md5/md/dev-sdd3");
    commands_.OnCommand([&](const std::string &command) -> test::CommandReply {
        if (command == by_path)
            return {1, ""};
        if (command == by_name)
            std::filesystem::remove_all(held);
        return {0, ""};
    });
    EXPECT_EQ(RAIDRemoveDisk(&info, "/dev/sdd3"), 0);
    EXPECT_THAT(commands_.Commands(), ElementsAre(shortly, by_path, by_name));

    // Pulled while nothing was written: md does not know yet.
    tree_.Put("/sys/block/md5/md/dev-sdd3/state", "in_sync\n");
    commands_.Clear();
    EXPECT_EQ(RAIDRemoveDisk(&info, "/dev/sdd3"), 0);
    EXPECT_THAT(commands_.Commands(),
                ElementsAre(shortly, by_path, "/sbin/mdadm /dev/md5 -f sdd3 > /dev/null 2>&1", by_name));
}

TEST_F(Raid, AssemblesWhatIsLeftOfTheMembers)
{
    const std::string superblock(test::Capture("mdadm_E_1.2_raid5-mdadm-4.2"));
    const std::string all = "/sbin/mdadm -A /dev/md5 /dev/sda3 /dev/sdb3 /dev/sdc3 > /dev/null 2>&1";
    const std::string stop = "/sbin/mdadm -S /dev/md5 > /dev/null 2>&1";
    const std::string by_uuid = "/sbin/mdadm -A /dev/md5 -u b7e9ed0e:bf1ea758:5bf5fba6:7c359649 > /dev/null 2>&1";
    RAIDMEMBER members[] = {{"/dev/sda3", 1, &members[1]}, {"/dev/sdb3", 1, &members[2]}, {"/dev/sdc3", 1, nullptr}};
    RAIDINFO info = Record(RAID_LEVEL_5);
    info.nSlot = 3;
    info.pMembers = members;
    const struct {
        std::vector<std::string> there;  // nodes
        std::vector<std::string> named;  // with a superblock of this array
        const char *state;               // of the array after the first try
        int third;                       // state of sdc3
        int result;
        std::vector<std::string> changes;
    } rows[] = {
        {{"a", "b"}, {"a", "b"}, "clear\n", 1, 0, {all, by_uuid}},
        {{"a", "b", "c"}, {"a", "b"}, "inactive\n", 1, 0, {all, stop, by_uuid}},
        {{"a", "b", "c"}, {"a", "b", "c"}, "clear\n", 2, 0, {all, by_uuid}},
        {{"a", "b", "c"}, {"a", "b", "c"}, "clear\n", 1, -1, {all}},
        {{"a", "c"}, {"a", "c"}, "clear\n", 2, -1, {all}},
        {{"a"}, {"a"}, "inactive\n", 1, -1, {all, stop}},
        {{}, {}, "clear\n", 1, -1, {all}},
    };
    for (const auto &row : rows) {
        for (const char *letter : {"a", "b", "c"})
            tree_.Remove(std::string("/dev/sd") + letter + "3");
        for (const std::string &letter : row.there)
            tree_.Put("/dev/sd" + letter + "3", "");
        tree_.Put("/sys/block/md5/md/array_state", row.state);
        members[2].nState = row.third;
        commands_.Clear();
        log_.Clear();
        commands_.OnCommand([&](const std::string &command) -> test::CommandReply {
            for (const std::string &letter : row.named) {
                if (command == "/sbin/mdadm -E /dev/sd" + letter + "3 2>/dev/null")
                    return {0, superblock};
            }
            return {command == all ? 1 : 0, ""};
        });
        EXPECT_EQ(RAIDAssembleByInfo(&info), row.result) << testing::PrintToString(row.there);
        std::vector<std::string> changes = commands_.Commands();
        std::erase_if(changes, [](const std::string &command) { return command.find(" -E ") != command.npos; });
        EXPECT_EQ(changes, row.changes);
        EXPECT_EQ(log_.Lines().size(), row.result == 0 ? 0u : 1u);
    }
}

TEST_F(Raid, AddsOnlyMembersThatAreLargeEnough)
{
    FakeArray sizes(5, 3, {});
    RAIDINFO info = Record(RAID_LEVEL_5);
    info.cbMember = 1000 * 512 - 255;  // with the rounding 1000 sectors
    tree_.Put("/dev/sdd3", "");
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
        sizes.cbDevice = row.sectors * 512;
        calls_.OnIoctl(sizes);
        commands_.OnCommand([&](const std::string &) -> test::CommandReply { return {row.status, ""}; });
        test::ForgetFault();
        EXPECT_EQ(RAIDAddRobustCheck(&info, row.member), row.code ? -1 : 0) << row.member << row.sectors;
        EXPECT_EQ(TLIBErrGet(), row.code);
    }
}

TEST_F(Raid, RoomToGrow)
{
    FakeArray sizes(5, 3, {});
    sizes.cbDevice = uint64_t{8} << 30;
    calls_.OnIoctl(sizes);
    RAIDMEMBER pulled = {"/dev/sdb3", 8, nullptr};
    RAIDMEMBER member = {"/dev/sda3", 1, &pulled};
    tree_.Put("/dev/sda3", "");
    const uint64_t kib = (8 << 20) - 1024;
    const struct {
        int level;
        uint64_t member_kib;
        const char *limit;
        int result;
        uint64_t kib, bytes;
    } rows[] = {{4, kib - 1, "", 1, kib, kib * 3 * 1024},
                {4, kib, "", 0, 0, 77},
                {8, 5, "", 1, kib, kib * 2 * 1024},
                {2, 5, "raidsizelimit=2048\n", 1, 1024, 1024 * 1024},
                {1, 5, "", 0, 0, 77},
                {16, 5, "", 0, 0, 77}};
    for (const auto &row : rows) {
        tree_.Put("/etc.defaults/tavoinfo.conf", row.limit);
        RAIDINFO info = Record(row.level);
        info.cbArray = 77;
        info.cbMember = row.member_kib * 1024;
        info.pMembers = &member;
        uint64_t found = 0;
        EXPECT_EQ(RAIDExpansible(&info, &found), row.result) << row.level;
        EXPECT_EQ(found, row.kib);
        uint64_t bytes = 0;
        EXPECT_EQ(RAIDSizeUnallocGet(&info, &bytes), 0);
        EXPECT_EQ(bytes, row.bytes);
    }
}

TEST_F(Raid, StripesAndTuning)
{
    tree_.Put("/sys/block/md5/md/stripe_cache_size", "256\n");
    const struct {
        int level, slots, stripe;
        size_t commands;
    } rows[] = {{5, 4, 192, 1}, {6, 4, 128, 1}, {0, 4, 256, 0}, {1, 4, 0, 0}, {-1, 4, 0, 0}, {10, 4, -1, 0}};
    for (const auto &row : rows) {
        calls_.OnIoctl(Put(row.level, row.slots));
        tree_.Put("/sys/block/md5/md/stripe_cache_size", "256\n");
        commands_.Clear();
        EXPECT_EQ(RAIDMdStripeSizeGet("/dev/md5"), row.stripe) << row.level;
        EXPECT_EQ(TAVORAIDMdTuningPerformance("/dev/md5"), 0);
        EXPECT_EQ(commands_.Commands().size(), row.commands);
        for (const std::string &command : commands_.Commands())
            EXPECT_EQ(command, "/bin/echo 1024 > /sys/block/md5/md/stripe_cache_size");
    }
    log_.Clear();
    EXPECT_EQ(TAVORAIDMdTuningPerformance(nullptr), -1);
    EXPECT_THAT(log_.Texts(), ElementsAre(MatchesRegex(".* illegal device path: NULL ")));
}

TEST_F(Raid, MigratesToRaid6)
{
    calls_.OnIoctl(Put(6, 3));
    const RAIDINFO info = Record(RAID_LEVEL_5);
    const List two = MakeList({"/dev/sdd3", "/dev/sde3"});
    EXPECT_EQ(RAIDMigrate2RAID6(&info, two.get()), 0);
    EXPECT_THAT(commands_.Commands(), ElementsAre("/bin/echo raid6  > /sys/block/md5/md/level",
                                                  "/sbin/mdadm /dev/md5 -a /dev/sdd3 > /dev/null 2>&1",
                                                  "/sbin/mdadm /dev/md5 -a /dev/sde3 > /dev/null 2>&1",
                                                  "/sbin/mdadm --grow /dev/md5 -n 1 >/dev/null 2>&1\n"));
    const List one = MakeList({"/dev/sdd3"});
    commands_.Clear();
    EXPECT_EQ(RAIDMigrate2RAID6(&info, one.get()), 0);
    EXPECT_EQ(commands_.Commands().size(), 2u);
    commands_.Clear();
    tree_.Put("/dev/sde3", "");
    FakeArray small(5, 3, {});
    small.cbDevice = info.cbMember - 512;
    calls_.OnIoctl(small);
    EXPECT_EQ(RAIDMigrate2RAID6(&info, two.get()), -1) << "too small";
    tree_.AddBusy("/dev/sdd3");
    EXPECT_EQ(RAIDMigrate2RAID6(&info, one.get()), -1) << "in use";
    EXPECT_THAT(commands_.Commands(), IsEmpty()) << "the level cannot be changed back";
    EXPECT_THAT(log_.Texts(), ElementsAre(testing::HasSubstr("'/dev/sde3' is too small for '/dev/md5'"),
                                          testing::HasSubstr("/dev/sdd3 is in use: a file system or swap")));
    const RAIDINFO mirror = Record(RAID_LEVEL_1);
    EXPECT_EQ(RAIDMigrate2RAID6(&mirror, one.get()), -1);
}

std::string LineOfPartition(int number, const TAVOPARTPLACE &place)
{
    return "/dev/x" + std::to_string(number) + " " + std::to_string(place.nStart) + " 0 " +
           std::to_string(place.cSector) + " fd x\n";
}

// md2 of sda3, sdb3 (pulled) and sdc3, whose disks have the current layout; the new disk is sdd.
class RaidReplace : public Raid {
  protected:
    RaidReplace()
    {
        tree_.Put("/etc.defaults/tavoinfo.conf", "supportraid=yes\n");
        for (const char *path : {"/dev/sda3", "/dev/sdc3", "/dev/sdd", "/dev/sdd3"})
            tree_.Put(path, "");
        tree_.Put("/sys/block/md5/md/dev-sda3/offset", "2048\n");
        info_.nSlot = 3;
        info_.pMembers = members_;
        info_.cbMember = uint64_t{4000000} * 512;
        SizeOfNew(9437184 + 2048 + 4000000);
        commands_.OnCommand([this](const std::string &command) { return Answer(command); });
    }

    void SizeOfNew(uint64_t sectors)
    {
        FakeArray sizes(5, 3, {});
        sizes.cbDevice = sectors * 512;
        calls_.OnIoctl(sizes);
    }

    test::CommandReply Answer(const std::string &command) const
    {
        for (const char disk : std::string(laid_out_)) {
            for (int number = 1; number <= 3; ++number) {
                const TAVOPARTLAYOUT &layout = grgAllTavoPartLayout[9];
                const TAVOPARTPLACE third = {9437184, 5000000, 0xFD};
                if (command == "/sbin/sfdisk -l -uS -N" + std::to_string(number) + " /dev/sd" + disk)
                    return {0, LineOfPartition(number, number == 1   ? layout.place1
                                                       : number == 2 ? layout.place2
                                                                     : third)};
            }
        }
        if (command == superblock_)
            return {0, std::string(test::Capture("mdadm_E_1.2_raid5-mdadm-4.2"))};
        return {command.find("sfdisk -l") != command.npos || command == fails_, ""};
    }

    // What was changed; without the looks.
    std::vector<std::string> Changes()
    {
        std::vector<std::string> changes = commands_.Commands();
        std::erase_if(changes, [](const std::string &command) {
            return command.find(" -E ") != command.npos || command.find(" -l ") != command.npos;
        });
        commands_.Clear();
        return changes;
    }

    const char *laid_out_ = "ac";  // the letters of disks with partitions
    std::string superblock_;
    std::string fails_;
    RAIDMEMBER members_[3] = {
        {"/dev/sda3", 1, &members_[1]}, {"/dev/sdb3", 1, &members_[2]}, {"/dev/sdc3", 1, nullptr}};
    RAIDINFO info_ = Record(RAID_LEVEL_5);
};

const std::vector<std::string> kMakeAll = {
    "/sbin/sfdisk -M1 /dev/sdd > /dev/null 2>&1",
    "/sbin/sfdisk -N1 -uS -q -f -j256 -z4980480 -tfd -F /dev/sdd > /dev/null 2>&1",
    "/sbin/sfdisk -N2 -uS -q -f -j0 -z4194304 -tfd -F /dev/sdd > /dev/null 2>&1",
    "/sbin/sfdisk -N3 -uS -q -f -j262144 -z-1 -tfd -F /dev/sdd >/dev/null 2>&1",
};
const std::string kRemoved = "/sbin/mdadm /dev/md5 -r /dev/sdb3 > /dev/null 2>&1";
const std::string kAdded = "/sbin/mdadm /dev/md5 -a /dev/sdd3 > /dev/null 2>&1";

TEST_F(RaidReplace, PartitionsAndAddsTheNewDisk)
{
    std::vector<std::string> all = {kRemoved};
    all.insert(all.end(), kMakeAll.begin(), kMakeAll.end());
    all.push_back(kAdded);
    for (const char *old : {"/dev/sdb3", static_cast<const char *>(nullptr)}) {
        log_.Clear();
        EXPECT_EQ(RAIDReplaceDisk(&info_, old, "/dev/sdd"), 0);
        EXPECT_EQ(Changes(), all);
        EXPECT_THAT(log_.Texts(),
                    ElementsAre(MatchesRegex("partition_check_layout:.*"),
                                MatchesRegex("raid_replace_disk:[0-9]+ \\[Info\\] /dev/sdb3 removed from /dev/md5"),
                                MatchesRegex("raid_replace_disk:[0-9]+ \\[Info\\] /dev/sdd partitioned as /dev/sda3"),
                                MatchesRegex("raid_replace_disk:[0-9]+ \\[Info\\] /dev/sdd3 added to /dev/md5")));
    }
    // A free slot; the disk has its partitions, and an old superblock in the third.
    members_[1] = members_[2];
    laid_out_ = "acd";
    superblock_ = "/sbin/mdadm -E /dev/sdd3 2>/dev/null";
    EXPECT_EQ(RAIDReplaceDisk(&info_, nullptr, "/dev/sdd"), 0);
    EXPECT_THAT(Changes(), ElementsAre("/sbin/mdadm --zero-superblock /dev/sdd3 > /dev/null 2>&1", kAdded));
}

TEST_F(RaidReplace, AnArrayOfWholeDisks)
{
    RAIDMEMBER second = {"/dev/sdb", RAID_MEMBER_FAILED, nullptr};
    RAIDMEMBER first = {"/dev/sdc", 1, &second};
    info_.pMembers = &first;
    info_.nSlot = 2;
    tree_.Put("/dev/sdc", "");
    EXPECT_EQ(RAIDReplaceDisk(&info_, nullptr, "/dev/sdd"), 0);
    EXPECT_THAT(Changes(), ElementsAre("/sbin/mdadm /dev/md5 -r /dev/sdb > /dev/null 2>&1",
                                       "/sbin/mdadm /dev/md5 -a /dev/sdd > /dev/null 2>&1"));
}

TEST_F(RaidReplace, RefusesBeforeTheFirstChange)
{
    const auto refused = [&](const char *old, const char *log, int code = 0) {
        log_.Clear();
        test::ForgetFault();
        EXPECT_EQ(RAIDReplaceDisk(&info_, old, "/dev/sdd"), -1) << log;
        EXPECT_EQ(TLIBErrGet(), code);
        EXPECT_THAT(Changes(), IsEmpty()) << log;
        ASSERT_FALSE(log_.Texts().empty());
        EXPECT_THAT(log_.Texts().back(), testing::HasSubstr(log));
    };
    refused("/dev/sda3", "/dev/sda3 is in order in /dev/md5");
    refused("/dev/sde3", "/dev/sde3 is not a member of /dev/md5");
    SizeOfNew(9437184 + 2048 + 4000000 - 1);
    refused(nullptr, "'/dev/sdd3' is too small for '/dev/md5'", 0x2900);
    SizeOfNew(uint64_t{1} << 40);
    tree_.Put("/sys/class/block/sdd1/holders/md0", "");
    refused(nullptr, "/dev/sdd1 is in use: md0");
    tree_.Remove("/sys/class/block");
    laid_out_ = "c";
    refused(nullptr, "/dev/sda has no partitions of the system");
    laid_out_ = "ac";
    tree_.Remove("/dev/sdc3");
    refused(nullptr, "lost more than one member");
    tree_.Remove("/dev/sda3");
    refused("/dev/sdb3", "has no member that is in order");
    for (const char *path : {"/dev/sda3", "/dev/sdb3", "/dev/sdc3"})
        tree_.Put(path, "");
    refused(nullptr, "no failed or pulled member, and no free slot");
    for (const char *disk : {"/dev/sdd3", "sdd", "/dev/sd d", ""})
        EXPECT_EQ(RAIDReplaceDisk(&info_, nullptr, disk), -1) << disk;
    info_.fLevel = RAID_LEVEL_0;
    refused(nullptr, "Bad parameters", 0x0D00);
}

TEST_F(RaidReplace, StopsAtTheFirstFailure)
{
    fails_ = kMakeAll[1];
    EXPECT_EQ(RAIDReplaceDisk(&info_, nullptr, "/dev/sdd"), -1);
    EXPECT_EQ(Changes().size(), 3u);
    fails_ = kRemoved;
    tree_.Put("/sys/block/md5/md/dev-sdb3/state", "faulty\n");
    EXPECT_EQ(RAIDReplaceDisk(&info_, nullptr, "/dev/sdd"), -1) << "md does not let go of it";
    EXPECT_THAT(Changes(), testing::Not(Contains(kMakeAll[0])));
    tree_.Remove("/sys/block/md5/md/dev-sdb3");
    fails_ = kAdded;
    EXPECT_EQ(RAIDReplaceDisk(&info_, nullptr, "/dev/sdd"), -1);
    EXPECT_EQ(TLIBErrGet(), 0x8100);
}

TEST_F(Raid, RemoveStopsAndCleans)
{
    calls_.OnIoctl(Put());
    commands_.OnCommand([](const std::string &command) -> test::CommandReply {
        if (command.starts_with("/bin/grep"))
            return {0, "   8        3      76800 sda3\n"};
        if (command.find(" -E ") != command.npos)
            return {0, std::string(test::Capture("mdadm_E_1.2_raid5-mdadm-4.2"))};
        return {0, ""};
    });
    const List paths = MakeList({"/dev/md9", "/dev/md5"});
    EXPECT_EQ(RAIDRemoveMultiple(paths.get()), 0);
    EXPECT_THAT(commands_.Commands(),
                ElementsAre("/sbin/mdadm -E /dev/sda3 2>/dev/null", "/sbin/mdadm -S /dev/md5 > /dev/null 2>&1",
                            "/bin/grep sd /proc/partitions", "/sbin/mdadm -E /dev/sda3 2>/dev/null",
                            "/sbin/mdadm --zero-superblock /dev/sda3 > /dev/null 2>&1"));
    EXPECT_THAT(log_.Texts(),
                Contains(MatchesRegex("raid_remove:[0-9]+ \\[Info\\] clean RAID superblock of /dev/md5")));
}

TEST_F(Raid, HostileNamesRunNothing)
{
    ::unlink(test::kCanary);
    const RAIDINFO info = Record(RAID_LEVEL_5);
    RAIDSUPERBLOCK superblock;
    RAIDINFO *read = nullptr;
    char uuid[64];
    for (const std::string &text : test::HostileNames()) {
        const char *const name = text.c_str();
        RAIDINFO bad = info;
        bad.szPath[text.copy(bad.szPath, sizeof bad.szPath - 1)] = 0;
        const List list = MakeList({text.empty() ? std::string("x") : text});
        const RAIDREQUEST by_path = {name, nullptr, 2, 0, 1, 0, list.get(), 1};
        const RAIDREQUEST by_member = {"/dev/md2", nullptr, 2, 0, 1, 0, list.get(), 1};
        EXPECT_EQ(RAIDInfoGet(name, &read), -1) << name;
        EXPECT_EQ(RAIDSBGet(name, &superblock), -1) << name;
        EXPECT_EQ(RAIDSBClean(name), -1) << name;
        EXPECT_EQ(RAIDSBCleanByUUID(nullptr, name), -1) << name;
        EXPECT_EQ(RAIDUUIDGet(name, uuid, sizeof uuid), -1) << name;
        EXPECT_EQ(RAIDDiskIsUsedByRAID(name, nullptr), -1) << name;
        EXPECT_EQ(RAIDStop(name), -1) << name;
        EXPECT_EQ(RAIDAssemble("/dev/md2", name), -1) << name;
        EXPECT_EQ(RAIDAssemble(name, "b7e9ed0e:bf1ea758:5bf5fba6:7c359649"), -1) << name;
        EXPECT_EQ(RAIDCreate(&by_path), -1) << name;
        EXPECT_EQ(RAIDCreate(&by_member), -1) << name;
        EXPECT_EQ(RAIDAdd(&info, name), -1) << name;
        EXPECT_EQ(RAIDAdd(&bad, "/dev/sda3"), -1) << name;
        EXPECT_EQ(RAIDAddRobustCheck(&info, name), -1) << name;
        EXPECT_EQ(RAIDRemove(&bad), -1) << name;
        EXPECT_EQ(RAIDRemoveDisk(&info, name), -1) << name;
        EXPECT_EQ(RAIDDevCountChange(&bad, 2), -1) << name;
        EXPECT_EQ(RAIDMigrate2RAID6(&info, list.get()), -1) << name;
        EXPECT_EQ(RAIDBadSectorRemap(name, 1), -1) << name;
        EXPECT_EQ(TAVORAIDMdStripeCacheSizeSet(name, 1), -1) << name;
        EXPECT_EQ(TAVORAIDMdTuningPerformance(name), -1) << name;
    }
    EXPECT_THAT(commands_.Commands(), IsEmpty());
    EXPECT_NE(::access(test::kCanary, F_OK), 0);
}

}  // namespace
