// Layouts: recognised by their exact sectors, created and cleaned by exactly these commands.
#include "tavo_partition.h"

#include "storage/storage_scene.h"
#include "support/appliance_root.h"

#include <gmock/gmock.h>

#include <cstdio>
#include <functional>

#include <syslog.h>
#include <unistd.h>

using test::Quiet;
using testing::ElementsAre;
using testing::HasSubstr;
using testing::IsEmpty;

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

class Partitions : public test::StorageScene {
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
        const auto check = [&](const TAVOPARTPLACE &first, const TAVOPARTPLACE &second, int raid) {
            Show("sda", first, second);
            int version = -1;
            const int found = BlTAVOCheckPartitionLayout("/dev/sda", raid, &version);
            EXPECT_EQ(found == 1, version != -1);
            return version;
        };
        const int raid = static_cast<int>(layout.fRaid);
        EXPECT_EQ(check(layout.place1, layout.place2, raid), layout.nVersion);
        EXPECT_EQ(check(layout.place1, layout.place2, 1 - raid), -1) << "the types differ";
        TAVOPARTPLACE other = layout.place1;
        other.nStart += 1;
        EXPECT_EQ(check(other, layout.place2, raid), -1);
        other = layout.place2;
        other.cSector -= 1;
        EXPECT_EQ(check(layout.place1, other, raid), -1);
    }
    Show("sda", {63, 273042, 0xFD}, {273105, 787185, 0xFD});
    EXPECT_EQ(BlTAVOCheckPartitionLayout("sda", 1, nullptr), 0) << "the RAID layout of version 1 has other sectors";
    EXPECT_EQ(BlTAVOCheckPartitionLayout(nullptr, 1, nullptr), 0);
    EXPECT_EQ(log_.Take(), "");
    commands_.Clear();
    EXPECT_EQ(BlTAVOCheckPartitionLayout("sdb", 1, nullptr), 0);
    EXPECT_THAT(commands_.Take(), ElementsAre("/sbin/sfdisk -l -uS -N1 /dev/sdb"));
    EXPECT_EQ(log_.Lines().at(0).priority, LOG_DEBUG);
    EXPECT_EQ(log_.Take(), "partition_check_layout:# sdb: dont contain partition [1]");
}

TEST_F(Partitions, ConfigsAreTheToolsAnswer)
{
    const std::string query = "/sbin/sfdisk -l -uS -N3 /dev/sda";
    commands_.Print({{query, "/dev/sda3 9437184 11721045167 11711607984 fd Linux\nsecond line\n"}});
    int64_t start = 0;
    uint32_t type = 0;
    EXPECT_EQ(RCPartitionConfigs(3, "/dev/sda", &start, &type), 11711607984);
    EXPECT_EQ(start, 9437184);
    EXPECT_EQ(type, 0xFDu);
    EXPECT_EQ(RCPartitionConfigs(3, "sda", nullptr, nullptr), 11711607984);
    EXPECT_THAT(commands_.Take(), ElementsAre(query, query));
    start = 5;
    EXPECT_EQ(RCPartitionConfigs(0, "sda", &start, &type), -1);
    EXPECT_EQ(RCPartitionConfigs(-1, "sda", &start, &type), -1);
    EXPECT_EQ(RCPartitionConfigs(1, nullptr, &start, &type), -1);
    EXPECT_THAT(commands_.Take(), IsEmpty());
    for (const char *output : {"", "\n", "sfdisk: no such disk\n", "/dev/sda1 1 1 1\n"}) {
        commands_.Print({{query, output}});
        EXPECT_EQ(RCPartitionConfigs(3, "sda", &start, &type), -1) << output;
    }
    EXPECT_EQ(start, 5);
}

