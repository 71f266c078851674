// tavoctl's reading of the pages of a drive.
#include "storage/smart_pages.h"

#include "support/test.h"

namespace {

using tavoctl::SelfTest;
using tavoctl::SmartAttribute;

SelfTest TestOf(unsigned char status)
{
    unsigned char page[512] = {};
    page[363] = status;
    page[372] = 2;
    page[373] = 0xFF;
    page[375] = 0x58;
    page[376] = 0x02;
    return tavoctl::ParseSelfTest(page);
}

TEST(SmartPages, SelfTestsTellTheirStateAndHowLongTheyTake)
{
    const struct {
        unsigned char status;
        bool running;
        int percent;
        const char *result;
        bool failed;
    } rows[] = {
        {0x00, false, 0, "passed", false},
        {0x10, false, 0, "stopped", false},
        {0xF9, true, 10, "running", false},
        {0xF0, true, 100, "running", false},
        {0x73, false, 0, "failed: it cannot read", true},
        {0xE0, false, 0, "not known", false},
    };
    for (const auto &row : rows) {
        const SelfTest test = TestOf(row.status);
        EXPECT_EQ(test.running, row.running) << int{row.status};
        EXPECT_EQ(test.percent, row.percent) << int{row.status};
        EXPECT_EQ(test.result, row.result) << int{row.status};
        EXPECT_EQ(test.failed, row.failed) << int{row.status};
        EXPECT_EQ(test.short_minutes, 2);
        EXPECT_EQ(test.long_minutes, 600);
    }
}

// An entry of the log: the registers after the command failed, and the hours.
void Enter(unsigned char (&page)[512], int slot, unsigned char error, unsigned char sector, unsigned char hours)
{
    unsigned char *const entry = page + 2 + 90 * slot;
    entry[55] = 0xC8;
    entry[61] = error;
    entry[63] = sector;
    entry[64] = 2;
    entry[65] = 3;
    entry[66] = 0xE4;
    entry[88] = hours;
    entry[89] = 1;
}

TEST(SmartPages, TheErrorLogIsARing)
{
    unsigned char page[512] = {};
    page[0] = 1;
    EXPECT_TRUE(tavoctl::ParseErrorLog(page).last.empty());
    // Seven errors in five slots: the seventh is in the second.
    const unsigned char errors[] = {0x84, 0x40, 0x10, 0x04, 0x01};
    for (int slot = 0; slot < 5; ++slot)
        Enter(page, slot, errors[slot], static_cast<unsigned char>(slot), static_cast<unsigned char>(10 + slot));
    page[1] = 2;
    page[452] = 7;
    const tavoctl::ErrorLog log = tavoctl::ParseErrorLog(page);
    EXPECT_EQ(log.count, 7);
    const struct {
        int number, hours;
        const char *error;
        unsigned sector;
    } rows[] = {
        {7, 267, "the sector cannot be read", 0x4030201},
        {6, 266, "data was damaged on the cable", 0x4030200},
        {5, 270, "not known", 0x4030204},
        {4, 269, "the drive refused the command", 0x4030203},
        {3, 268, "the sector is not found", 0x4030202},
    };
    ASSERT_EQ(log.last.size(), std::size(rows));
    for (std::size_t i = 0; i < std::size(rows); ++i) {
        EXPECT_EQ(log.last[i].number, rows[i].number) << i;
        EXPECT_EQ(log.last[i].hours, rows[i].hours) << i;
        EXPECT_EQ(log.last[i].error, rows[i].error) << i;
        EXPECT_EQ(log.last[i].sector, rows[i].sector) << i;
        EXPECT_EQ(log.last[i].command, 0xC8) << i;
    }
    // Fewer than there are slots, and a number that no slot has.
    page[452] = 1;
    EXPECT_EQ(tavoctl::ParseErrorLog(page).last.size(), 1u);
    page[1] = 6;
    EXPECT_TRUE(tavoctl::ParseErrorLog(page).last.empty());
}

TEST(SmartPages, TheWorstFactDecidesTheVerdict)
{
    const SmartAttribute good = {9, 100, 100, 0, 12345};
    const SmartAttribute below = {5, 9, 9, 10, 2000};
    const SmartAttribute replaced = {5, 99, 99, 10, 8};
    const SmartAttribute pending = {197, 100, 100, 0, 0x0001000000000003};
    const SmartAttribute none_pending = {197, 100, 100, 0, 0x0001000000000000};
    const struct {
        std::vector<SmartAttribute> attributes;
        unsigned char test;
        const char *verdict, *reason;
    } rows[] = {
        {{good}, 0, "good", ""},
        {{}, 0, "good", ""},
        {{good, none_pending}, 0x10, "good", ""},
        {{good, replaced}, 0, "worn", "8 sectors were replaced by spare ones"},
        {{replaced, pending}, 0, "worn", "3 sectors cannot be read at present"},
        {{replaced}, 0x70, "failing", "its self-test failed: it cannot read"},
        {{pending, below}, 0x70, "failing", "reallocated sectors has reached the threshold of the drive"},
    };
    for (const auto &row : rows) {
        const tavoctl::Verdict verdict = tavoctl::Judge(row.attributes, TestOf(row.test));
        EXPECT_STREQ(verdict.verdict, row.verdict) << row.reason;
        EXPECT_EQ(verdict.reason, row.reason);
    }
}

TEST(SmartPages, AnNvmeDiskTellsTemperatureAndWarnings)
{
    unsigned char page[512] = {};
    EXPECT_FALSE(tavoctl::ParseNvmeHealth(page));
    page[1] = 0x39;  // 313 K
    page[2] = 0x01;
    EXPECT_EQ(tavoctl::ParseNvmeHealth(page)->temperature, 40);
    EXPECT_EQ(tavoctl::ParseNvmeHealth(page)->text, "good");
    page[0] = 0x0C;
    EXPECT_EQ(tavoctl::ParseNvmeHealth(page)->text, "failing: it is no longer reliable");
}

}  // namespace
