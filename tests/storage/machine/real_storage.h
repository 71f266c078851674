// What tests on the machine's own disks share: disks that are blank, or had a life. After each case the machine is as it
// was: no arrays or volumes, disks empty.
#ifndef TESTS_STORAGE_MACHINE_REAL_STORAGE_H
#define TESTS_STORAGE_MACHINE_REAL_STORAGE_H

#include "tavo_disk.h"
#include "tavo_lvm.h"
#include "tavo_partition.h"
#include "tavo_raid.h"

#include "support/container_text.h"
#include "support/eventually.h"
#include "support/machine.h"

#include <algorithm>
#include <cstdlib>
#include <iterator>
#include <memory>
#include <numeric>
#include <string>
#include <vector>

#include <unistd.h>

namespace test {

// What disks held before a case. Each case runs on blank disks and on used ones: of one kind, chosen by the name of the case,
// with TAVO_LONG_TESTS (run-tests --long) of every kind.
inline constexpr const char *kLives[] = {"volume", "superblocks", "lvm", "guid_table", "file_system"};

inline std::vector<std::string> Lives()
{
    std::vector<std::string> lives = {"blank"};
    if (std::getenv("TAVO_LONG_TESTS"))
        lives.insert(lives.end(), std::begin(kLives), std::end(kLives));
    else
        lives.emplace_back("used");
    return lives;
}

inline std::string current_life = "blank";

// Has the disks in bays 1 to count live.
void LiveOn(int count);

class StorageTest : public MachineTest {
  protected:
    void TearDown() override
    {
        if (!OnMachine())
            return;
        Shell("grep -E ' /(mnt|volume)' /proc/mounts | while read -r source place rest; do umount $place; done");
        Told("/usr/lib/tavo-machine/reset; rm -rf /dev/vg* /volume*");
    }
};

// A case of this one runs once for each of Lives().
class LivedTest : public StorageTest, public testing::WithParamInterface<std::string> {
  protected:
    void SetUp() override
    {
        StorageTest::SetUp();
        if (IsSkipped())
            return;
        const std::string name = testing::UnitTest::GetInstance()->current_test_info()->name();
        current_life = GetParam();
        if (current_life == "used")
            current_life = kLives[std::accumulate(name.begin(), name.end(), 0u) % std::size(kLives)];
        RecordProperty("life", current_life);
        LiveOn(6);
    }