TEST_F(Partitions, VersionOfTheSystem)
{
    Model("supportraid=\"yes\"\nmaxdisks=\"2\"\n");
    int version = 0;
    EXPECT_EQ(PartitionLayoutGet(&version), 0);
    EXPECT_EQ(version, 7) << "nothing is recognised";
    EXPECT_THAT(commands_.Take(), ElementsAre("/sbin/sfdisk -l -uS -N1 /dev/sda", "/sbin/sfdisk -l -uS -N1 /dev/sdb"));

    Show("sdc", grgAllTavoPartLayout[8].place1, grgAllTavoPartLayout[8].place2);
    for (const char *member : {"sda1", "sdc1", "sdd1"})
        tree_.Put(std::string("/sys/block/md0/md/dev-") + member + "/state", "in_sync\n");
    EXPECT_EQ(PartitionLayoutGet(&version), 0);
    EXPECT_EQ(version, 6);
    EXPECT_THAT(commands_.Take(), ElementsAre("/sbin/sfdisk -l -uS -N1 /dev/sda", "/sbin/sfdisk -l -uS -N1 /dev/sdc",
                                              "/sbin/sfdisk -l -uS -N2 /dev/sdc"));
    tree_.Remove("/sys/block/md0");

    Model("supportraid=\"no\"\nmaxdisks=\"4\"\n");
    Show("sdd", grgAllTavoPartLayout[2].place1, grgAllTavoPartLayout[2].place2);
    EXPECT_EQ(PartitionLayoutGet(&version), 0);
    EXPECT_EQ(version, 3);
    EXPECT_EQ(PartitionLayoutGet(nullptr), -1);
}

TEST_F(Partitions, CreateRunsExactlyTheseCommands)
{
    const int version_1 = 1;
    const int version_7 = 7;
    const int version_4 = 4;
    Model("supportraid=\"yes\"\n");
    EXPECT_EQ(PartitionCreate("/dev/sda", PARTITION_SYSTEM, &version_7), 0);
    EXPECT_EQ(PartitionCreate("/dev/sda", PARTITION_DATA, &version_7), 0);
    EXPECT_THAT(commands_.Take(),
                ElementsAre(Quiet("/sbin/sfdisk -M1 /dev/sda"),
                            Quiet("/sbin/sfdisk -N1 -uS -q -f -j256 -z4980480 -tfd -F /dev/sda"),
                            Quiet("/sbin/sfdisk -N2 -uS -q -f -j0 -z4194304 -tfd -F /dev/sda"),
                            "/sbin/sfdisk -N3 -uS -q -f -j262144 -z-1 -tfd -F /dev/sda >/dev/null 2>&1"));
    Model("supportraid=\"no\"\n");
    EXPECT_EQ(PartitionCreate("/dev/sdab", PARTITION_SYSTEM, &version_1), 0);
    EXPECT_EQ(PartitionCreate("/dev/sdab", PARTITION_SYSTEM | PARTITION_DATA, &version_1), 0)
        << "the data partition alone";
    EXPECT_THAT(commands_.Take(),
                ElementsAre(Quiet("/sbin/sfdisk -M1 /dev/sdab"),
                            Quiet("/sbin/sfdisk -N1 -uS -q -f -j63 -z273042 -t83 -F /dev/sdab"),
                            Quiet("/sbin/sfdisk -N2 -uS -q -f -j0 -z787185 -t82 -F /dev/sdab"),
                            "/sbin/sfdisk -N3 -uS -q -f -j273042 -z-1 -t83 -F /dev/sdab >/dev/null 2>&1"));
    EXPECT_EQ(log_.Take(), "");
    EXPECT_EQ(PartitionCreate("/dev/sda", PARTITION_SYSTEM, &version_4), -1);
    EXPECT_EQ(PartitionCreate("/dev/sda", 0, &version_7), 0) << "nothing to do";
    EXPECT_EQ(PartitionCreate(nullptr, PARTITION_DATA, &version_7), -1);
    EXPECT_THAT(commands_.Take(), IsEmpty());
    EXPECT_EQ(log_.Take(), "partition_create:# Failed to get partition layout: version=4\n"
                           "partition_create:# Bad parameters");
}

