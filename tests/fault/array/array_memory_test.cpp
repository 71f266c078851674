// Arrays and volumes when memory runs out: the code, nothing left allocated, no output written.
#include "tavo_lvm.h"
#include "tavo_raid.h"

#include "support/captured_log.h"
#include "support/captures.h"
#include "support/device_tree.h"
#include "support/out_of_memory.h"
#include "support/recorded_calls.h"
#include "support/scenario.h"

#include <gtest/gtest.h>

#include <cerrno>
#include <cstdlib>
#include <cstring>

#include <linux/fs.h>
#include <linux/major.h>
#include <linux/raid/md_u.h>

using test::FailEachAllocation;

namespace {

// A mirror of two disks, with a volume group on it.
class ArrayMemory : public testing::Test {
  protected:
    ArrayMemory()
    {
        const test::CapturedLog silence;
        tree_.Put("/etc.defaults/tavoinfo.conf", "maxdisks=2\nsupportraid=yes\n");
        tree_.Put("/dev/md2", "");
        tree_.Put("/sys/block/md2/md/array_state", "clean\n");
        tree_.Put("/sys/block/md2/size", "196608\n");
        tree_.Link("/sys/dev/block/8:3", "../../block/sda/sda3");
        tree_.Link("/sys/dev/block/8:19", "../../block/sdb/sdb3");
        scenario_.ExpectAny("/sbin/mdadm").Prints(test::Capture("mdadm_E_1.2-mdadm-4.2")).AnyTimes();
        scenario_.ExpectAny("/sbin/vgs").Prints(test::Capture("vgs-lvm2-2.03")).AnyTimes();
        scenario_.ExpectAny("/sbin/pvs")
            .Prints("  /dev/md2|vg1|lSQfeY-dso4-NzXN-Hbdv-wh1J-WThm-cNRXi7|2\n"
                    "  /dev/md3|vg1|lSQfeY-dso4-NzXN-Hbdv-wh1J-WThm-cNRXi7|2\n")
            .AnyTimes();
    }

    test::DeviceTree tree_;
    test::RecordedCalls calls_{[](int, unsigned long request, void *argument) {
        if (request == GET_ARRAY_INFO) {
            mdu_array_info_t info = {};
            info.level = 1;
            info.raid_disks = info.nr_disks = info.working_disks = 2;
            std::memcpy(argument, &info, sizeof info);
            return 0;
        }
        if (request == GET_DISK_INFO) {
            auto *disk = static_cast<mdu_disk_info_t *>(argument);
            if (disk->number < 2) {
                disk->major = 8;
                disk->minor = 3 + 16 * disk->number;
                disk->state = 6;  // active and in sync
            }
            return 0;
        }
        errno = ENOTTY;
        return -1;
    }};
    test::Scenario scenario_;
};

TEST_F(ArrayMemory, Arrays)
{
    FailEachAllocation("RAIDInfoGet", 1, [] {
        RAIDINFO *info = nullptr;
        const int result = RAIDInfoGet("/dev/md2", &info);
        EXPECT_EQ(info == nullptr, result != 1);
        RAIDInfoFree(info);
        return result;
    });
    FailEachAllocation("RAIDInfoEnum", 1, [] {
        RAIDLIST *list = nullptr;
        const int result = RAIDInfoEnum(&list);
        EXPECT_EQ(list == nullptr, result != 1);
        RAIDListFree(list);
        return result;
    });
    FailEachAllocation("RAIDInfoDup", 0, [] {
        RAIDMEMBER members[] = {{"/dev/sda3", 1, &members[1]}, {"/dev/sdb3", 1, nullptr}};
        RAIDINFO info = {};
        info.pMembers = members;
        RAIDINFO *copy = RAIDInfoDup(&info);
        RAIDInfoFree(copy);
        return copy ? 0 : -1;
    });
    FailEachAllocation("RAIDSBEnum", 2, [] {
        char first[] = "/dev/sda3";
        char second[] = "/dev/sdb3";
        char *items[] = {first, second};
        TLIBSZLIST *list = PslTLIBSzListAlloc(512);
        if (!list)
            return -1;
        for (const char *item : items)
            TLIBSzListPush(&list, item);
        RAIDSBENTRY *entries = nullptr;
        const int result = RAIDSBEnum(list, &entries);
        EXPECT_EQ(entries == nullptr, result != 2);
        std::free(entries);
        TLIBSzListFree(list);
        return result;
    });
    FailEachAllocation("RAIDUUIDGet", 1, [] {
        char uuid[64] = "";
        const int result = RAIDUUIDGet("/dev/md2", uuid, sizeof uuid);
        EXPECT_EQ(*uuid == 0, result != 1);
        return result;
    });
}

TEST_F(ArrayMemory, Volumes)
{
    FailEachAllocation("LVMPvSBEnum", 2, [] {
        LVMPVLIST *list = nullptr;
        const int result = LVMPvSBEnum(&list);
        EXPECT_EQ(list == nullptr, result != 2);
        LVMPvSBListFree(list);
        return result;
    });
    FailEachAllocation("LVMVgSB2Info", 0, [] {
        LVMVG group = {};
        std::strcpy(group.szVg, "/dev/vg1");
        std::strcpy(group.szUuid, "lSQfeY-dso4-NzXN-Hbdv-wh1J-WThm-cNRXi7");
        LVMVGINFO *info = LVMVgInfoAlloc();
        if (!info)
            return -1;
        const int result = LVMVgSB2Info(&group, info);
        EXPECT_EQ(info->fValid, result == 0 ? 1 : 0);
        EXPECT_TRUE(info->nPv == 0 || (result == 0 && info->nPv == 2)) << info->nPv;
        LVMVgInfoFree(info);
        return result;
    });
    FailEachAllocation("LVMVgSBGet", 1, [] {
        LVMVG group = {};
        const int result = LVMVgSBGet("/dev/vg1", &group);
        EXPECT_EQ(*group.szUuid == 0, result != 1);
        return result;
    });
}

}  // namespace
