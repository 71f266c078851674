// Devices beyond the 16 TiB that a 32-bit kernel reaches: refused there before any program runs, and nowhere else.
#include "tavo_lvm.h"
#include "tavo_partition.h"
#include "tavo_raid.h"

#include "storage/storage_scene.h"
#include "support/test.h"

#include <linux/fs.h>
#include <sys/syscall.h>
#include <sys/utsname.h>

namespace {

const char *machine_answer = nullptr;

}  // namespace

extern "C" int uname(struct utsname *name) noexcept
{
    const auto result = static_cast<int>(::syscall(SYS_uname, name));
    if (machine_answer)
        std::snprintf(name->machine, sizeof name->machine, "%s", machine_answer);
    return result;
}

namespace {

using test::MakeList;

constexpr uint64_t kTib = uint64_t{1} << 40;
const RAIDINFO raid5 = {2, "/dev/md2", RAID_LEVEL_5, 1, 0, 8 * kTib, 4 * kTib, 3, 3, 0, nullptr};

class Reach : public test::StorageScene {
  protected:
    Reach()
    {
        Model("supportraid=yes\n");
        PutNodes({"sda", "sda1", "sda2", "sda3", "sdb3", "sdc3", "sdd3", "md2", "md3"});
        calls_.OnIoctl([this](int, unsigned long request, void *argument) {
            if (request != BLKGETSIZE64) {
                errno = ENOTTY;
                return -1;
            }
            *static_cast<uint64_t *>(argument) = device_bytes_;
            return 0;
        });
    }
    ~Reach() override { machine_answer = nullptr; }

    // An array of that many members, sda3 and so on.
    static int Create(int level, size_t members, int slots, uint64_t used = 0)
    {
        std::vector<std::string> paths = {"/dev/sda3", "/dev/sdb3", "/dev/sdc3"};
        paths.resize(members);
        const test::List list = MakeList(paths);
        const RAIDREQUEST request = {"/dev/md2", nullptr, level, 0, slots, used, list.get(), 0};
        return RAIDCreate(&request);
    }

    // Whether it is refused, with its reason, before a program runs.
    bool IsRefused(const std::function<int()> &call)
    {
        commands_.Clear();
        log_.Clear();
        const int result = call();
        const bool said = !log_.Texts().empty() && log_.Texts()[0].ends_with(kReason);
        EXPECT_EQ(said, commands_.Commands().empty()) << testing::PrintToString(log_.Texts());
        EXPECT_EQ(said, result == -1);
        return said;
    }