TEST_F(Partitions, CreateStopsAtTheFirstFailure)
{
    Model("supportraid=\"yes\"\n");
    const int version = 7;
    const struct {
        const char *fails;
        size_t commands;
        const char *log;
    } rows[] = {
        {"-M1", 1, "partition_add_table:# Failed to add ms-dos signature to /dev/sda, err=3"},
        {"-N1", 2, "partition_create:# Failed to do '/sbin/sfdisk -N1 "},
        {"-N2", 3, "partition_create:# Failed to do '/sbin/sfdisk -N2 "},
    };
    for (const auto &row : rows) {
        commands_.Fail(row.fails, 3);
        EXPECT_EQ(PartitionCreate("/dev/sda", PARTITION_SYSTEM, &version), -1) << row.fails;
        EXPECT_EQ(commands_.Take().size(), row.commands) << row.fails;
        EXPECT_THAT(log_.Take(), testing::AllOf(testing::StartsWith(row.log), testing::EndsWith(", err=3")));
    }
}

TEST_F(Partitions, CleanRunsExactlyTheseCommands)
{
    const auto removed = [](int number) {
        return Quiet("/sbin/sfdisk -N" + std::to_string(number) + " -q -f --no-reread -o0 -z0 -t0 -F -D /dev/sdb");
    };
    EXPECT_EQ(PartitionClean("/dev/sdb", PARTITION_DATA), 0);
    std::vector<std::string> expected;
    for (int number = 15; number >= 3; --number)
        expected.push_back(removed(number));
    expected.push_back(Quiet("/sbin/mdadm --zero-superblock /dev/sdb3"));
    EXPECT_EQ(commands_.Take(), expected);

    EXPECT_EQ(PartitionClean("/dev/sdb", PARTITION_SYSTEM), 0);
    const std::string table = Quiet("/sbin/sfdisk -M1 /dev/sdb");
    EXPECT_THAT(commands_.Take(), ElementsAre(Quiet("/sbin/mdadm --zero-superblock /dev/sdb1"), removed(1), table,
                                              Quiet("/sbin/mdadm --zero-superblock /dev/sdb2"), removed(2), table));
    EXPECT_EQ(log_.Take(), "");

    commands_.Fail("-D");
    EXPECT_EQ(PartitionClean("/dev/sdb", PARTITION_DATA), 0) << "an entry that is not there is no failure";
    ASSERT_EQ(log_.Lines().size(), 13u);
    EXPECT_EQ(log_.Lines()[0].priority, LOG_DEBUG);
    EXPECT_THAT(log_.Take(), testing::StartsWith("partition_clean:# Failed to do '/sbin/sfdisk -N15 "));
    commands_.Fail("-M1");
    commands_.Clear();
    EXPECT_EQ(PartitionClean("/dev/sdb", PARTITION_SYSTEM), -1);
    EXPECT_EQ(commands_.Take().size(), 3u);
    EXPECT_EQ(PartitionCleanRAID("/dev/sdb", 0), -1);
}

