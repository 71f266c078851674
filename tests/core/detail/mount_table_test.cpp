// Reading of the mount table.
#include "core/detail/mount_table.h"

#include <gtest/gtest.h>

namespace {

TEST(MountTable, DecodesPathsAndFindsOptions)
{
    const auto mounts =
        tavo::ParseMounts("/dev/vg1/lvs1 /mnt/a\\040b\\134 ext4 rw,usrquota,usrjquota=aquota.user 0 0\nshort line\n");
    ASSERT_EQ(mounts.size(), 1u);
    EXPECT_EQ(mounts[0].source, "/dev/vg1/lvs1");
    EXPECT_EQ(mounts[0].point, "/mnt/a b\\");
    EXPECT_EQ(mounts[0].type, "ext4");
    for (const char *option : {"rw", "usrquota", "usrjquota"})
        EXPECT_TRUE(mounts[0].Has(option)) << option;
    for (const char *option : {"r", "quota", "ro", "aquota.user", ""})
        EXPECT_FALSE(mounts[0].Has(option)) << option;
}

}  // namespace