    static constexpr const char *kReason = "is larger than the 16 TiB of one device that this system can reach";
    uint64_t device_bytes_ = 0;  // of every device
};

TEST_F(Reach, NothingBeyondItIsMade)
{
    const RAIDINFO linear = {2, "/dev/md2", RAID_LEVEL_LINEAR, 1, 0, 8 * kTib, 0, 2, 2, 0, nullptr};
    const int version = 7;
    const auto group = MakeList({"/dev/md2", "/dev/md3"});
    LVMVGINFO *const info = LVMVgInfoAlloc();
    ASSERT_TRUE(info);
    std::snprintf(info->szVg, sizeof info->szVg, "/dev/vg1");
    ASSERT_GE(TLIBSzListPush(&info->pslPvs, "/dev/md2"), 0);
    ASSERT_GE(TLIBSzListPush(&info->pslPvs, "/dev/md3"), 0);
    commands_.OnCommand([](const std::string &command) -> test::CommandReply {
        return {0, command.starts_with("/sbin/vgs") ? "  lSQfeY-dso4-NzXN-Hbdv-wh1J-WThm-cNRXi7\n" : ""};
    });
    const struct {
        std::function<int()> call;
        uint64_t largest;  // device that is taken
        const char *what;
    } rows[] = {
        {[] { return PartitionAddTable("/dev/sda"); }, 16 * kTib, "table"},
        {[&] { return PartitionCreate("/dev/sda", PARTITION_SYSTEM, &version); }, 16 * kTib, "system"},
        {[&] { return PartitionCreate("/dev/sda", PARTITION_DATA, &version); }, 16 * kTib, "data"},
        {[] { return PartitionClean("/dev/sda", PARTITION_SYSTEM | PARTITION_DATA); }, 16 * kTib, "clean"},
        {[] { return Create(RAID_LEVEL_LINEAR, 2, 2); }, 8 * kTib, "linear"},
        {[] { return Create(RAID_LEVEL_0, 2, 2); }, 8 * kTib, "RAID 0"},
        {[] { return Create(RAID_LEVEL_1, 2, 2); }, 16 * kTib, "RAID 1"},
        {[] { return Create(RAID_LEVEL_1, 2, 2, kTib); }, 16 * kTib, "a part of RAID 1"},
        {[] { return Create(RAID_LEVEL_5, 3, 3); }, 8 * kTib, "RAID 5"},
        {[] { return Create(RAID_LEVEL_5, 2, 5); }, 4 * kTib, "RAID 5, degraded"},
        {[] { return Create(RAID_LEVEL_6, 2, 4); }, 8 * kTib, "RAID 6"},
        {[] { return Create(RAID_LEVEL_10, 2, 4); }, 8 * kTib, "RAID 10"},
        {[&] { return RAIDAdd(&linear, "/dev/sdb3"); }, 8 * kTib, "longer"},
        {[] { return RAIDAdd(&raid5, "/dev/sdd3"); }, 16 * kTib, "a member"},
        {[] { return LVMPvCreate("/dev/md2"); }, 16 * kTib, "volume"},
        {[&] { return LVMVgCreate("/dev/vg1", group.get()); }, 8 * kTib, "group"},
        {[&] { return LVMCreate(group.get(), "/dev/vg1", "lv", nullptr, 0); }, 8 * kTib, "all of it"},
        {[&] { return LVMPvExpand(info); }, 8 * kTib, "grown"},
    };
    for (const auto &row : rows) {
        SCOPED_TRACE(row.what);
        machine_answer = "armv7l";
        device_bytes_ = row.largest;
        EXPECT_FALSE(IsRefused(row.call));
        device_bytes_ = row.largest + (1 << 20);
        EXPECT_TRUE(IsRefused(row.call));
        device_bytes_ = 0;
        EXPECT_FALSE(IsRefused(row.call)) << "of unknown size";
        device_bytes_ = 40 * kTib;
        for (const char *wide : {"x86_64", "aarch64", "armv8l"}) {
            machine_answer = wide;
            EXPECT_FALSE(IsRefused(row.call)) << wide;
        }
    }
    LVMVgInfoFree(info);
}

TEST_F(Reach, NoArrayGrowsBeyondIt)
{
    machine_answer = "armv7l";
    device_bytes_ = 4 * kTib;
    EXPECT_FALSE(IsRefused([] { return RAIDDevCountChange(&raid5, 5); }));
    EXPECT_TRUE(IsRefused([] { return RAIDDevCountChange(&raid5, 6); }));
    const RAIDINFO raid1 = {2, "/dev/md2", RAID_LEVEL_1, 1, 0, 8 * kTib, 8 * kTib, 2, 2, 0, nullptr};
    EXPECT_FALSE(IsRefused([&] { return RAIDDevCountChange(&raid1, 9); }));
    EXPECT_FALSE(IsRefused([] { return RAIDDevCountChange(&raid5, 1); })) << "mdadm's to refuse";
    // The level cannot be changed back, so the size is looked at before it.
    const test::List eight = MakeList(std::vector<std::string>(8, "/dev/sdd3"));
    EXPECT_TRUE(IsRefused([&] { return RAIDMigrate2RAID6(&raid5, eight.get()); }));
    EXPECT_FALSE(IsRefused([] { return RAIDMigrate2RAID6(&raid5, MakeList({"/dev/sdd3"}).get()); }));
}

}  // namespace