TEST_F(Partitions, RefusesToCleanPartitionsInUse)
{
    const int version = 7;
    const struct {
        const char *busy;  // opened by the kernel itself
        const char *held;  // has a holder
        int clean_data, clean_system, create_data, create_system;
        const char *log;
    } rows[] = {
        {"sdb1", "", 0, -1, 0, -1, "/dev/sdb1 is in use: a file system or swap"},
        {"", "sdb2/holders/md1", 0, -1, 0, -1, "/dev/sdb2 is in use: md1"},
        {"", "sdb3/holders/md2", -1, -1, -1, -1, "/dev/sdb3 is in use: md2"},
        {"sdb5", "", -1, -1, 0, -1, "/dev/sdb5 is in use: a file system or swap"},
        {"sdb", "", -1, -1, -1, -1, "/dev/sdb is in use: a file system or swap"},
        {"", "sdb/holders/md9", -1, -1, -1, -1, "/dev/sdb is in use: md9"},
        {"sdc1", "sdc3/holders/md2", 0, 0, 0, 0, ""},
    };
    for (const auto &row : rows) {
        for (const char *name : {"sdb", "sdb1", "sdb2", "sdb3", "sdb5"})
            tree_.Remove(std::string("/dev/") + name + test::DeviceTree::kBusy);
        tree_.Remove("/sys/class/block");
        if (*row.busy)
            tree_.AddBusy(std::string("/dev/") + row.busy);
        if (std::string(row.busy).size() == 4)
            tree_.AddBusy("/dev/" + std::string(row.busy, 3));  // as the kernel has it for the whole of such a disk
        if (*row.held)
            tree_.Put(std::string("/sys/class/block/") + row.held, "");
        const std::pair<std::function<int()>, int> calls[] = {
            {[] { return PartitionClean("/dev/sdb", PARTITION_DATA); }, row.clean_data},
            {[] { return PartitionClean("/dev/sdb", PARTITION_SYSTEM); }, row.clean_system},
            {[&] { return PartitionCreate("/dev/sdb", PARTITION_DATA, &version); }, row.create_data},
            {[&] { return PartitionCreate("/dev/sdb", PARTITION_SYSTEM, &version); }, row.create_system},
        };
        for (const auto &[call, result] : calls) {
            EXPECT_EQ(call(), result) << row.busy << row.held;
            EXPECT_EQ(commands_.Take().empty(), result == -1);
            EXPECT_EQ(log_.Lines().size(), result == -1 ? 1u : 0u);
            EXPECT_THAT(log_.Take(), HasSubstr(result == -1 ? row.log : ""));
        }
    }
}

TEST_F(Partitions, SuperblocksThatTheCommandsWouldMissAreErasedFirst)
{
    const auto examine = [](const std::string &name) {
        return "/sbin/mdadm -E /dev/" + name + " 2>/dev/null";
    };
    const std::string superblock(test::Capture("mdadm_E_1.2_raid5-mdadm-4.2"));
    PutNodes({"sdb1", "sdb2", "sdb3", "sdb5", "sdb6"});
    commands_.Print({{examine("sdb2"), superblock}, {examine("sdb6"), superblock}});
    EXPECT_EQ(PartitionClean("/dev/sdb", PARTITION_SYSTEM | PARTITION_DATA), 0);
    std::vector<std::string> commands = commands_.Take();
    commands.resize(6);
    EXPECT_THAT(commands,
                ElementsAre(examine("sdb2"), Quiet("/sbin/mdadm --zero-superblock /dev/sdb2"), examine("sdb5"),
                            examine("sdb6"), Quiet("/sbin/mdadm --zero-superblock /dev/sdb6"),
                            Quiet("/sbin/sfdisk -N15 -q -f --no-reread -o0 -z0 -t0 -F -D /dev/sdb")));
    commands_.Print({{examine("sdb2"), superblock}}, 1);
    EXPECT_EQ(PartitionClean("/dev/sdb", PARTITION_SYSTEM), -1) << "it cannot be erased";
    EXPECT_EQ(commands_.Take().size(), 2u);
}

TEST_F(Partitions, ExtendedIsOneTypeAlone)
{
    const struct {
        const char *path;
        uint32_t type;
        int extended;
    } rows[] = {{"/dev/sda4", 0x0F, 1},
                {"/dev/sda4", 0x05, 0},
                {"/dev/sda4", 0x85, 0},
                {"/dev/sda", 0x0F, 0},
                {"sdab2", 0x0F, 1}};
    for (const auto &row : rows) {
        commands_.OnCommand([&](const std::string &) -> test::CommandReply {
            return {0, SfdiskLine({1, 1, row.type})};
        });
        EXPECT_EQ(PartitionIsExtended(row.path), row.extended) << row.path << " " << row.type;
    }
    EXPECT_EQ(commands_.Take().back(), "/sbin/sfdisk -l -uS -N2 /dev/sdab");
    EXPECT_EQ(PartitionIsExtended(nullptr), 0);
}

