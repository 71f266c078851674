// The virtual appliance is the machine that the families' own tests rely on: its processor and its disks.
#include "support/machine.h"

#include "support/test.h"

#include <sys/utsname.h>

namespace {

using test::Told;
using testing::HasSubstr;

using MachineFacts = test::MachineTest;

TEST_F(MachineFacts, HasTheLibrarysProcessor)
{
    utsname name;
    ASSERT_EQ(::uname(&name), 0);
    EXPECT_STREQ(name.machine, "armv7l");
    EXPECT_EQ(sizeof(long), 4u);
    EXPECT_EQ(sizeof(void *), 4u);
    EXPECT_THAT(Told("tavoctl version --json"), HasSubstr("armv7l"));
}

TEST_F(MachineFacts, DisksAreInTheOrderOfTheirBays)
{
    for (int bay = 1; bay <= 6; ++bay) {
        const std::string disk = std::string("sd") + "abcdef"[bay - 1];
        EXPECT_THAT(Told("readlink /sys/block/" + disk), HasSubstr("/ata" + std::to_string(bay) + "/"));
        EXPECT_THAT(Told("hdparm -i /dev/" + disk), HasSubstr("NASLAB-HD-" + std::to_string(bay)));
        EXPECT_EQ(Told("blockdev --getsize64 /dev/" + disk), "100663296\n");
    }
}

}  // namespace
