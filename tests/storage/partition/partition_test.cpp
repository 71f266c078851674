// Layouts: recognised by their exact sectors, created and cleaned by exactly these commands.
#include "tavo_partition.h"

#include "support/appliance_root.h"
#include "support/captured_log.h"
#include "support/captures.h"
#include "support/container_text.h"
#include "support/device_tree.h"
#include "support/fault_state.h"
#include "support/recorded_commands.h"

#include <gmock/gmock.h>

#include <cstring>
#include <functional>
#include <map>

#include <fcntl.h>
#include <sys/stat.h>
#include <syslog.h>
#include <unistd.h>

using testing::ElementsAre;
using testing::IsEmpty;
using testing::MatchesRegex;

namespace {

static_assert(sizeof(TAVOPARTPLACE) == 20 && sizeof(TAVOPARTLAYOUT) == 92 && sizeof grgAllTavoPartLayout == 920);
static_assert(sizeof(void *) != 4 || sizeof PartType == 49 * 12);

TEST(PartitionTables, HoldTheirExactBytes)
{
    // Records 5 and 6 as programs that were compiled against them see them.
    constexpr unsigned char version_7[92] = {
        7,    0,    0,    0,    0,    0,    0,    0,    0,    0xFF, 0x4B, 0,    0,    0, 0, 0,    0,    0,    0x40,
        0,    0,    0,    0,    0,    0,    0,    4,    0,    0,    0,    0,    0,    0, 1, 0,    0,    0,    0,
        0,    0,    0,    0xFF, 0x4B, 0,    0,    0,    0,    0,    0x83, 0,    0,    0, 0, 0,    0x4C, 0,    0,
        0,    0,    0,    0,    0,    0x40, 0,    0,    0,    0,    0,    0x82, 0,    0, 0, 0xFF, 0xFF, 0xFF, 0xFF,
        0xFF, 0xFF, 0xFF, 0xFF, 0xFF, 0xFF, 0xFF, 0xFF, 0xFF, 0xFF, 0xFF, 0xFF, 0x83, 0, 0, 0};
    EXPECT_EQ(std::memcmp(&grgAllTavoPartLayout[5], version_7, sizeof version_7), 0);
    for (const TAVOPARTLAYOUT &layout : grgAllTavoPartLayout) {
        EXPECT_EQ(uint64_t{layout.cSector1}, static_cast<uint64_t>(layout.place1.cSector));
        EXPECT_EQ(uint64_t{layout.cSector2}, static_cast<uint64_t>(layout.place2.cSector));
        EXPECT_EQ(int64_t{layout.place2.nStart}, layout.place1.nStart + layout.place1.cSector);
    }
    uint64_t sum = 0;
    for (const TAVOPARTLAYOUT &layout : grgAllTavoPartLayout)
        sum = sum * 31 + layout.cSector1 + layout.cSector2 + layout.cGap + static_cast<uint64_t>(layout.place1.nStart);
    EXPECT_EQ(sum, 3754814266712405632u) << "no value of the table ever changes";

    int rows = 0;
    int windows = 0;
    while (PartType[rows].szName) {
        windows += static_cast<int>(PartType[rows].fWindows);
        EXPECT_LT(rows ? int64_t{PartType[rows - 1].nType} : -1, int64_t{PartType[rows].nType});
        ++rows;
    }
    EXPECT_EQ(rows, 48);
    EXPECT_EQ(windows, 14);
    EXPECT_EQ(PartType[48].nType, 0u);
    EXPECT_STREQ(PartType[47].szName, "Linux raid autodetect");
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

std::string SfdiskLine(const std::string &device, int64_t start, int64_t count, unsigned type)
{
    char line[128];
    std::snprintf(line, sizeof line, "%s %lld %lld %lld %x name\n", device.c_str(), static_cast<long long>(start),
                  static_cast<long long>(start + count - 1), static_cast<long long>(count), type);
    return line;
}

// Answers the queries of a disk's partitions 1 and 2.
test::CommandReply Answer(const std::string &command, const std::string &disk, const TAVOPARTPLACE &first,
                          const TAVOPARTPLACE &second)
{
    if (command == "/sbin/sfdisk -l -uS -N1 /dev/" + disk)
        return {0, SfdiskLine("/dev/" + disk + "1", first.nStart, first.cSector, first.nType)};
    if (command == "/sbin/sfdisk -l -uS -N2 /dev/" + disk)
        return {0, SfdiskLine("/dev/" + disk + "2", second.nStart, second.cSector, second.nType)};
    return {1, ""};
}

TEST(BlTAVOCheckPartitionLayout, EveryLayoutAndNothingElse)
{
    const test::CapturedLog log;
    test::RecordedCommands commands;
    for (const TAVOPARTLAYOUT &layout : grgAllTavoPartLayout) {
        const auto check = [&](const TAVOPARTPLACE &first, const TAVOPARTPLACE &second, int raid) {
            commands.OnCommand([&](const std::string &command) { return Answer(command, "sda", first, second); });
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
    commands.OnCommand([](const std::string &command) {
        return Answer(command, "sda", {63, 273042, 0xFD}, {273105, 787185, 0xFD});
    });
    EXPECT_EQ(BlTAVOCheckPartitionLayout("sda", 1, nullptr), 0) << "the RAID layout of version 1 has other sectors";
    EXPECT_EQ(BlTAVOCheckPartitionLayout(nullptr, 1, nullptr), 0);
    EXPECT_THAT(log.Lines(), IsEmpty());
    commands.Clear();
    EXPECT_EQ(BlTAVOCheckPartitionLayout("sdb", 1, nullptr), 0);
    EXPECT_THAT(commands.Commands(), ElementsAre("/sbin/sfdisk -l -uS -N1 /dev/sdb"));
    EXPECT_THAT(log.Lines(), ElementsAre(testing::Field(&test::LoggedLine::priority, LOG_DEBUG)));
    EXPECT_THAT(log.Texts(),
                ElementsAre(MatchesRegex("partition_check_layout:[0-9]+ sdb: dont contain partition \\[1\\]")));
}

TEST(RCPartitionConfigs, ReturnsTheToolsAnswer)
{
    test::RecordedCommands commands([](const std::string &) -> test::CommandReply {
        return {0, "/dev/sda3 9437184 11721045167 11711607984 fd Linux\nsecond line\n"};
    });
    int64_t start = 0;
    uint32_t type = 0;
    EXPECT_EQ(RCPartitionConfigs(3, "/dev/sda", &start, &type), 11711607984);
    EXPECT_EQ(start, 9437184);
    EXPECT_EQ(type, 0xFDu);
    EXPECT_EQ(RCPartitionConfigs(3, "sda", nullptr, nullptr), 11711607984);
    EXPECT_THAT(commands.Commands(),
                ElementsAre("/sbin/sfdisk -l -uS -N3 /dev/sda", "/sbin/sfdisk -l -uS -N3 /dev/sda"));
    commands.Clear();
    start = 5;
    EXPECT_EQ(RCPartitionConfigs(0, "sda", &start, &type), -1);
    EXPECT_EQ(RCPartitionConfigs(-1, "sda", &start, &type), -1);
    EXPECT_EQ(RCPartitionConfigs(1, nullptr, &start, &type), -1);
    EXPECT_THAT(commands.Commands(), IsEmpty());
    for (const char *output : {"", "\n", "sfdisk: no such disk\n", "/dev/sda1 1 1 1\n"}) {
        commands.OnCommand([=](const std::string &) -> test::CommandReply { return {0, output}; });
        EXPECT_EQ(RCPartitionConfigs(1, "sda", &start, &type), -1) << output;
    }
    EXPECT_EQ(start, 5);
}

class Partitions : public testing::Test {
  protected:
    void Model(const std::string &settings) { tree_.Put("/etc.defaults/tavoinfo.conf", settings); }

    test::DeviceTree tree_;
    test::CapturedLog log_;
    test::RecordedCommands commands_;
};

TEST_F(Partitions, VersionOfTheSystem)
{
    Model("supportraid=\"yes\"\nmaxdisks=\"2\"\n");
    int version = 0;
    EXPECT_EQ(PartitionLayoutGet(&version), 0);
    EXPECT_EQ(version, 7) << "nothing is recognised";
    EXPECT_THAT(commands_.Commands(),
                ElementsAre("/sbin/sfdisk -l -uS -N1 /dev/sda", "/sbin/sfdisk -l -uS -N1 /dev/sdb"));

    commands_.OnCommand([](const std::string &command) {
        return Answer(command, "sdc", grgAllTavoPartLayout[8].place1, grgAllTavoPartLayout[8].place2);
    });
    for (const char *member : {"sda1", "sdc1", "sdd1"})
        tree_.Put(std::string("/sys/block/md0/md/dev-") + member + "/state", "in_sync\n");
    commands_.Clear();
    EXPECT_EQ(PartitionLayoutGet(&version), 0);
    EXPECT_EQ(version, 6);
    EXPECT_THAT(commands_.Commands(),
                ElementsAre("/sbin/sfdisk -l -uS -N1 /dev/sda", "/sbin/sfdisk -l -uS -N1 /dev/sdc",
                            "/sbin/sfdisk -l -uS -N2 /dev/sdc"));
    tree_.Remove("/sys/block/md0");

    Model("supportraid=\"no\"\nmaxdisks=\"4\"\n");
    commands_.OnCommand([](const std::string &command) {
        return Answer(command, "sdd", grgAllTavoPartLayout[2].place1, grgAllTavoPartLayout[2].place2);
    });
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
    EXPECT_THAT(commands_.Commands(),
                ElementsAre("/sbin/sfdisk -M1 /dev/sda > /dev/null 2>&1",
                            "/sbin/sfdisk -N1 -uS -q -f -j256 -z4980480 -tfd -F /dev/sda > /dev/null 2>&1",
                            "/sbin/sfdisk -N2 -uS -q -f -j0 -z4194304 -tfd -F /dev/sda > /dev/null 2>&1",
                            "/sbin/sfdisk -N3 -uS -q -f -j262144 -z-1 -tfd -F /dev/sda >/dev/null 2>&1"));
    Model("supportraid=\"no\"\n");
    commands_.Clear();
    EXPECT_EQ(PartitionCreate("/dev/sdab", PARTITION_SYSTEM, &version_1), 0);
    EXPECT_EQ(PartitionCreate("/dev/sdab", PARTITION_SYSTEM | PARTITION_DATA, &version_1), 0)
        << "the data partition alone";
    EXPECT_THAT(commands_.Commands(),
                ElementsAre("/sbin/sfdisk -M1 /dev/sdab > /dev/null 2>&1",
                            "/sbin/sfdisk -N1 -uS -q -f -j63 -z273042 -t83 -F /dev/sdab > /dev/null 2>&1",
                            "/sbin/sfdisk -N2 -uS -q -f -j0 -z787185 -t82 -F /dev/sdab > /dev/null 2>&1",
                            "/sbin/sfdisk -N3 -uS -q -f -j273042 -z-1 -t83 -F /dev/sdab >/dev/null 2>&1"));
    commands_.Clear();
    EXPECT_THAT(log_.Lines(), IsEmpty());
    EXPECT_EQ(PartitionCreate("/dev/sda", PARTITION_SYSTEM, &version_4), -1);
    EXPECT_EQ(PartitionCreate("/dev/sda", 0, &version_7), 0) << "nothing to do";
    EXPECT_EQ(PartitionCreate(nullptr, PARTITION_DATA, &version_7), -1);
    EXPECT_THAT(commands_.Commands(), IsEmpty());
    EXPECT_THAT(log_.Texts(),
                ElementsAre(MatchesRegex("partition_create:[0-9]+ Failed to get partition layout: version=4"),
                            MatchesRegex("partition_create:[0-9]+ Bad parameters")));
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
        {"-M1", 1, "partition_add_table:[0-9]+ Failed to add ms-dos signature to /dev/sda, err=3"},
        {"-N1", 2, "partition_create:[0-9]+ Failed to do '/sbin/sfdisk -N1 .* /dev/sda > /dev/null 2>&1', err=3"},
        {"-N2", 3, "partition_create:[0-9]+ Failed to do '/sbin/sfdisk -N2 .* /dev/sda > /dev/null 2>&1', err=3"},
    };
    for (const auto &row : rows) {
        log_.Clear();
        commands_.Clear();
        commands_.OnCommand([&](const std::string &command) -> test::CommandReply {
            return {command.find(row.fails) != command.npos ? 3 : 0, ""};
        });
        EXPECT_EQ(PartitionCreate("/dev/sda", PARTITION_SYSTEM, &version), -1) << row.fails;
        EXPECT_EQ(commands_.Commands().size(), row.commands) << row.fails;
        EXPECT_THAT(log_.Texts(), ElementsAre(MatchesRegex(row.log)));
    }
}

TEST_F(Partitions, CleanRunsExactlyTheseCommands)
{
    EXPECT_EQ(PartitionClean("/dev/sdb", PARTITION_DATA), 0);
    std::vector<std::string> expected;
    for (int number = 15; number >= 3; --number)
        expected.push_back("/sbin/sfdisk -N" + std::to_string(number) +
                           " -q -f --no-reread -o0 -z0 -t0 -F -D /dev/sdb > /dev/null 2>&1");
    expected.push_back("/sbin/mdadm --zero-superblock /dev/sdb3 > /dev/null 2>&1");
    EXPECT_EQ(commands_.Commands(), expected);

    commands_.Clear();
    EXPECT_EQ(PartitionClean("/dev/sdb", PARTITION_SYSTEM), 0);
    EXPECT_THAT(commands_.Commands(),
                ElementsAre("/sbin/mdadm --zero-superblock /dev/sdb1 > /dev/null 2>&1",
                            "/sbin/sfdisk -N1 -q -f --no-reread -o0 -z0 -t0 -F -D /dev/sdb > /dev/null 2>&1",
                            "/sbin/sfdisk -M1 /dev/sdb > /dev/null 2>&1",
                            "/sbin/mdadm --zero-superblock /dev/sdb2 > /dev/null 2>&1",
                            "/sbin/sfdisk -N2 -q -f --no-reread -o0 -z0 -t0 -F -D /dev/sdb > /dev/null 2>&1",
                            "/sbin/sfdisk -M1 /dev/sdb > /dev/null 2>&1"));
    EXPECT_THAT(log_.Lines(), IsEmpty());

    commands_.OnCommand([](const std::string &command) -> test::CommandReply {
        return {command.find("-D") != command.npos, ""};
    });
    EXPECT_EQ(PartitionClean("/dev/sdb", PARTITION_DATA), 0) << "an entry that is not there is no failure";
    ASSERT_EQ(log_.Lines().size(), 13u);
    EXPECT_EQ(log_.Lines()[0].priority, LOG_DEBUG);
    EXPECT_THAT(log_.Texts()[0], MatchesRegex("partition_clean:[0-9]+ Failed to do '/sbin/sfdisk -N15 .*'"));
    commands_.OnCommand([](const std::string &command) -> test::CommandReply {
        return {command.find("-M1") != command.npos, ""};
    });
    commands_.Clear();
    EXPECT_EQ(PartitionClean("/dev/sdb", PARTITION_SYSTEM), -1);
    EXPECT_EQ(commands_.Commands().size(), 3u);
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
        const std::pair<int, std::function<int()>> calls[] = {
            {row.clean_data,
             [] {
                 return PartitionClean("/dev/sdb", PARTITION_DATA);
             }},
            {row.clean_system,
             [] {
                 return PartitionClean("/dev/sdb", PARTITION_SYSTEM);
             }},
            {row.create_data,
             [&] {
                 return PartitionCreate("/dev/sdb", PARTITION_DATA, &version);
             }},
            {row.create_system,
             [&] {
                 return PartitionCreate("/dev/sdb", PARTITION_SYSTEM, &version);
             }},
        };
        for (const auto &[result, call] : calls) {
            commands_.Clear();
            log_.Clear();
            EXPECT_EQ(call(), result) << row.busy << row.held;
            EXPECT_EQ(commands_.Commands().empty(), result == -1);
            EXPECT_THAT(log_.Texts(), result == -1 ? testing::Matcher<std::vector<std::string>>(
                                                         ElementsAre(testing::HasSubstr(row.log)))
                                                   : testing::Matcher<std::vector<std::string>>(IsEmpty()));
        }
    }
}

TEST_F(Partitions, SuperblocksThatTheCommandsWouldMissAreErasedFirst)
{
    for (const char *name : {"/dev/sdb1", "/dev/sdb2", "/dev/sdb3", "/dev/sdb5", "/dev/sdb6"})
        tree_.Put(name, "");
    commands_.OnCommand([](const std::string &command) -> test::CommandReply {
        const bool raid =
            command == "/sbin/mdadm -E /dev/sdb2 2>/dev/null" || command == "/sbin/mdadm -E /dev/sdb6 2>/dev/null";
        return {0, raid ? std::string(test::Capture("mdadm_E_1.2_raid5-mdadm-4.2")) : ""};
    });
    EXPECT_EQ(PartitionClean("/dev/sdb", PARTITION_SYSTEM | PARTITION_DATA), 0);
    std::vector<std::string> commands = commands_.Commands();
    ASSERT_GT(commands.size(), 6u);
    commands.resize(6);
    EXPECT_THAT(commands,
                ElementsAre("/sbin/mdadm -E /dev/sdb2 2>/dev/null",
                            "/sbin/mdadm --zero-superblock /dev/sdb2 > /dev/null 2>&1",
                            "/sbin/mdadm -E /dev/sdb5 2>/dev/null", "/sbin/mdadm -E /dev/sdb6 2>/dev/null",
                            "/sbin/mdadm --zero-superblock /dev/sdb6 > /dev/null 2>&1",
                            "/sbin/sfdisk -N15 -q -f --no-reread -o0 -z0 -t0 -F -D /dev/sdb > /dev/null 2>&1"));
    commands_.OnCommand([](const std::string &command) -> test::CommandReply {
        return {command.find("--zero") != command.npos, std::string(test::Capture("mdadm_E_1.2_raid5-mdadm-4.2"))};
    });
    commands_.Clear();
    EXPECT_EQ(PartitionClean("/dev/sdb", PARTITION_SYSTEM), -1) << "it cannot be erased";
    EXPECT_EQ(commands_.Commands().size(), 2u);
}

TEST_F(Partitions, ExtendedIsOneTypeAlone)
{
    const struct {
        const char *path;
        unsigned type;
        int extended;
    } rows[] = {{"/dev/sda4", 0x0F, 1},
                {"sdab2", 0x0F, 1},
                {"/dev/sda4", 0x05, 0},
                {"/dev/sda4", 0x85, 0},
                {"/dev/sda", 0x0F, 0}};
    for (const auto &row : rows) {
        commands_.OnCommand([&](const std::string &) -> test::CommandReply {
            return {0, SfdiskLine("x", 1, 1, row.type)};
        });
        EXPECT_EQ(PartitionIsExtended(row.path), row.extended) << row.path << " " << row.type;
    }
    EXPECT_THAT(commands_.Commands(), testing::Contains("/sbin/sfdisk -l -uS -N2 /dev/sdab"));
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
    EXPECT_THAT(log_.Lines(), ElementsAre(testing::Field(&test::LoggedLine::priority, LOG_ERR)));
    EXPECT_THAT(log_.Texts(), ElementsAre(MatchesRegex("partition_table_type_get:[0-9]+ pTable 3")));
    log_.Clear();
    tree_.Put("/dev/sda", "short");
    EXPECT_EQ(PartitionTableTypeGet("/dev/sda", &kind), -1);
    EXPECT_EQ(PartitionTableTypeGet("/dev/sdz", &kind), -1);
    EXPECT_EQ(kind, PARTITION_TABLE_GPT);
    EXPECT_THAT(
        log_.Texts(),
        ElementsAre(MatchesRegex(".* TAVOReadOneSectorFromDev failed. szDevPath=\\[/dev/sda\\], errno=\\[0x0A00\\]"),
                    MatchesRegex(".* TAVOReadOneSectorFromDev failed. szDevPath=\\[/dev/sdz\\], errno=\\[0x0900\\]")));
}

TEST_F(Partitions, Paths)
{
    tree_.Put("/proc/partitions", test::Capture("proc_partitions_md_lvm-linux-6.1-armmp-lpae"));
    Model("");
    const auto list_of = [](const char *prefix, int containers) {
        test::List list = test::MakeList({"/dev/zero", "/dev/a"});
        const PARTITIONFILTER filter = {prefix, containers};
        const int count = test::Moving(list, [&](auto **addr) { return PartitionPathEnum(&filter, addr); });
        EXPECT_EQ(count, list->nItem);
        return test::Items(list.get());
    };
    EXPECT_THAT(list_of("sdf", 0), ElementsAre("/dev/a", "/dev/sdf", "/dev/sdf1", "/dev/sdf2", "/dev/zero"));
    EXPECT_EQ(list_of(nullptr, 0).size(), 31u) << "the heading is no partition";
    EXPECT_EQ(list_of("", 0).size(), 31u);
    EXPECT_THAT(list_of("md", 1), ElementsAre("/dev/a", "/dev/zero"));
    EXPECT_THAT(log_.Texts(),
                testing::Contains(MatchesRegex("partition_path_enum:[0-9]+ Failed to parsing device: md0")));
    EXPECT_EQ(list_of(nullptr, 1).size(), 2u + 23u);
    log_.Clear();
    test::List list = test::MakeList({});
    const PARTITIONFILTER any = {nullptr, 0};
    const auto enumerate = [&](auto **addr) {
        return PartitionPathEnum(&any, addr);
    };
    tree_.Put("/proc/partitions", "");
    EXPECT_EQ(test::Moving(list, enumerate), -1);
    EXPECT_THAT(log_.Texts(),
                ElementsAre(MatchesRegex("partition_path_enum:[0-9]+ There's no line in /proc/partitions")));
    log_.Clear();
    tree_.Put("/proc/partitions", "8 0 5 sda x\n   8 0 5 sdb");
    EXPECT_EQ(test::Moving(list, enumerate), 1);
    EXPECT_STREQ(list->pszItem[0], "/dev/sdb") << "also without a newline at its end";
    EXPECT_THAT(log_.Texts(),
                ElementsAre(MatchesRegex(".* Unexpected line: \\[8 0 5 sda x.*\\]. Counts of token is \\[5\\]")));
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
