// Real partition tables: every layout that was ever shipped, made and recognised.
#include "tavo_file.h"

#include "real_storage.h"

#include <sstream>

namespace {

using test::Told;

using MachinePartitions = test::LivedTest;

INSTANTIATE_TEST_SUITE_P(, MachinePartitions, testing::ValuesIn(test::Lives()), test::LifeName);

constexpr int whole_layout = 4800;  // MiB; a version 7 needs 4608 before its data partition

// The table of sda: first sector, sectors and type of each partition, the first two as the kernel has them, too; then how
// many the kernel has.
std::string Table()
{
    return Told("/sbin/sfdisk -l -uS /dev/sda | while read -r node start end count type name; do "
                "part=/sys/block/sda/${node#/dev/}; echo $start $count $type, $(cat $part/start $part/size); done; "
                "ls -d /sys/block/sda/sda* 2>/dev/null | wc -l");
}

int VersionOf(const std::string &disk, int raid)
{
    int version = 0;
    return BlTAVOCheckPartitionLayout(disk.c_str(), raid, &version) == 1 ? version : 0;
}

TEST_P(MachinePartitions, EveryLayoutIsMadeAndRecognised)
{
    test::PlugLargeDisks(1, whole_layout);
    constexpr int64_t sectors = int64_t{whole_layout} * 2048;
    for (const TAVOPARTLAYOUT &row : grgAllTavoPartLayout) {
        const int version = row.nVersion;
        const bool raid = row.fRaid != 0;
        SCOPED_TRACE("version " + std::to_string(version) + (raid ? " with RAID" : ""));
        ASSERT_EQ(TLIBFileSetKeyValue("/etc.defaults/tavoinfo.conf", "supportraid", raid ? "yes" : "no", nullptr), 1);
        ASSERT_EQ(PartitionCreate("/dev/sda", PARTITION_SYSTEM, &version), 0);
        EXPECT_EQ(VersionOf("/dev/sda", raid), version);
        EXPECT_EQ(VersionOf("/dev/sda", !raid), 0);
        ASSERT_EQ(PartitionCreate("/dev/sda", PARTITION_DATA, &version), 0);

        TAVOPARTPLACE data = row.place3;
        data.nStart = row.place2.nStart + row.place2.cSector + static_cast<int64_t>(row.cGap);
        data.cSector = sectors - data.nStart;
        std::ostringstream table;
        for (const TAVOPARTPLACE &place : {row.place1, row.place2, data}) {
            table << place.nStart << " " << place.cSector << " " << std::hex << place.nType << std::dec << ", "
                  << place.nStart << " " << place.cSector << "\n";
        }
        EXPECT_EQ(Table(), table.str() + "3\n");

        TavoPartitionLayout layout;
        ASSERT_EQ(DiskPartitionsLayoutGet("sda", &layout), 0);
        EXPECT_EQ(layout.nKind, DISK_LAYOUT_SYSTEM);
        EXPECT_EQ(layout.nEntry, 4);
        EXPECT_EQ(layout.rgEntry[3].nKind, DISK_ENTRY_DATA);
        EXPECT_EQ(layout.rgEntry[3].cBlock, data.cSector / 2);
    }
}

TEST_P(MachinePartitions, CleaningLeavesWhatItShould)
{
    test::PlugLargeDisks(1, whole_layout);
    ASSERT_EQ(PartitionCreate("/dev/sda", PARTITION_SYSTEM, nullptr), 0);
    const std::string system = Table();
    ASSERT_EQ(PartitionCreate("/dev/sda", PARTITION_DATA, nullptr), 0);
    EXPECT_EQ(PartitionClean("/dev/sda", PARTITION_DATA), 0);
    Told("blockdev --rereadpt /dev/sda");  // the call leaves that to its caller
    EXPECT_EQ(Table(), system);
    int kind = 0;
    EXPECT_EQ(PartitionTableTypeGet("/dev/sda", &kind), 0);
    EXPECT_EQ(kind, PARTITION_TABLE_MBR);
    EXPECT_EQ(PartitionClean("/dev/sda", PARTITION_SYSTEM), 0);
    Told("blockdev --rereadpt /dev/sda");
    EXPECT_EQ(Table(), "0\n");
    Told("dd if=/dev/zero of=/dev/sda bs=512 count=1 conv=fsync");
    EXPECT_EQ(PartitionTableTypeGet("/dev/sda", &kind), 0);
    EXPECT_EQ(kind, PARTITION_TABLE_NONE);
    // What fits on no such disk is refused, and nothing of it is left.
    EXPECT_EQ(PartitionCreate("/dev/sdb", PARTITION_SYSTEM, nullptr), -1);
    EXPECT_EQ(VersionOf("/dev/sdb", 1), 0);
}

}  // namespace
