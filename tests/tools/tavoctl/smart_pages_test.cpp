// tavoctl's reading of the pages of a drive.
#include "storage/smart_pages.h"

#include <gtest/gtest.h>

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