TEST_F(Partitions, KindOfTable)
{
    std::string sector(512, 0);
    sector[510] = '\x55', sector[511] = '\xAA', sector[450] = '\xEE';
    tree_.Put("/dev/sda", sector);
    int kind = 0;
    EXPECT_EQ(PartitionTableTypeGet("/dev/sda", &kind), 0);
    EXPECT_EQ(kind, PARTITION_TABLE_GPT);
    EXPECT_EQ(log_.Lines().at(0).priority, LOG_ERR);
    tree_.Put("/dev/sda", "short");
    EXPECT_EQ(PartitionTableTypeGet("/dev/sda", &kind), -1);
    EXPECT_EQ(PartitionTableTypeGet("/dev/sdz", &kind), -1);
    EXPECT_EQ(kind, PARTITION_TABLE_GPT);
    const std::string failed = "\npartition_table_type_get:# TAVOReadOneSectorFromDev failed. szDevPath=";
    EXPECT_EQ(log_.Take(), "partition_table_type_get:# pTable 3" + failed + "[/dev/sda], errno=[0x0A00]" + failed +
                               "[/dev/sdz], errno=[0x0900]");
}

TEST_F(Partitions, Paths)
{
    tree_.Put("/proc/partitions", test::Capture("proc_partitions_md_lvm-linux-6.1-armmp-lpae"));
    Model("");
    int count = 0;
    const auto list_of = [&](const char *prefix, int containers, std::vector<std::string> begin = {}) {
        test::List list = test::MakeList(begin);
        const PARTITIONFILTER filter = {prefix, containers};
        count = test::Moving(list, [&](auto **addr) { return PartitionPathEnum(&filter, addr); });
        EXPECT_TRUE(count == list->nItem || count == -1) << count;
        return test::Items(list.get());
    };
    EXPECT_THAT(list_of("sdf", 0, {"/dev/zero", "/dev/a"}),
                ElementsAre("/dev/a", "/dev/sdf", "/dev/sdf1", "/dev/sdf2", "/dev/zero"));
    EXPECT_EQ(list_of(nullptr, 0).size(), 29u) << "the heading is no partition";
    EXPECT_EQ(list_of("", 0).size(), 29u);
    EXPECT_THAT(list_of("md", 1), IsEmpty());
    EXPECT_THAT(log_.Take(), HasSubstr("partition_path_enum:# Failed to parsing device: md0"));
    EXPECT_EQ(list_of(nullptr, 1).size(), 23u);
    log_.Take();
    tree_.Put("/proc/partitions", "");
    EXPECT_THAT(list_of(nullptr, 0), IsEmpty());
    EXPECT_EQ(count, -1);
    EXPECT_EQ(log_.Take(), "partition_path_enum:# There's no line in /proc/partitions");
    tree_.Put("/proc/partitions", "8 0 5 sda x\n   8 0 5 sdb");
    EXPECT_THAT(list_of(nullptr, 0), ElementsAre("/dev/sdb")) << "also without a newline at its end";
    EXPECT_EQ(log_.Take(), "partition_path_enum:# Unexpected line: [8 0 5 sda x\\x0A]. Counts of token is [5]");
}

TEST_F(Partitions, SpecialDevices)
{
    const struct {
        const char *vendor, *product;
        int partition;
    } rows[] = {{"05ac", "1201", 2},  {"05ac", "1300", 0},  {"05ac", "120a", 2}, {"05ac", "1260", 2},
                {"05ac", "1261", -1}, {"0781", "1201", -1}, {"", "1201", -1}};
    const std::string usb = "/sys/devices/usb1/1-1/";
    tree_.Put(usb + "1-1:1.0/host6/target6:0:0/6:0:0:0/model", "x\n");
    tree_.Link("/sys/block/sdq/device", "../../devices/usb1/1-1/1-1:1.0/host6/target6:0:0/6:0:0:0");
    for (const auto &row : rows) {
        tree_.Put(usb + "idVendor", std::string(row.vendor) + "\n");
        tree_.Put(usb + "idProduct", std::string(row.product) + "\n");
        EXPECT_EQ(TAVOCheckSpecialDevice("/dev/sdq"), row.partition) << row.product;
        EXPECT_EQ(TAVOCheckSpecialDevice("sdq1"), row.partition) << row.product;
    }
    EXPECT_EQ(TAVOCheckSpecialDevice("sda"), -1);
}

