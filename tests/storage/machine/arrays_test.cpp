// Real arrays: made, broken, mended, changed.
#include "real_storage.h"

#include <gmock/gmock.h>

// The library looks every half a minute; disks of this size are rebuilt sooner.
extern "C" unsigned int sleep(unsigned int)
{
    ::usleep(200'000);
    return 0;
}

namespace {

using test::Array;
using test::BecomesNormal;
using test::Disk;
using test::Fill;
using test::Make;
using test::MembersOf;
using test::ReadArray;
using test::Shell;
using test::StatusOf;
using test::SumOf;
using test::Told;
using testing::ElementsAre;
using testing::HasSubstr;

using MachineArrays = test::LivedTest;

INSTANTIATE_TEST_SUITE_P(, MachineArrays, testing::ValuesIn(test::Lives()), test::LifeName);

std::vector<std::string> Partitions(int number, int first = 1, int last = 6)
{
    std::vector<std::string> paths;
    for (int bay = first; bay <= last; ++bay)
        paths.push_back(Disk(bay) + std::to_string(number));
    return paths;
}

std::string UuidOf(const std::string &path)
{
    char uuid[64] = "";
    EXPECT_EQ(RAIDUUIDGet(path.c_str(), uuid, sizeof uuid), 1) << path;
    return uuid;
}

bool HasSuperblock(const std::string &member)
{
    RAIDSUPERBLOCK superblock;
    return RAIDSBGet(member.c_str(), &superblock) == 1 && superblock.szUuid[0] != 0;
}

// A missing disk is noticed at the next write.
void Touch(const std::string &array, int mib = 0)
{
    Shell("dd if=/dev/urandom of=" + array + " bs=64k count=64 oflag=direct,seek_bytes seek=" + std::to_string(mib) +
          "M");
}

// From blank disks to arrays, through the loss of two disks, and back to nothing.
TEST_P(MachineArrays, ALifeOfSixDisks)
{
    test::PlugSystemDisks(6, 4736);
    // The system and its swap: the rebuild of a small part shows as much as that of the whole.
    ASSERT_EQ(Make("/dev/md0", RAID_LEVEL_1, Partitions(1), {.mib = 32}), 0);
    ASSERT_EQ(Make("/dev/md1", RAID_LEVEL_1, Partitions(2), {.mib = 32}), 0);
    EXPECT_EQ(StatusOf("/dev/md0"), RAID_STATUS_NORMAL);
    EXPECT_EQ(MembersOf("/dev/md1", RAID_MEMBER_ACTIVE), Partitions(2));

    // Data: four slots, one of them missing.
    ASSERT_EQ(Make("/dev/md2", RAID_LEVEL_5, Partitions(3, 1, 3), {.slots = 4, .mib = 64, .sync = true}), 0);
    EXPECT_EQ(StatusOf("/dev/md2"), RAID_STATUS_DEGRADED);
    EXPECT_EQ(ReadArray("/dev/md2")->nSlot, 4);
    EXPECT_EQ(ReadArray("/dev/md2")->cbMember, 64u << 20);
    EXPECT_EQ(Told("cat /sys/block/md2/md/stripe_cache_size"), "1024\n");
    EXPECT_EQ(RAIDMdStripeSizeGet("/dev/md2"), 3 * 512);
    int array = -1;
    EXPECT_EQ(RAIDDiskIsUsedByRAID("/dev/sda", &array), 1);
    EXPECT_EQ(array, 2);
    EXPECT_EQ(RAIDDiskIsUsedByRAID("/dev/sdf", &array), 0);

    // A fourth disk makes it whole.
    const std::string sum = Fill("/dev/md2", 8);
    EXPECT_EQ(RAIDAddRobustCheck(ReadArray("/dev/md2").get(), "/dev/sdd3"), 0);
    EXPECT_TRUE(BecomesNormal("/dev/md2"));
    EXPECT_EQ(RAIDRebuildingWait("/dev/md2"), 0);
    EXPECT_EQ(MembersOf("/dev/md2", RAID_MEMBER_ACTIVE), Partitions(3, 1, 4));

    // One disk gone: degraded, and the data is there. Two: crashed.
    test::Happen("pull 2");
    Touch("/dev/md2", 16);
    EXPECT_TRUE(test::Eventually([] { return StatusOf("/dev/md2") == RAID_STATUS_DEGRADED; }));
    EXPECT_EQ(MembersOf("/dev/md2", RAID_MEMBER_ACTIVE).size(), 3u);
    EXPECT_EQ(SumOf("/dev/md2", 8), sum);
    EXPECT_EQ(RAIDRebuildingWait("/dev/md2"), -1);
    test::Happen("pull 3");
    Touch("/dev/md2", 16);
    EXPECT_TRUE(test::Eventually([] { return StatusOf("/dev/md2") == RAID_STATUS_CRASHED; }));
    Touch("/dev/md0");
    EXPECT_TRUE(test::Eventually([] { return StatusOf("/dev/md0") == RAID_STATUS_DEGRADED; }));

    // They come back. The crashed array is stopped first, and the others let go of the names.
    const std::string uuid = UuidOf("/dev/md2");
    EXPECT_TRUE(test::Eventually([] { return RAIDStop("/dev/md2") == 0; }));
    Touch("/dev/md1");
    for (const char *number : {"1", "2"}) {
        const Array holder = ReadArray(std::string("/dev/md") + (number[0] == '1' ? "0" : "1"));
        for (const char *disk : {"/dev/sdb", "/dev/sdc"})
            EXPECT_EQ(RAIDRemoveDisk(holder.get(), (std::string(disk) + number).c_str()), 0);
    }
    test::Happen("plug 2");
    test::Happen("plug 3");
    EXPECT_EQ(Told("ls /dev/sdb3 /dev/sdc3"), "/dev/sdb3\n/dev/sdc3\n");
    for (const char *member : {"/dev/sdb1", "/dev/sdc1"})
        EXPECT_EQ(RAIDAdd(ReadArray("/dev/md0").get(), member), 0);
    EXPECT_TRUE(BecomesNormal("/dev/md0"));

    // Cleaning by its UUID removes this array from its members; other disks are not touched.
    EXPECT_EQ(RAIDSBCleanByUUID(nullptr, uuid.c_str()), 0);
    for (const std::string &member : Partitions(3, 1, 4))
        EXPECT_FALSE(HasSuperblock(member)) << member;
    for (const std::string &member : Partitions(1))
        EXPECT_TRUE(HasSuperblock(member)) << member;
    EXPECT_EQ(StatusOf("/dev/md0"), RAID_STATUS_NORMAL);

    EXPECT_EQ(RAIDRemoveMultiple(test::MakeList({"/dev/md0", "/dev/md7", "/dev/md1"}).get()), 0);
    EXPECT_THAT(Told("cat /proc/mdstat"), testing::Not(HasSubstr("md")));
    for (const std::string &member : Partitions(1))
        EXPECT_FALSE(HasSuperblock(member)) << member;
}

TEST_P(MachineArrays, EveryLevelIsMadeReadAndRemoved)
{
    const struct {
        int level;
        int members, slots, spares;
        int status;
        unsigned data;  // members' worth of room
    } rows[] = {
        {RAID_LEVEL_0, 3, 3, 0, RAID_STATUS_NORMAL, 3},   {RAID_LEVEL_LINEAR, 2, 2, 0, RAID_STATUS_NORMAL, 2},
        {RAID_LEVEL_1, 2, 2, 0, RAID_STATUS_NORMAL, 1},   {RAID_LEVEL_1, 1, 1, 0, RAID_STATUS_NORMAL, 1},
        {RAID_LEVEL_10, 4, 4, 0, RAID_STATUS_NORMAL, 2},  {RAID_LEVEL_10, 3, 4, 0, RAID_STATUS_DEGRADED, 2},
        {RAID_LEVEL_5, 4, 3, 1, RAID_STATUS_NORMAL, 2},   {RAID_LEVEL_6, 4, 4, 0, RAID_STATUS_NORMAL, 2},
        {RAID_LEVEL_6, 2, 4, 0, RAID_STATUS_DEGRADED, 2},
    };
    for (const auto &row : rows) {
        SCOPED_TRACE("level " + std::to_string(row.level) + ", " + std::to_string(row.members) + " members");
        std::vector<std::string> members;
        for (int bay = 1; bay <= row.members; ++bay)
            members.push_back(Disk(bay));
        // RAID 0 and linear know no size to use of each.
        const bool sized = row.level != RAID_LEVEL_0 && row.level != RAID_LEVEL_LINEAR;
        ASSERT_EQ(
            Make("/dev/md5", row.level, members, {.slots = row.slots, .spares = row.spares, .mib = sized ? 32u : 0u}),
            0);
        const Array array = ReadArray("/dev/md5");
        ASSERT_TRUE(array);
        EXPECT_EQ(array->fLevel, row.level);
        EXPECT_EQ(array->nStatus, row.status);
        EXPECT_EQ(array->nSlot, row.slots);
        EXPECT_EQ(array->nWorking, row.members);
        EXPECT_EQ(RAIDDiskCount(array->pMembers, RAID_MEMBER_SPARE), row.spares);
        const uint64_t unit = sized ? 32u << 20 : 90u << 20;
        EXPECT_GE(array->cbArray, row.data * unit);
        EXPECT_LE(array->cbArray, row.data * (sized ? unit : 96u << 20));
        EXPECT_EQ(Told("blockdev --getsize64 /dev/md5"), std::to_string(array->cbArray) + "\n");
        EXPECT_EQ(RAIDRemove(array.get()), 0);
        EXPECT_FALSE(ReadArray("/dev/md5"));
        for (const std::string &member : members)
            EXPECT_FALSE(HasSuperblock(member)) << member;
    }
}

TEST_P(MachineArrays, MembersFailAreRemovedAndReplaced)
{
    ASSERT_EQ(Make("/dev/md3", RAID_LEVEL_1, {"/dev/sda", "/dev/sdb"}), 0);
    const Array array = ReadArray("/dev/md3");
    // A member in sync stays.
    EXPECT_EQ(RAIDRemoveDisk(array.get(), "/dev/sda"), -1);
    EXPECT_EQ(MembersOf("/dev/md3", RAID_MEMBER_ACTIVE).size(), 2u);

    test::FailMember("/dev/md3", "/dev/sdb");
    EXPECT_THAT(MembersOf("/dev/md3", RAID_MEMBER_FAILED), ElementsAre("/dev/sdb"));
    EXPECT_EQ(StatusOf("/dev/md3"), RAID_STATUS_DEGRADED);
    EXPECT_EQ(RAIDRemoveDisk(array.get(), "/dev/sdb"), 0);
    EXPECT_THAT(MembersOf("/dev/md3", ~0), ElementsAre("/dev/sda"));
    EXPECT_THAT(Told("mdadm -D /dev/md3"), testing::Not(HasSubstr("/dev/sdb")));

    EXPECT_EQ(RAIDAddRobustCheck(array.get(), "/dev/sdc"), 0);
    EXPECT_TRUE(BecomesNormal("/dev/md3"));
    EXPECT_THAT(MembersOf("/dev/md3", RAID_MEMBER_ACTIVE), ElementsAre("/dev/sda", "/dev/sdc"));

    // A third slot for a third disk.
    EXPECT_EQ(RAIDAdd(array.get(), "/dev/sdd"), 0);
    EXPECT_THAT(MembersOf("/dev/md3", RAID_MEMBER_SPARE), ElementsAre("/dev/sdd"));
    EXPECT_EQ(RAIDDevCountChange(array.get(), 3), 0);
    EXPECT_TRUE(BecomesNormal("/dev/md3"));
    EXPECT_EQ(ReadArray("/dev/md3")->nSlot, 3);

    Told("dd if=/dev/zero of=/tmp/small bs=1M count=8 && losetup /dev/loop0 /tmp/small");
    EXPECT_EQ(RAIDAddRobustCheck(array.get(), "/dev/loop0"), -1);
    EXPECT_EQ(TLIBErrGet(), ERR_NOT_ENOUGH_SPACE);
    EXPECT_EQ(RAIDAddRobustCheck(array.get(), "/dev/sdz"), -1);
    Told("losetup -d /dev/loop0");
}

TEST_P(MachineArrays, Raid5BecomesRaid6)
{
    ASSERT_EQ(Make("/dev/md2", RAID_LEVEL_5, {"/dev/sda", "/dev/sdb", "/dev/sdc"}, {.mib = 32}), 0);
    const std::string sum = Fill("/dev/md2", 64);
    const Array array = ReadArray("/dev/md2");
    EXPECT_EQ(RAIDMigrate2RAID6(array.get(), test::MakeList({"/dev/sdd"}).get()), 0);
    EXPECT_EQ(ReadArray("/dev/md2")->fLevel, RAID_LEVEL_6);
    EXPECT_TRUE(BecomesNormal("/dev/md2"));
    EXPECT_EQ(ReadArray("/dev/md2")->nSlot, 4);
    // Its parity is not where mdadm expects it.
    Told("tavoctl raid grow --yes --wait md2 sde");
    EXPECT_EQ(MembersOf("/dev/md2", RAID_MEMBER_ACTIVE).size(), 5u);
    EXPECT_EQ(SumOf("/dev/md2", 64), sum);

    // Any two disks may go now.
    test::FailMember("/dev/md2", "/dev/sda");
    test::FailMember("/dev/md2", "/dev/sdb");
    EXPECT_EQ(StatusOf("/dev/md2"), RAID_STATUS_DEGRADED);
    EXPECT_EQ(SumOf("/dev/md2", 64), sum);
    EXPECT_EQ(RAIDMigrate2RAID6(ReadArray("/dev/md2").get(), test::MakeList({"/dev/sdf"}).get()), -1);
}

TEST_P(MachineArrays, AReshapeGoesOnWhenItsArrayIsStartedAgain)
{
    ASSERT_EQ(Make("/dev/md2", RAID_LEVEL_5, {"/dev/sda", "/dev/sdb", "/dev/sdc"}), 0);
    const std::string sum = Fill("/dev/md2", 32);
    Told("tavoctl raid speed --least 100 --most 500 md2; tavoctl raid grow --yes md2 sdd; sleep 1");
    const std::string uuid = UuidOf("/dev/md2");
    // The first stripes, which will be overwritten, are recorded as moved: 1,536 KiB of three members with data.
    EXPECT_GE(std::stol(Told("cat /sys/block/md2/md/reshape_position")), 3 * 2 * 1536);
    EXPECT_EQ(Told("cat /sys/block/md2/md/sync_max"), "max\n");
    ASSERT_EQ(RAIDStop("/dev/md2"), 0);
    ASSERT_EQ(RAIDAssemble("/dev/md2", uuid.c_str()), 0);
    EXPECT_EQ(SumOf("/dev/md2", 32), sum);
    Told("tavoctl raid speed --most 200000 md2 && tavoctl raid wait md2");
    EXPECT_EQ(ReadArray("/dev/md2")->nSlot, 4);
    EXPECT_EQ(SumOf("/dev/md2", 32), sum);
    // Another one would have to overwrite what has not been moved yet.
    const test::CommandResult refused = Shell("tavoctl raid grow --yes md2 sde");
    EXPECT_EQ(refused.status, 1);
    EXPECT_THAT(refused.output, HasSubstr("has 476 KiB of room before its data, and it takes 2048"));
    EXPECT_EQ(MembersOf("/dev/md2", ~0).size(), 4u);
}

// Another program began to spread it, and the power failed before a copy of the first stripes was written.
TEST_P(MachineArrays, AReshapeThatHasMovedNothingIsTakenBack)
{
    for (const char *other : {"/dev/sde", "/dev/sdf"})
        RAIDSBClean(other);  // they may hold another array of that name
    ASSERT_EQ(Make("/dev/md2", RAID_LEVEL_5, {"/dev/sda", "/dev/sdb", "/dev/sdc"}), 0);
    const std::string sum = Fill("/dev/md2", 32);
    Told("tavoctl raid add --yes md2 sdd && cd /sys/block/md2/md && echo 0 >sync_max && echo 4 >raid_disks && "
         "echo reshape >sync_action && sleep 1");
    ASSERT_EQ(RAIDStop("/dev/md2"), 0);
    const test::CommandResult careful = Shell("tavoctl raid assemble --all");
    EXPECT_EQ(careful.status, 1);
    EXPECT_THAT(careful.output, HasSubstr("tavoctl raid assemble --force md2"));
    EXPECT_FALSE(ReadArray("/dev/md2"));
    Told("tavoctl raid assemble --yes --force md2");
    EXPECT_EQ(ReadArray("/dev/md2")->nSlot, 3);
    EXPECT_THAT(MembersOf("/dev/md2", ~RAID_MEMBER_ACTIVE), ElementsAre("/dev/sdd"));
    EXPECT_EQ(SumOf("/dev/md2", 32), sum);
}

}  // namespace
