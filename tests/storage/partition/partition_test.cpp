// Layouts: recognised by their exact sectors, created and cleaned by exactly these commands.
#include "tavo_partition.h"

#include "storage/storage_scene.h"
#include "support/test.h"

namespace {

TEST(PartitionTables, NeverChange)
{
    std::string table(reinterpret_cast<const char *>(grgAllTavoPartLayout), sizeof grgAllTavoPartLayout);
    for (const PARTTYPE *row = PartType; row->szName; ++row)
        table += std::to_string(row->nType) + row->szName + std::to_string(row->fWindows);
    uint64_t sum = 0;
    for (const char byte : table)
        sum = sum * 1099511628211u + static_cast<unsigned char>(byte);
    EXPECT_EQ(sum, 359416277275614390u) << "programs were compiled against these bytes";
    EXPECT_EQ(PartType[48].nType, 0u);
}

TEST(TAVOPartitionLayoutIdxGet, Table)
{
    const struct {
        int version, raid, index;
    } rows[] = {{0, 0, 5},  {0, 1, 9},  {7, 1, 9}, {1, 0, 0},  {1, 1, 6}, {2, 1, 7},  {3, 0, 2},   {3, 1, -1},
                {4, 0, -1}, {4, 1, -1}, {5, 0, 3}, {5, 1, -1}, {6, 1, 8}, {8, 0, -1}, {-1, 0, -1}, {7, 2, -1}};
    for (const auto &row : rows)
        EXPECT_EQ(TAVOPartitionLayoutIdxGet(row.version, row.raid), row.index) << row.version << " " << row.raid;
}

std::string SfdiskLine(const TAVOPARTPLACE &place)
{
    char line[128];
    std::snprintf(line, sizeof line, "x %lld 0 %lld %x name\n", static_cast<long long>(place.nStart),
                  static_cast<long long>(place.cSector), static_cast<unsigned>(place.nType));
    return line;
}

class Partitions : public test::StorageStory {
  protected:
    // What the partitioning tool shows of the first two partitions of a disk; other disks have none.
    void Show(const std::string &disk, const TAVOPARTPLACE &first, const TAVOPARTPLACE &second)
    {
        commands_.Print({{"/sbin/sfdisk -l -uS -N1 /dev/" + disk, SfdiskLine(first)},
                         {"/sbin/sfdisk -l -uS -N2 /dev/" + disk, SfdiskLine(second)}},
                        1);
    }
};

TEST_F(Partitions, EveryLayoutIsRecognisedAndNothingElse)
{
    for (const TAVOPARTLAYOUT &layout : grgAllTavoPartLayout) {
        TAVOPARTPLACE later = layout.place1, longer = layout.place1, after = layout.place2, shorter = layout.place2;
        ++later.nStart, ++longer.cSector, ++after.nStart, --shorter.cSector;
        const std::pair<TAVOPARTPLACE, TAVOPARTPLACE> tables[] = {{layout.place1, layout.place2},
                                                                  {later, layout.place2},
                                                                  {longer, layout.place2},
                                                                  {layout.place1, after},
                                                                  {layout.place1, shorter}};
        story_.Head("version " + std::to_string(layout.nVersion) + (layout.fRaid ? " with RAID" : ""));
        for (const auto &[first, second] : tables) {
            Show("sda", first, second);
            int version = -1;
            TELL(BlTAVOCheckPartitionLayout("/dev/sda", static_cast<int>(layout.fRaid), &version));
            story_.Show("version", version);
        }
        Show("sda", layout.place1, layout.place2);
        TELL(BlTAVOCheckPartitionLayout("/dev/sda", 1 - static_cast<int>(layout.fRaid), nullptr));  // other types
    }
    // The RAID layout of version 1 has other sectors.
    Show("sda", {63, 273042, 0xFD}, {273105, 787185, 0xFD});
    for (const char *disk : {"sda", static_cast<const char *>(nullptr), "sdb"})
        TELL(BlTAVOCheckPartitionLayout(disk, 1, nullptr));
}

TEST_F(Partitions, ConfigsAreTheToolsAnswer)
{
    const std::string query = "/sbin/sfdisk -l -uS -N3 /dev/sda";
    commands_.Print({{query, "/dev/sda3 9437184 11721045167 11711607984 fd Linux\nsecond line\n"}});
    int64_t start = 0;
    uint32_t type = 0;
    TELL(RCPartitionConfigs(3, "/dev/sda", &start, &type));
    story_.Show("start", start);
    story_.Show("type", type);
    TELL(RCPartitionConfigs(3, "sda", nullptr, nullptr));
    start = 5;
    TELL(RCPartitionConfigs(0, "sda", &start, &type));
    TELL(RCPartitionConfigs(-1, "sda", &start, &type));
    TELL(RCPartitionConfigs(1, nullptr, &start, &type));
    for (const char *output : {"", "\n", "sfdisk: no such disk\n", "/dev/sda1 1 1 1\n"}) {
        commands_.Print({{query, output}});
        TELL(RCPartitionConfigs(3, "sda", &start, &type));
    }
    EXPECT_EQ(start, 5);
}

TEST_F(Partitions, VersionOfTheSystem)
{
    int version = 0;
    const auto get = [&] {
        TELL(PartitionLayoutGet(&version));
        story_.Show("version", version);
    };
    Model("supportraid=\"yes\"\nmaxdisks=\"2\"\n");
    get();  // nothing is recognised
    Show("sdc", grgAllTavoPartLayout[8].place1, grgAllTavoPartLayout[8].place2);
    for (const char *member : {"sda1", "sdc1", "sdd1"})
        tree_.Put(std::string("/sys/block/md0/md/dev-") + member + "/state", "in_sync\n");
    get();
    tree_.Remove("/sys/block/md0");
    Model("supportraid=\"no\"\nmaxdisks=\"4\"\n");
    Show("sdd", grgAllTavoPartLayout[2].place1, grgAllTavoPartLayout[2].place2);
    get();
    TELL(PartitionLayoutGet(nullptr));
}

TEST_F(Partitions, CreateRunsExactlyTheseCommands)
{
    const int version_1 = 1;
    const int version_7 = 7;
    const int version_4 = 4;
    Model("supportraid=\"yes\"\n");
    TELL(PartitionCreate("/dev/sda", PARTITION_SYSTEM, &version_7));
    TELL(PartitionCreate("/dev/sda", PARTITION_DATA, &version_7));
    Model("supportraid=\"no\"\n");
    TELL(PartitionCreate("/dev/sdab", PARTITION_SYSTEM, &version_1));
    TELL(PartitionCreate("/dev/sdab", PARTITION_SYSTEM | PARTITION_DATA, &version_1));  // the data partition alone
    TELL(PartitionCreate("/dev/sda", PARTITION_SYSTEM, &version_4));
    TELL(PartitionCreate("/dev/sda", 0, &version_7));
    TELL(PartitionCreate(nullptr, PARTITION_DATA, &version_7));
    Model("supportraid=\"yes\"\n");
    for (const char *failing : {"-M1", "-N1", "-N2", "-N3"}) {
        commands_.Fail(failing, 3);
        story_.Head(failing + std::string(" fails"));
        TELL(PartitionCreate("/dev/sda", PARTITION_SYSTEM, &version_7));
        TELL(PartitionCreate("/dev/sda", PARTITION_DATA, &version_7));
    }
}

TEST_F(Partitions, CleanRunsExactlyTheseCommands)
{
    TELL(PartitionClean("/dev/sdb", PARTITION_DATA));
    TELL(PartitionClean("/dev/sdb", PARTITION_SYSTEM));
    commands_.Fail("-D");  // an entry that is not there is not a failure
    TELL(PartitionClean("/dev/sdb", PARTITION_DATA));
    commands_.Fail("-M1");
    TELL(PartitionClean("/dev/sdb", PARTITION_SYSTEM));
    TELL(PartitionCleanRAID("/dev/sdb", 0));
}

TEST_F(Partitions, RefusesToCleanPartitionsInUse)
{
    const int version = 7;
    const std::pair<const char *, const char *> rows[] = {
        // opened by the kernel itself, has a holder
        {"sdb1", ""}, {"", "sdb2/holders/md1"}, {"", "sdb3/holders/md2"},     {"sdb5", ""},
        {"sdb", ""},  {"", "sdb/holders/md9"},  {"sdc1", "sdc3/holders/md2"},
    };
    for (const auto &row : rows) {
        const std::string busy = row.first;
        const std::string held = row.second;
        for (const char *name : {"sdb", "sdb1", "sdb2", "sdb3", "sdb5"})
            tree_.Remove(std::string("/dev/") + name + test::DeviceTree::kBusy);
        tree_.Remove("/sys/class/block");
        if (!busy.empty())
            tree_.AddBusy("/dev/" + busy);
        if (busy.size() == 4)
            tree_.AddBusy("/dev/" + busy.substr(0, 3));  // as the kernel has it for the whole of such a disk
        if (!held.empty())
            tree_.Put("/sys/class/block/" + held, "");
        story_.Head("in use: " + busy + held);
        TELL(PartitionClean("/dev/sdb", PARTITION_DATA));
        TELL(PartitionClean("/dev/sdb", PARTITION_SYSTEM));
        TELL(PartitionCreate("/dev/sdb", PARTITION_DATA, &version));
        TELL(PartitionCreate("/dev/sdb", PARTITION_SYSTEM, &version));
    }
}

TEST_F(Partitions, SuperblocksThatTheCommandsWouldMissAreErasedFirst)
{
    const std::string superblock(test::Capture("mdadm_E_1.2_raid5-mdadm-4.2"));
    PutNodes({"sdb1", "sdb2", "sdb3", "sdb5", "sdb6"});
    commands_.Print(
        {{"/sbin/mdadm -E /dev/sdb2 2>/dev/null", superblock}, {"/sbin/mdadm -E /dev/sdb6 2>/dev/null", superblock}});
    TELL(PartitionClean("/dev/sdb", PARTITION_SYSTEM | PARTITION_DATA));
    commands_.Print({{"/sbin/mdadm -E /dev/sdb2 2>/dev/null", superblock}}, 1);
    TELL(PartitionClean("/dev/sdb", PARTITION_SYSTEM));  // it cannot be erased
}

TEST_F(Partitions, ExtendedIsOneTypeAlone)
{
    const std::pair<const char *, uint32_t> rows[] = {
        {"/dev/sda4", 0x0F}, {"/dev/sda4", 0x05}, {"/dev/sda4", 0x85}, {"/dev/sda", 0x0F}, {"sdab2", 0x0F}};
    for (const auto &row : rows) {
        commands_.OnCommand([&](const std::string &) -> test::CommandReply {
            return {0, SfdiskLine({1, 1, row.second})};
        });
        story_.Head(row.first + std::string(" of type ") + std::to_string(row.second));
        TELL(PartitionIsExtended(row.first));
    }
    TELL(PartitionIsExtended(nullptr));
}

TEST_F(Partitions, KindOfTable)
{
    int kind = 0;
    const std::string none(512, 0);
    const std::string empty = none.substr(0, 510) + "\x55\xAA";
    std::vector<std::string> sectors = {none, empty};
    for (const size_t entry : {0, 1, 2, 3})
        sectors.push_back(std::string(empty).replace(450 + 16 * entry, 1, "\xEE"));
    sectors.push_back("short");
    for (const std::string &sector : sectors) {
        tree_.Put("/dev/sda", sector);
        TELL(PartitionTableTypeGet("/dev/sda", &kind));
        story_.Show("kind", kind);
    }
    TELL(PartitionTableTypeGet("/dev/sdz", &kind));
    story_.Show("kind", kind);
}

TEST_F(Partitions, Paths)
{
    tree_.Put("/proc/partitions", test::Capture("proc_partitions_md_lvm-linux-6.1-armmp-lpae"));
    Model("");
    const auto enumerate = [&](const char *prefix, int containers, const std::vector<std::string> &begin = {}) {
        test::List list = test::MakeList(begin);
        const PARTITIONFILTER filter = {prefix, containers};
        TELL(test::Moving(list, [&](auto **addr) { return PartitionPathEnum(&filter, addr); }));
        story_.Show("paths", test::Items(list.get()));
    };
    enumerate("sdf", 0, {"/dev/zero", "/dev/a"});
    enumerate(nullptr, 0);  // the heading is not a partition
    enumerate("", 0);
    enumerate("md", 1);
    enumerate(nullptr, 1);
    tree_.Put("/proc/partitions", "");
    enumerate(nullptr, 0);
    tree_.Put("/proc/partitions", "8 0 5 sda x\n   8 0 5 sdb");  // also without a newline at its end
    enumerate(nullptr, 0);
}

TEST_F(Partitions, SpecialDevices)
{
    const std::pair<const char *, const char *> rows[] = {
        {"05ac", "1201"}, {"05ac", "1300"}, {"05ac", "120a"},  {"05ac", "1260"}, {"05ac", "1261"}, {"0781", "1201"},
        {"", "1201"},     {"5ac", "1201"},  {"05acx", "1201"}, {" 5ac", "1201"}, {"05ac1", "1201"}};
    const std::string usb = "/sys/devices/usb1/1-1/";
    tree_.Put(usb + "1-1:1.0/host6/target6:0:0/6:0:0:0/model", "x\n");
    tree_.Link("/sys/block/sdq/device", "../../devices/usb1/1-1/1-1:1.0/host6/target6:0:0/6:0:0:0");
    for (const auto &row : rows) {
        tree_.Put(usb + "idVendor", std::string(row.first) + "\n");
        tree_.Put(usb + "idProduct", std::string(row.second) + "\n");
        story_.Head(row.first + std::string(":") + row.second);
        TELL(TAVOCheckSpecialDevice("/dev/sdq"));
        TELL(TAVOCheckSpecialDevice("sdq1"));
    }
    TELL(TAVOCheckSpecialDevice("sda"));
}

// The real tool, on an image in the place of a disk.
TEST(PartitionsOnAnImage, EveryLayoutIsRecognisedAfterItsCreation)
{
    if (test::RootLacks("foreign-exec"))
        GTEST_SKIP() << "writes to /dev/sda: only in an appliance root that runs the partitioning tool";
    const test::CapturedLog log;
    test::Story story_{TEST_GOLDEN, {}};
    for (size_t i = 0; i < 2 * std::size(grgAllTavoPartLayout); ++i) {
        // The second is larger than an MS-DOS table describes, so its table keeps a copy in the last 33 sectors.
        const off_t sectors = i % 2 == 0 ? 8 << 21 : off_t{5860533168};
        const int version = grgAllTavoPartLayout[i / 2].nVersion;
        const int raid = static_cast<int>(grgAllTavoPartLayout[i / 2].fRaid);
        test::WriteFile("/etc.defaults/tavoinfo.conf", raid ? "supportraid=yes\n" : "supportraid=no\n");
        test::WriteFile("/dev/sda", "");
        ASSERT_EQ(::truncate("/dev/sda", sectors * 512), 0);
        int found = 0;
        const auto check = [&](int with_raid) {
            TELL(BlTAVOCheckPartitionLayout("/dev/sda", with_raid, &found));
        };
        story_.Head("version " + std::to_string(version) + (raid ? " with RAID, " : ", ") + std::to_string(sectors));
        check(raid);
        TELL(PartitionCreate("/dev/sda", PARTITION_DATA, &version));  // no table yet
        TELL(PartitionCreate("/dev/sda", PARTITION_SYSTEM, &version));
        TELL(PartitionCreate("/dev/sda", PARTITION_DATA, &version));
        check(1 - raid);
        check(raid);
        story_.Show("version", found);
        int64_t start = 0;
        uint32_t type = 0;
        TELL(RCPartitionConfigs(3, "/dev/sda", &start, &type));
        story_.Show("start", start);
        story_.Show("type", type);
        TELL(PartitionTableTypeGet("/dev/sda", &found));
        story_.Show("table", found);
        TELL(PartitionClean("/dev/sda", PARTITION_DATA));
        TELL(RCPartitionConfigs(3, "/dev/sda", nullptr, nullptr));
        check(raid);
        TELL(PartitionClean("/dev/sda", PARTITION_SYSTEM));
        check(raid);
    }
    ::unlink("/dev/sda");
}

}  // namespace