// The real tool, on an image in the place of a disk.
TEST(PartitionsOnAnImage, EveryLayoutIsRecognisedAfterItsCreation)
{
    if (test::RootLacks("foreign-exec"))
        GTEST_SKIP() << "writes to /dev/sda: only in an appliance root that runs the partitioning tool";
    const test::CapturedLog log;
    // The second is larger than an MS-DOS table describes, so its table keeps a copy in the last 33 sectors.
    const struct {
        uint64_t sectors, end;
    } disks[] = {{8 << 21, 8 << 21}, {5860533168, 5860533168 - 33}};
    for (size_t i = 0; i < 2 * std::size(grgAllTavoPartLayout); ++i) {
        const TAVOPARTLAYOUT &layout = grgAllTavoPartLayout[i / 2];
        const auto &disk = disks[i % 2];
        test::WriteFile("/etc.defaults/tavoinfo.conf", layout.fRaid ? "supportraid=yes\n" : "supportraid=no\n");
        test::WriteFile("/dev/sda", "");
        ASSERT_EQ(::truncate("/dev/sda", static_cast<off_t>(disk.sectors * 512)), 0);
        const int raid = static_cast<int>(layout.fRaid);
        const int version = layout.nVersion;
        EXPECT_EQ(BlTAVOCheckPartitionLayout("/dev/sda", raid, nullptr), 0);
        EXPECT_EQ(PartitionCreate("/dev/sda", PARTITION_DATA, &version), -1) << "no table yet";
        ASSERT_EQ(PartitionCreate("/dev/sda", PARTITION_SYSTEM, &version), 0);
        ASSERT_EQ(PartitionCreate("/dev/sda", PARTITION_DATA, &version), 0);
        int found = 0;
        EXPECT_EQ(BlTAVOCheckPartitionLayout("/dev/sda", raid, &found), 1);
        EXPECT_EQ(found, version);
        EXPECT_EQ(BlTAVOCheckPartitionLayout("/dev/sda", 1 - raid, &found), 0);
        int64_t start = 0;
        uint32_t type = 0;
        const int64_t data = RCPartitionConfigs(3, "/dev/sda", &start, &type);
        EXPECT_EQ(start, static_cast<int64_t>(layout.place2.nStart + layout.place2.cSector +
                                              static_cast<int64_t>(layout.cGap)));
        EXPECT_EQ(static_cast<uint64_t>(start + data), disk.end);
        EXPECT_EQ(type, layout.place3.nType);
        int kind = 0;
        EXPECT_EQ(PartitionTableTypeGet("/dev/sda", &kind), 0);
        EXPECT_EQ(kind, i % 2 == 0 ? PARTITION_TABLE_MBR : PARTITION_TABLE_GPT);
        PartitionClean("/dev/sda", PARTITION_DATA);
        EXPECT_EQ(RCPartitionConfigs(3, "/dev/sda", nullptr, nullptr), -1);
        EXPECT_EQ(BlTAVOCheckPartitionLayout("/dev/sda", raid, nullptr), 1)
            << "the system's partitions are still there";
        EXPECT_EQ(PartitionClean("/dev/sda", PARTITION_SYSTEM), 0);
        EXPECT_EQ(BlTAVOCheckPartitionLayout("/dev/sda", raid, nullptr), 0);
    }
    ::unlink("/dev/sda");
}

}  // namespace
