// Disks and partitions when memory runs out: the code, nothing left allocated, no output written.
#include "tavo_appliance.h"
#include "tavo_disk.h"
#include "tavo_partition.h"

#include "support/captured_log.h"
#include "support/device_tree.h"
#include "support/out_of_memory.h"
#include "support/recorded_calls.h"

#include <gtest/gtest.h>

#include <cerrno>
#include <cstdlib>
#include <cstring>

#include <linux/fs.h>

using test::FailEachAllocation;

namespace {

// A model with two bays and an expansion unit behind the second, and a disk in each place.
class Memory : public testing::Test {
  protected:
    Memory()
    {
        // Takes syslog's place and goes: lines are kept nowhere, or keeping them would be counted too.
        const test::CapturedLog silence;
        tree_.Put("/etc.defaults/tavoinfo.conf", "maxdisks=2\nsupportebox=yes\nesatadiskname=sdy\n");
        tree_.Put("/proc/partitions", "   8  0  98304 sda\n   8  1  98304 sda1\n");
        tree_.Put("/sys/class/ata_device/dev2.0/class", "pmp\n");
        tree_.Put("/sys/class/ata_link/link2/sata_spd", "3.0 Gbps\n");
        for (const char *name : {"sda", "sdaa"}) {
            tree_.AddDisk(std::string("/dev/") + name, 8, 0);
            tree_.Put(std::string("/sys/block/") + name + "/device/model", "model\n");
        }
    }

    test::DeviceTree tree_;
    test::RecordedCalls calls_{[](int, unsigned long request, void *argument) {
        const uint64_t bytes = 1 << 30;
        if (request == BLKGETSIZE64)
            return std::memcpy(argument, &bytes, sizeof bytes), 0;
        errno = ENOTTY;
        return -1;
    }};
};

TEST_F(Memory, Disks)
{
    FailEachAllocation("DiskListPush", 0, [] {
        DISKINFO info;
        DISKLIST *list = nullptr;
        const int result = DiskListPush(&list, &info);
        EXPECT_EQ(list == nullptr, result != 0);
        std::free(list);
        return result;
    });
    FailEachAllocation("TAVODiskEnum", 1, [] {
        int32_t *numbers = nullptr;
        const int result = TAVODiskEnum(1, &numbers);
        EXPECT_EQ(numbers == nullptr, result != 1);
        std::free(numbers);
        return result;
    });
    FailEachAllocation("TAVODiskGetInfo", 0, [] {
        TAVODISKINFO *info = nullptr;
        const int result = TAVODiskGetInfo(1, 2048, &info);
        EXPECT_EQ(info == nullptr, result != 0);
        std::free(info);
        return result;
    });
    FailEachAllocation("TAVOEBoxInfoEnum", 1, [] {
        TAVOEBOX *boxes = nullptr;
        const int result = TAVOEBoxInfoEnum(&boxes);
        EXPECT_EQ(boxes == nullptr, result != 1);
        std::free(boxes);
        return result;
    });
    FailEachAllocation("DiskContainerGet", 0, [] {
        int kind = 0;
        const int result = DiskContainerGet("/dev/sda", &kind);
        EXPECT_EQ(kind, result == 0 ? 1 : 0);
        return result;
    });
    FailEachAllocation("PartitionPathEnum", 2, [] {
        TLIBSZLIST *list = PslTLIBSzListAlloc(512);
        if (!list)
            return -1;
        const PARTITIONFILTER filter = {nullptr, 0};
        const int result = PartitionPathEnum(&filter, &list);
        TLIBSzListFree(list);
        return result;
    });
}

}  // namespace
