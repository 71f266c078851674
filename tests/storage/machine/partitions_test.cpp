// Real partition tables: every layout that was ever shipped, made and recognised.
#include "tavo_file.h"

#include "real_storage.h"

#include <gmock/gmock.h>

#include <array>
#include <fstream>

#include <fcntl.h>

namespace {

using test::Told;

using MachinePartitions = test::LivedTest;

INSTANTIATE_TEST_SUITE_P(, MachinePartitions, testing::ValuesIn(test::Lives()), test::LifeName);

constexpr int whole_layout = 4800;  // MiB; a version 7 needs 4608 before its data partition

void SetRaidModel(bool raid)
{
    ASSERT_EQ(TLIBFileSetKeyValue("/etc.defaults/tavoinfo.conf", "supportraid", raid ? "yes" : "no", nullptr), 1);
}

struct Place {
    int64_t start, sectors;
    unsigned type;

    friend bool operator==(const Place &, const Place &) = default;
    friend std::ostream &operator<<(std::ostream &out, const Place &place)
    {
        return out << place.start << "+" << place.sectors << " type " << place.type;
    }
};

// As it is on the disk.
std::array<Place, 4> TableOf(const std::string &disk)
{
    unsigned char sector[512] = {};
    std::ifstream(disk, std::ios::binary).read(reinterpret_cast<char *>(sector), sizeof sector);
    std::array<Place, 4> places = {};
    if (sector[510] != 0x55 || sector[511] != 0xAA)
        return places;
    for (int i = 0; i < 4; ++i) {
        const unsigned char *entry = sector + 446 + 16 * i;
        const auto number = [&](int at) {
            return static_cast<int64_t>(entry[at] | entry[at + 1] << 8 | entry[at + 2] << 16) +
                   (static_cast<int64_t>(entry[at + 3]) << 24);
        };
        places[static_cast<size_t>(i)] = {number(8), number(12), entry[4]};
    }
    return places;
}

int64_t KernelSays(const std::string &file)
{
    int64_t value = -1;
    std::ifstream("/sys/block/" + file) >> value;
    return value;
}

int VersionOf(const std::string &disk, int raid)
{
    int version = 0;
    return BlTAVOCheckPartitionLayout(disk.c_str(), raid, &version) == 1 ? version : 0;
}

TEST_P(MachinePartitions, EveryLayoutIsMadeAndRecognised)
{
    test::PlugLargeDisks(1, whole_layout);
    const int64_t sectors = KernelSays("sda/size");
    ASSERT_EQ(sectors, int64_t{whole_layout} * 2048);
    for (const TAVOPARTLAYOUT &row : grgAllTavoPartLayout) {
        const int version = row.nVersion;
        const bool raid = row.fRaid != 0;
        SCOPED_TRACE("version " + std::to_string(version) + (raid ? " with RAID" : ""));
        SetRaidModel(raid);
        ASSERT_EQ(PartitionCreate("/dev/sda", PARTITION_SYSTEM, &version), 0);
        EXPECT_EQ(VersionOf("/dev/sda", raid), version);
        EXPECT_EQ(VersionOf("/dev/sda", !raid), 0);
        ASSERT_EQ(PartitionCreate("/dev/sda", PARTITION_DATA, &version), 0);

        const Place one = {row.place1.nStart, row.place1.cSector, row.place1.nType};
        const Place two = {row.place2.nStart, row.place2.cSector, row.place2.nType};
        const int64_t data = two.start + two.sectors + static_cast<int64_t>(row.cGap);
        const Place three = {data, sectors - data, row.place3.nType};
        EXPECT_EQ(TableOf("/dev/sda"), (std::array<Place, 4>{one, two, three}));
        EXPECT_EQ(KernelSays("sda/sda1/start"), one.start);
        EXPECT_EQ(KernelSays("sda/sda2/size"), two.sectors);
        EXPECT_EQ(KernelSays("sda/sda3/start"), three.start);
        EXPECT_EQ(KernelSays("sda/sda3/size"), three.sectors);

        TavoPartitionLayout layout;
        ASSERT_EQ(DiskPartitionsLayoutGet("sda", &layout), 0);
        EXPECT_EQ(layout.nKind, DISK_LAYOUT_SYSTEM);
        EXPECT_EQ(layout.nEntry, 4);
        EXPECT_EQ(layout.rgEntry[3].nKind, DISK_ENTRY_DATA);
        EXPECT_EQ(layout.rgEntry[3].cBlock, three.sectors / 2);
    }
}

// Disks that an older appliance has made: their sectors, by the numbers of those days.
TEST_P(MachinePartitions, DisksOfOldAppliancesAreRecognised)
{
    test::PlugLargeDisks(1, whole_layout);
    const struct {
        int version, raid;
        uint32_t start1, sectors1, start2, sectors2;
        unsigned char type1, type2;
    } disks[] = {
        {1, 0, 63, 273042, 273105, 787185, 0x83, 0x82},
        {1, 1, 63, 1574307, 1574370, 787185, 0xFD, 0xFD},
        {2, 0, 63, 4980087, 4980150, 1044225, 0x83, 0x82},
        {2, 1, 63, 4980087, 4980150, 1044225, 0xFD, 0xFD},
        {6, 0, 63, 4980087, 4980150, 4192965, 0x83, 0x82},
        {6, 1, 63, 4980087, 4980150, 4192965, 0xFD, 0xFD},
        {7, 1, 256, 4980480, 4980736, 4194304, 0xFD, 0xFD},
        {0, 1, 63, 273042, 273105, 787185, 0xFD, 0xFD},      // of version 1 without RAID
        {0, 1, 256, 4980480, 4980737, 4194304, 0xFD, 0xFD},  // a sector further
    };
    for (const auto &disk : disks) {
        unsigned char sector[512] = {};
        const auto put = [&](size_t at, uint32_t start, uint32_t sectors, unsigned char type) {
            sector[at + 4] = type;
            for (size_t i = 0; i < 4; ++i) {
                sector[at + 8 + i] = static_cast<unsigned char>(start >> 8 * i);
                sector[at + 12 + i] = static_cast<unsigned char>(sectors >> 8 * i);
            }
        };
        put(446, disk.start1, disk.sectors1, disk.type1);
        put(462, disk.start2, disk.sectors2, disk.type2);
        sector[510] = 0x55;
        sector[511] = 0xAA;
        const int fd = ::open("/dev/sda", O_WRONLY | O_CLOEXEC);
        ASSERT_EQ(::write(fd, sector, sizeof sector), 512);
        ::close(fd);
        Told("blockdev --rereadpt /dev/sda");
        EXPECT_EQ(VersionOf("/dev/sda", disk.raid), disk.version) << disk.version << " " << disk.raid;
        EXPECT_EQ(VersionOf("/dev/sda", !disk.raid), 0);
    }
}

TEST_P(MachinePartitions, CleaningLeavesWhatItShould)
{
    test::PlugLargeDisks(1, whole_layout);
    ASSERT_EQ(PartitionCreate("/dev/sda", PARTITION_SYSTEM, nullptr), 0);
    ASSERT_EQ(PartitionCreate("/dev/sda", PARTITION_DATA, nullptr), 0);
    ASSERT_EQ(
        test::Make({.path = "/dev/md9", .level = RAID_LEVEL_1, .members = {"/dev/sda3"}, .slots = 2, .sync = false}),
        0);
    ASSERT_EQ(RAIDStop("/dev/md9"), 0);
    RAIDSUPERBLOCK superblock;
    ASSERT_EQ(RAIDSBGet("/dev/sda3", &superblock), 1);

    EXPECT_EQ(PartitionClean("/dev/sda", PARTITION_DATA), 0);
    EXPECT_EQ(TableOf("/dev/sda")[2], Place{});
    EXPECT_EQ(TableOf("/dev/sda")[1].sectors, 4194304);
    int kind = 0;
    EXPECT_EQ(PartitionTableTypeGet("/dev/sda", &kind), 0);
    EXPECT_EQ(kind, PARTITION_TABLE_MBR);

    EXPECT_EQ(PartitionClean("/dev/sda", PARTITION_SYSTEM), 0);
    EXPECT_EQ(TableOf("/dev/sda"), (std::array<Place, 4>{}));
    Told("blockdev --rereadpt /dev/sda");
    EXPECT_EQ(KernelSays("sda/sda1/start"), -1);
    Told("dd if=/dev/zero of=/dev/sda bs=512 count=1 conv=fsync");
    EXPECT_EQ(PartitionTableTypeGet("/dev/sda", &kind), 0);
    EXPECT_EQ(kind, PARTITION_TABLE_NONE);
    // What fits on no such disk is refused, and nothing of it is left.
    EXPECT_EQ(PartitionCreate("/dev/sdb", PARTITION_SYSTEM, nullptr), -1);
    EXPECT_EQ(VersionOf("/dev/sdb", 1), 0);
}

}  // namespace
