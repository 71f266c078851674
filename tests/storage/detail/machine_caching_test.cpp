// The write cache by SCSI's caching page, on a real drive: the way that disks on other controllers are queried.
#include "storage/detail/caching_page.h"
#include "storage/detail/raw_disk.h"
#include "support/machine.h"

#include <gmock/gmock.h>

namespace {

using MachineCachingPage = test::MachineTest;

TEST_F(MachineCachingPage, SwitchesTheWriteCacheOfADrive)
{
    tavo::Fd disk;
    ASSERT_EQ(tavo::OpenRawDisk("/dev/sdb", disk), 0);
    for (const bool on : {false, true, false, true}) {
        auto page = tavo::ReadCachingPage(disk.Get());
        ASSERT_TRUE(page);
        EXPECT_EQ(page->IsOn(), !on);
        EXPECT_TRUE(tavo::WriteCachingPage(disk.Get(), std::move(*page), on));
        EXPECT_THAT(test::Told("hdparm -W /dev/sdb"), testing::HasSubstr(on ? "1 (on)" : "0 (off)"));
    }
}

}  // namespace
