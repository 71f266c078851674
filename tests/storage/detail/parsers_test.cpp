// What the kernel's files, the drives' pages and the partitioning tool say, and what becomes a name in a path or
// command.
#include "core/detail/text_fields.h"
#include "storage/detail/ata_pass_through.h"
#include "storage/detail/boot_sector.h"
#include "storage/detail/caching_page.h"
#include "storage/detail/device_name.h"
#include "storage/detail/disk_path.h"
#include "storage/detail/drive_page.h"
#include "storage/detail/member_node.h"
#include "storage/detail/proc_partitions.h"
#include "storage/detail/sfdisk_line.h"
#include "support/captures.h"
#include "support/test.h"

namespace {

using testing::ElementsAre;

TEST(DeviceName, KeepsWithinItsDirectory)
{
    for (const char *good : {"sda", "sdab12", "md2", "mmcblk0p1", "dm-3", "nvme0n1p2", "a.b"})
        EXPECT_TRUE(tavo::IsDeviceName(good)) << good;
    for (const char *bad : {"", ".", "..", "../sda", "sda/..", "-x", "a..b", "sda;reboot", "sd a", "sda\n", "$(x)",
                            "sd'a", "\xC3\xA4", "*"})
        EXPECT_FALSE(tavo::IsDeviceName(bad)) << bad;
    EXPECT_FALSE(tavo::IsDeviceName(std::string(64, 'a')));
    EXPECT_TRUE(tavo::IsDevicePath("/dev/sda"));
    for (const char *bad : {"sda", "/dev/", "/dev/../etc", "/dev/mapper/vg-lv", "/etc/passwd", "/dev//sda"})
        EXPECT_FALSE(tavo::IsDevicePath(bad)) << bad;
    EXPECT_EQ(tavo::WithoutNumber("sda10"), "sda");
    EXPECT_EQ(tavo::WithoutNumber("10"), "");
}

TEST(PartitionsRow, IgnoresOtherLines)
{
    std::vector<std::string> names;
    std::string_view text = test::Capture("proc_partitions_md_lvm-linux-6.1-armmp-lpae");
    while (!text.empty()) {
        if (const auto row = tavo::ParsePartitionsRow(tavo::TakeLine(text)))
            names.emplace_back(row->name);
    }
    EXPECT_EQ(names.size(), 29u);
    EXPECT_EQ(names.front(), "sda");
    EXPECT_EQ(names.back(), "dm-3");

    const auto row = tavo::ParsePartitionsRow("   8       83   18446744073709551615 sdf3\n");
    ASSERT_TRUE(row);
    EXPECT_EQ(row->blocks, UINT64_MAX);
    EXPECT_EQ(row->name, "sdf3");
    for (const char *other : {"major minor  #blocks  name\n", "\n", "", "8 0 98304", "8 0 98304 sda x", "8 0 -1 sda",
                              "8 0x0 1 sda", "8 0 18446744073709551616 sda", "4294967296 0 1 sda"})
        EXPECT_FALSE(tavo::ParsePartitionsRow(other)) << other;
}

TEST(PartitionsRow, KnowsWholeDisks)
{
    const struct {
        unsigned major;
        unsigned minor;
        bool ide;
        bool scsi;
    } rows[] = {
        {3, 0, true, false},   {3, 64, true, false}, {3, 1, false, false},   {22, 64, true, false},
        {91, 0, true, true},   {8, 0, false, true},  {8, 240, false, true},  {8, 3, false, false},
        {65, 16, false, true}, {72, 0, false, true}, {135, 0, false, true},  {136, 0, false, false},
        {64, 0, false, false}, {9, 0, false, false}, {8, 256, false, false}, {259, 0, false, false},
    };
    for (const auto &row : rows) {
        const tavo::PartitionsRow parsed = {row.major, row.minor, 1, "x"};
        EXPECT_EQ(parsed.IsWholeIdeDisk(), row.ide) << row.major << ":" << row.minor;
        EXPECT_EQ(parsed.IsWholeScsiDisk(), row.scsi) << row.major << ":" << row.minor;
    }
    EXPECT_EQ((tavo::PartitionsRow{8, 16, 1, "sdb"}).DeviceNumber(), 2064);
}

tavo::DrivePage PageWith(int id, std::initializer_list<unsigned char> raw, size_t slot = 29)
{
    tavo::DrivePage page = {};
    unsigned char *const attribute = page.data() + 2 + 12 * slot;
    attribute[0] = static_cast<unsigned char>(id);
    std::copy(raw.begin(), raw.end(), attribute + 5);
    return page;
}

TEST(DrivePage, ReadsTheTemperature)
{
    const struct {
        std::initializer_list<unsigned char> raw;
        int degrees;  // -1: not known
    } rows[] = {
        {{31, 0, 0, 0, 0, 0}, 31},          {{37, 0, 14, 0, 54, 0}, 37},  // lowest and highest packed after it
        {{37, 0, 0x0E, 0, 0x36, 0xFF}, 37}, {{0xF6, 0xFF, 0, 0, 0, 0}, -10}, {{200, 0, 0, 0, 0, 0}, 200},
        {{201, 0, 0, 0, 0, 0}, -1},         {{0, 0x80, 0, 0, 0, 0}, -1},
    };
    for (const auto &row : rows) {
        for (const size_t slot : {0u, 29u})
            EXPECT_EQ(tavo::SmartTemperature(PageWith(194, row.raw, slot)).value_or(-1), row.degrees);
    }
    EXPECT_FALSE(tavo::SmartTemperature(PageWith(190, {31}))) << "the emulated drive's attribute";
    tavo::DrivePage twice = PageWith(194, {40}, 3);
    const tavo::DrivePage later = PageWith(194, {50}, 5);
    std::copy_n(later.begin() + 2 + 12 * 5, 12, twice.begin() + 2 + 12 * 5);
    EXPECT_EQ(tavo::SmartTemperature(twice), 40) << "the first one counts";
}

TEST(DrivePage, KnowsDrivesWithoutRotatingMedium)
{
    const struct {
        int word80, word217, word83, word82, word84;
        bool solid;
        const char *why;
    } rows[] = {
        {0x00FE, 1, 0x4000, 1, 1, true, "ATA-7, non-rotating"},
        {0x007E, 1, 0x4000, 1, 1, false, "ATA-6 does not know the word"},
        {0x8080, 1, 0x4000, 1, 1, true, "bit 15 is not a version"},
        {0x8001, 1, 0x4000, 1, 1, false, "neither is bit 0"},
        {0x0000, 1, 0x4000, 1, 1, false, "no version at all"},
        {0xFFFF, 1, 0x4000, 1, 1, false, "no version at all"},
        {0x01F0, 7200, 0x4000, 1, 1, false, "a speed"},
        {0x01F0, 7200, 0x4000, 0, 1, true, "no SMART"},
        {0x01F0, 7200, 0x4000, 1, 0, true, "no error log"},
        {0x01F0, 7200, 0xC000, 0, 0, false, "the words are not valid"},
        {0x01F0, 7200, 0x0000, 0, 0, false, "the words are not valid"},
    };
    for (const auto &row : rows) {
        tavo::DrivePage identity = {};
        const auto set = [&](size_t word, int value) {
            identity[2 * word] = static_cast<unsigned char>(value);
            identity[2 * word + 1] = static_cast<unsigned char>(value >> 8);
        };
        set(80, row.word80), set(217, row.word217), set(83, row.word83), set(82, row.word82), set(84, row.word84);
        EXPECT_EQ(tavo::HasNoRotatingMedium(identity), row.solid) << row.why;
    }
}

TEST(BootSector, FileSystemsWithoutTable)
{
    const struct {
        const char *jump;
        size_t at;
        const char *name;
        bool volume;
    } rows[] = {
        {"\xEB\x3C\x90", 54, "FAT16", true},  {"\xEB\x58\x90", 82, "FAT32", true},
        {"\xEB\x52\x90", 3, "NTFS", true},    {"\xEB\x58\x90", 54, "FAT16", false},
        {"\xEB\x3C\x90", 54, "FAT12", false}, {"\xFA\x33\xC0", 82, "FAT32", false},
    };
    for (const auto &row : rows) {
        tavo::BootSector sector = {};
        std::memcpy(sector.data(), row.jump, 3);
        std::memcpy(sector.data() + row.at, row.name, std::strlen(row.name));
        EXPECT_FALSE(tavo::IsWindowsVolume(sector)) << "no signature";
        sector[510] = 0x55, sector[511] = 0xAA;
        EXPECT_EQ(tavo::IsWindowsVolume(sector), row.volume) << row.name;
        sector[446] = 'N';  // text of the boot program where a table would begin
        sector[450] = 0x0C;
        EXPECT_EQ(tavo::IsWindowsVolume(sector), row.volume) << row.name;
        sector[446] = 0x80;
        sector[458] = 1;
        EXPECT_FALSE(tavo::IsWindowsVolume(sector)) << "that is a table";
    }
}

TEST(SfdiskLine, TakesFiveWords)
{
    const auto geometry = tavo::ParseSfdiskLine("/dev/sda1 256 4980735 4980480 fd Linux raid autodetect");
    ASSERT_TRUE(geometry);
    EXPECT_EQ(geometry->start, 256);
    EXPECT_EQ(geometry->count, 4980480);
    EXPECT_EQ(geometry->type, 0xFDu);
    EXPECT_EQ(tavo::ParseSfdiskLine("\t/dev/sda1  1 -  2\t5")->type, 5u) << "the end is not looked at";
    for (const char *bad : {"", "/dev/sda1 * 256 4980735 4980480 fd", "/dev/sda1 256 4980735 4980480",
                            "/dev/sda1 -1 1 1 fd", "/dev/sda1 1 1 99999999999999999999 fd", "/dev/sda1 1 1 1 fdx",
                            "/dev/sda1 1 1 1 1ffffffff", "sfdisk: cannot open /dev/sda: No such file"})
        EXPECT_FALSE(tavo::ParseSfdiskLine(bad)) << bad;
    // The reader ignores text after the first 63 characters.
    EXPECT_FALSE(tavo::ParseSfdiskLine(std::string(60, 'd') + " 1 2 3 4"));
    EXPECT_FALSE(tavo::ParseSfdiskLine("/dev/sda1 256 4980735 4980480" + std::string(34, ' ') + "fd"));
}

TEST(AtaPassThrough, WrapsAndReadsRegisters)
{
    EXPECT_THAT(tavo::WrapIn12({0xE3, 0, 0xFB}, false), ElementsAre(0xA1, 0x06, 0x20, 0, 0xFB, 0, 0, 0, 0, 0xE3, 0, 0));

    std::array<uint8_t, 32> sense = {0x72, 1, 0, 0x1D, 0, 0, 0, 14, 0x09, 12, 0, 0x04, 0, 0xFF};
    sense[21] = 0x50;
    auto result = tavo::ParseAtaResult(sense);
    ASSERT_TRUE(result);
    EXPECT_EQ(result->count, 0xFF);
    EXPECT_EQ(result->status, 0x50);
    EXPECT_EQ(result->error, 0x04);
    std::array<uint8_t, 32> fixed = {0x70, 0, 1, 0x00, 0x50, 0, 0x80, 10};
    result = tavo::ParseAtaResult(fixed);
    ASSERT_TRUE(result);
    EXPECT_EQ(result->count, 0x80);
    sense[8] = 0x02;
    EXPECT_FALSE(tavo::ParseAtaResult(sense)) << "another descriptor";
    EXPECT_FALSE(tavo::ParseAtaResult(std::span(fixed).first(8)));
}

TEST(CachingPage, IsFoundAfterTheBlockDescriptor)
{
    std::vector<uint8_t> mode_data(40);
    mode_data[3] = 8;
    mode_data[12] = 0x88;  // with the bit that says it can be saved
    mode_data[13] = 18;
    EXPECT_EQ(tavo::FindCachingPage(mode_data), 12u);
    for (const uint8_t descriptor : std::initializer_list<uint8_t>{0, 7, 37, 255}) {
        mode_data[3] = descriptor;
        EXPECT_FALSE(tavo::FindCachingPage(mode_data)) << int{descriptor};
    }
    mode_data[3] = 8;
    mode_data[13] = 30;
    EXPECT_FALSE(tavo::FindCachingPage(mode_data)) << "longer than the answer";
    EXPECT_FALSE(tavo::FindCachingPage({}));
}

// The kernel's numbers of disks: sixteen to a major number, in three runs of them.
TEST(ScsiName, CountsOverTheThreeRuns)
{
    const struct {
        unsigned major_number, minor_number;
        const char *name;
    } rows[] = {{8, 0, "sda"},    {8, 255, "sdp15"},  {65, 0, "sdq"}, {65, 161, "sdaa1"}, {71, 240, "sddx"},
                {128, 0, "sddy"}, {135, 240, "sdiv"}, {8, 256, ""},   {9, 0, ""},         {64, 0, ""},
                {72, 0, ""},      {127, 0, ""},       {136, 0, ""},   {253, 0, ""}};
    for (const auto &row : rows)
        EXPECT_EQ(tavo::ScsiName(row.major_number, row.minor_number), row.name) << row.major_number;
}

}  // namespace