    void TearDown() override
    {
        current_life = "blank";
        StorageTest::TearDown();
    }
};

inline std::string LifeName(const testing::TestParamInfo<std::string> &info)
{
    return info.param;
}

using Array = std::unique_ptr<RAIDINFO, decltype(&RAIDInfoFree)>;

// Empty where there is no such array.
inline Array ReadArray(const std::string &path)
{
    RAIDINFO *info = nullptr;
    if (RAIDInfoGet(path.c_str(), &info) != 1)
        info = nullptr;
    return {info, RAIDInfoFree};
}

inline int StatusOf(const std::string &path)
{
    const Array array = ReadArray(path);
    return array ? array->nStatus : 0;
}

// The paths of the members in one of these states.
inline std::vector<std::string> MembersOf(const std::string &path, int states)
{
    std::vector<std::string> members;
    const Array array = ReadArray(path);
    for (const RAIDMEMBER *member = array ? array->pMembers : nullptr; member; member = member->pNext) {
        if (member->nState & states)
            members.emplace_back(member->szPath);
    }
    return members;
}

struct Making {
    int slots = 0;  // 0: as many as members
    int spares = 0;
    uint64_t mib = 0;  // of each member
    bool sync = false;
};

inline int Make(const std::string &path, int level, const std::vector<std::string> &paths, const Making &making = {})
{
    const List members = MakeList(paths);
    RAIDREQUEST request = {};
    request.szPath = path.c_str();
    request.fLevel = level;
    request.nSpare = making.spares;
    request.nSlot = making.slots ? making.slots : static_cast<int>(paths.size()) - making.spares;
    request.cbArray = making.mib << 20;
    request.pslMembers = members.get();
    request.fSync = making.sync ? 1 : 0;
    return RAIDCreate(&request);
}

// What can be read from a device again; the kernel keeps none of it.
inline std::string SumOf(const std::string &device, int mib)
{
    return Told("echo 3 >/proc/sys/vm/drop_caches; timeout 60 head -c " + std::to_string(mib) + "M " + device +
                " | md5sum");
}

// Fills the beginning of a device, and returns its sum.
inline std::string Fill(const std::string &device, int mib)
{
    Told("dd if=/dev/urandom of=" + device + " bs=1M conv=fsync count=" + std::to_string(mib));
    return SumOf(device, mib);
}

inline bool BecomesNormal(const std::string &path)
{
    return Eventually([&] {
        const Array array = ReadArray(path);
        return array && array->nStatus == RAID_STATUS_NORMAL && !array->fRebuilding;
    });
}

inline std::string Disk(int bay)
{
    return std::string("/dev/sd") + static_cast<char>('a' + bay - 1);
}

// A disk without a life.
inline void PlugBlank(int bay)
{
    Happen("pull " + std::to_string(bay));
    Happen("plug " + std::to_string(bay) + " --blank");
}

// The disks in bays 1 to count, replaced by others of that size; the others are blank.
inline void PlugLargeDisks(int count, int mib)
{
    for (int bay = count + 1; bay <= 6 && current_life != "blank"; ++bay)
        PlugBlank(bay);
    for (int bay = 1; bay <= count; ++bay) {
        Happen("pull " + std::to_string(bay));
        Happen("plug " + std::to_string(bay) + " --blank " + std::to_string(mib));
    }
    LiveOn(count);
}

inline void Partition(int bay)
{
    const std::string disk = Disk(bay);
    ASSERT_EQ(PartitionCreate(disk.c_str(), PARTITION_SYSTEM, nullptr), 0) << disk;
    ASSERT_EQ(PartitionCreate(disk.c_str(), PARTITION_DATA, nullptr), 0) << disk;
}

// The same with the partitions of the system and of data.
inline void PlugSystemDisks(int count, int mib)
{
    PlugLargeDisks(count, mib);
    for (int bay = 1; bay <= count; ++bay) {
        if (current_life == "volume") {  // partitions at the same places would show its arrays again
            EXPECT_EQ(PartitionClean(Disk(bay).c_str(), PARTITION_SYSTEM | PARTITION_DATA), 0);
        }
        Partition(bay);
    }
}

// As when the kernel finds that a member does not answer.
inline void FailMember(const std::string &array, const std::string &member)
{
    Told("echo faulty >/sys/block/" + array.substr(5) + "/md/dev-" + member.substr(5) + "/state");
}

inline void LiveOn(int count)
{
    if (current_life == "blank")
        return;
    SCOPED_TRACE("disks that held: " + current_life);
    std::vector<std::string> disks;
    std::string names;
    for (int bay = 1; bay <= count; ++bay) {
        disks.push_back(Disk(bay));
        names += " " + Disk(bay);
    }
    if (current_life == "volume") {
        // As the case makes them: an array and a group of the same names.
        const bool system = Told("cat /sys/block/sda/size").size() > 7;  // room for the system's partitions
        if (system) {
            Told("tavoctl partition create --yes" + names);
            for (std::string &disk : disks)
                disk += "3";
        }
        const int level = count > 2 ? RAID_LEVEL_5 : RAID_LEVEL_1;
        ASSERT_EQ(Make("/dev/md2", level, disks, {.slots = std::max(count, 2), .mib = 64}), 0);
        Told("tavoctl volume create --yes 1 md2 && date >/volume1/old && tavoctl volume unmount 1 && "
             "rmdir /volume1 && tavoctl raid stop --yes md2");
    } else if (current_life == "superblocks") {
        ASSERT_EQ(Make("/dev/md7", RAID_LEVEL_1, disks, {.slots = std::max(count, 2), .mib = 32}), 0);
        ASSERT_EQ(RAIDStop("/dev/md7"), 0);
    } else if (current_life == "lvm") {
        // Another name than that of the group on smaller disks before, some of which may still be there.
        const std::string group = "foreign" + std::to_string(count);
        Told("pvcreate -q -ff -y" + names + " && vgcreate -q " + group + names +
             " && lvcreate -q -W n -l50%VG -n data " + group + " && vgchange -q -an " + group);
    } else if (current_life == "guid_table") {
        for (const std::string &disk : disks)
            Told("printf 'g\\nn\\n\\n\\n\\nw\\n' | fdisk " + disk);
    } else {
        for (const std::string &disk : disks)
            Told("mkfs.ext4 -q -F " + disk);
    }
}

}  // namespace test

#endif
