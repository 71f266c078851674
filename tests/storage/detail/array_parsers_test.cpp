// What mdadm and the LVM tools print, and what becomes the name of an array, a group or a volume.
#include "core/detail/text_fields.h"
#include "storage/detail/array_level.h"
#include "storage/detail/array_members.h"
#include "storage/detail/array_name.h"
#include "storage/detail/lvm_line.h"
#include "storage/detail/mdadm_examine.h"
#include "storage/detail/mount_table.h"
#include "storage/detail/volume_name.h"
#include "support/captures.h"

#include <gmock/gmock.h>

namespace {

using tavo::ExamineOutcome;

RAIDSUPERBLOCK Examine(std::string_view text)
{
    RAIDSUPERBLOCK superblock = {};
    std::string wrong;
    while (!text.empty() && tavo::ReadExamineLine(tavo::TakeLine(text), superblock, wrong) == ExamineOutcome::good) {
    }
    EXPECT_EQ(wrong, "");
    return superblock;
}

TEST(MdadmExamine, RealSuperblocks)
{
    const struct {
        const char *capture, *uuid, *array;
        int major, minor, level, members, role, events;
    } rows[] = {
        {"mdadm_E_0.90-mdadm-4.2", "99a1cb1e:1aaa3c52:49268cdc:b4e6580a", "/dev/md1", 0, 90, 2, 2, 0, 18},
        {"mdadm_E_1.2-mdadm-4.2", "495e879a:4e806313:a484c744:9c844bd2", "/dev/md0", 1, 2, 2, 2, 0, 19},
        {"mdadm_E_1.2_raid5-mdadm-4.2", "b7e9ed0e:bf1ea758:5bf5fba6:7c359649", "/dev/md5", 1, 2, 4, 3, 0, 19},
        {"mdadm_E_0.90-mdadm-4.4", "7f3ba539:4502fd79:c7780c0e:bc15422d", "/dev/md1", 0, 90, 2, 2, 0, 1},
        {"mdadm_E_1.1-mdadm-4.4", "ec25d9d6:a7330043:4ae7249b:66581f6c", "/dev/md0", 1, 1, 2, 2, 0, 0},
        {"mdadm_E_1.2_raid5-mdadm-4.4", "35dd76be:fd15b260:63ed28c1:35177f1d", "/dev/md5", 1, 2, 4, 3, 0, 18},
        {"mdadm_E_1.2_raid5_spare-mdadm-4.4", "35dd76be:fd15b260:63ed28c1:35177f1d", "/dev/md5", 1, 2, 4, 3, -1, 18},
    };
    for (const auto &row : rows) {
        const RAIDSUPERBLOCK superblock = Examine(test::Capture(row.capture));
        EXPECT_STREQ(superblock.szUuid, row.uuid);
        EXPECT_STREQ(superblock.szArray, row.array);
        EXPECT_EQ(superblock.nMajor, row.major) << row.capture;
        EXPECT_EQ(superblock.nMinor, row.minor) << row.capture;
        EXPECT_EQ(superblock.fLevel, row.level) << row.capture;
        EXPECT_EQ(superblock.nMember, row.members) << row.capture;
        EXPECT_EQ(superblock.iRole, row.role) << row.capture;
        EXPECT_EQ(superblock.nEvent, row.events) << row.capture;
    }
}

TEST(MdadmExamine, Lines)
{
    EXPECT_EQ(Examine("   Device Role : Active device 12\n").iRole, 12);
    EXPECT_EQ(Examine("   Device Role : spare\n").iRole, -1);
    EXPECT_EQ(Examine("this     3       8        1        0      active sync   /dev/sda1\n").iRole, 3);
    EXPECT_EQ(Examine("Events : 0.123\n").nEvent, 123);
    EXPECT_EQ(Examine("Events : 99999999999\n").nEvent, INT32_MAX);
    EXPECT_EQ(Examine("Raid Devices : 3x\n").nMember, 0);
    const struct {
        const char *name, *array;
    } names[] = {{"nas:data", ""},     {"nas:7  (local to host nas)", "/dev/md7"},
                 {"12", "/dev/md12"},  {"nas:data (host a:3)", ""},
                 {"nas:-1", ""},       {"nas:03", ""},
                 {"nas:9999999", ""},  {"", ""},
                 {"a:b:4", "/dev/md4"}};
    for (const auto &row : names)
        EXPECT_STREQ(Examine(std::string("Name : ") + row.name + "\n").szArray, row.array) << row.name;
    const struct {
        const char *name;
        int level;
    } levels[] = {{"raid0", 1}, {"raid1", 2}, {"raid5", 4}, {"raid6", 8}, {"raid10", 16}, {"linear", 32}, {"raid4", 4}};
    for (const auto &row : levels)
        EXPECT_EQ(Examine(std::string("Raid Level : ") + row.name + "\n").fLevel, row.level) << row.name;
    const struct {
        const char *line, *wrong;
        ExamineOutcome outcome;
    } bad[] = {{" Version : 1", "1", ExamineOutcome::bad_version},
               {" Version : 1.x", "1.x", ExamineOutcome::bad_version},
               {" Device Role : Journal", "Journal", ExamineOutcome::bad_role},
               {" Device Role : Active device x", "Active device x", ExamineOutcome::bad_role},
               {"this is", " is", ExamineOutcome::bad_row}};
    for (const auto &row : bad) {
        RAIDSUPERBLOCK superblock = {};
        std::string wrong;
        EXPECT_EQ(tavo::ReadExamineLine(row.line, superblock, wrong), row.outcome) << row.line;
        EXPECT_EQ(wrong, row.wrong);
    }
    const std::string longest = "UUID : " + std::string(4096, 'a');
    EXPECT_EQ(std::string(Examine(longest).szUuid).size(), 63u);
}

TEST(ArrayUuid, OnlyWholeOnesAreEqual)
{
    const std::string uuid = "99a1cb1e:1aaa3c52:49268cdc:b4e6580a";
    EXPECT_TRUE(tavo::IsSameArrayUuid(uuid, "99A1CB1E:1aaa3c52:49268cdc:b4e6580a"));
    EXPECT_FALSE(tavo::IsSameArrayUuid(uuid, "99a1cb1e:1aaa3c52:49268cdc:b4e6580b"));
    for (const char *none :
         {"", "99a1cb1e", "99a1cb1e:1aaa3c52:49268cdc:b4e6580", "99a1cb1e-1aaa3c52-49268cdc-b4e6580a"})
        EXPECT_FALSE(tavo::IsSameArrayUuid(none, none)) << none;
}

TEST(ArrayName, Numbers)
{
    EXPECT_EQ(tavo::ArrayNumber("/dev/md0"), 0);
    EXPECT_EQ(tavo::ArrayNumber("/dev/md127"), 127);
    for (const char *bad : {"", "md0", "/dev/md", "/dev/md01", "/dev/md-1", "/dev/md1;", "/dev/md/1", "/dev/md1048576",
                            "/dev/md1p1", "/dev/md+1"})
        EXPECT_EQ(tavo::ArrayNumber(bad), std::nullopt) << bad;
    EXPECT_EQ(tavo::ArrayFile(2, "md/level"), "/sys/block/md2/md/level");
}

TEST(MemberState, OfTheKernelsBits)
{
    EXPECT_EQ(tavo::MemberState(0x6, false), RAID_MEMBER_ACTIVE);
    EXPECT_EQ(tavo::MemberState(0x0, false), RAID_MEMBER_SPARE);
    EXPECT_EQ(tavo::MemberState(0x2, false), RAID_MEMBER_SPARE) << "still being rebuilt";
    EXPECT_EQ(tavo::MemberState(0x1, false), RAID_MEMBER_FAILED);
    EXPECT_EQ(tavo::MemberState(0x1, true), RAID_MEMBER_FATAL);
    EXPECT_EQ(tavo::LevelOfKernel(4), std::nullopt);
    EXPECT_FALSE(tavo::IsRebuildAction("check")) << "a scrub";
    EXPECT_TRUE(tavo::IsRebuildAction("recover"));
}

TEST(LvmLines, PhysicalVolumes)
{
    const auto pv = tavo::ParsePvLine(test::Capture("pvs-lvm2-2.03"));
    ASSERT_TRUE(pv);
    EXPECT_STREQ(pv->szPv, "/dev/md0");
    EXPECT_STREQ(pv->szVg, "/dev/vg0");
    EXPECT_STREQ(pv->szUuid, "lSQfeY-dso4-NzXN-Hbdv-wh1J-WThm-cNRXi7");
    EXPECT_EQ(pv->nPv, 1);
    EXPECT_STREQ(tavo::ParsePvLine("  /dev/sdb|||0\n")->szVg, "");
    EXPECT_STREQ(tavo::ParsePvLine("  /dev/sdb|data|u|2")->szVg, "");
    EXPECT_EQ(tavo::ParsePvLine("  /dev/sdb|vg1|u|12|more\n")->nPv, 12);
    EXPECT_EQ(tavo::ParsePvLine("  /dev/sdb|vg1|u|1x\n")->nPv, 0);
    for (const char *bad :
         {"", "  ", "/dev/sdb|vg1|u|1", "  WARNING: a|b|c|d", "  /dev/sdb|vg1|u", "\t /dev/sdb|v|u|1"})
        EXPECT_FALSE(tavo::ParsePvLine(bad)) << bad;
    const std::string name(1000, 'a');
    const auto longest = tavo::ParsePvLine("  /dev/" + name + "|vg" + name + "|" + name + "|1");
    EXPECT_EQ(std::string(longest->szPv).size(), 127u);
    EXPECT_EQ(std::string(longest->szVg).size(), 127u);
    EXPECT_EQ(std::string(longest->szUuid).size(), 255u);
    for (std::string_view text = test::Capture("pvs_plain-lvm2-2.03"); !text.empty();)
        EXPECT_FALSE(tavo::ParsePvLine(tavo::TakeLine(text)));
}

TEST(LvmLines, OfTheNextRelease)
{
    std::string_view text = test::Capture("pvs-lvm2-2.03.31");
    const auto alone = tavo::ParsePvLine(tavo::TakeLine(text));
    const auto grouped = tavo::ParsePvLine(tavo::TakeLine(text));
    ASSERT_TRUE(alone && grouped);
    EXPECT_STREQ(alone->szPv, "/dev/md1");
    EXPECT_STREQ(alone->szVg, "");
    EXPECT_EQ(alone->nPv, 0);
    EXPECT_STREQ(grouped->szPv, "/dev/md5");
    EXPECT_STREQ(grouped->szVg, "/dev/vg1");
    EXPECT_EQ(grouped->nPv, 1);
    EXPECT_EQ(tavo::ParseVgLine(test::Capture("vgs-lvm2-2.03.31")), grouped->szUuid);
    text = test::Capture("pvs_lv-lvm2-2.03.31");
    EXPECT_FALSE(tavo::ParsePvVolumeLine(tavo::TakeLine(text))) << "in no group";
    const auto volume = tavo::ParsePvVolumeLine(tavo::TakeLine(text));
    ASSERT_TRUE(volume);
    EXPECT_EQ(volume->device, "/dev/md5");
    EXPECT_EQ(volume->group, "vg1");
    EXPECT_EQ(volume->volume, "lv");
}

TEST(LvmLines, GroupsAndVolumes)
{
    EXPECT_EQ(tavo::ParseVgLine(test::Capture("vgs-lvm2-2.03")), "lSQfeY-dso4-NzXN-Hbdv-wh1J-WThm-cNRXi7");
    for (const char *bad : {"", "  \n", "UUID", "  WARNING: device is missing"})
        EXPECT_FALSE(tavo::ParseVgLine(bad)) << bad;
    const auto volume = tavo::ParsePvVolumeLine("  /dev/md1:vg1:volume_1:");
    ASSERT_TRUE(volume);
    EXPECT_EQ(volume->device, "/dev/md1");
    EXPECT_EQ(volume->group, "vg1");
    EXPECT_EQ(volume->volume, "volume_1");
    for (const char *bad : {"", "  /dev/md1:vg1", "  /dev/md1:::", "  /dev/md1:..:lv:", "  /dev/md1:vg1:a b:"})
        EXPECT_FALSE(tavo::ParsePvVolumeLine(bad)) << bad;
}

TEST(VolumeName, BothSpellings)
{
    const tavo::VolumeName plain = {"vg1", "lv"};
    EXPECT_EQ(tavo::ParseVolumePath("/dev/vg1/lv"), plain);
    EXPECT_EQ(tavo::ParseVolumePath("/dev/mapper/vg1-lv"), plain);
    EXPECT_EQ(tavo::ParseVolumePath("/dev/mapper/vg--a-b--c"), (tavo::VolumeName{"vg-a", "b-c"}));
    for (const char *bad :
         {"/dev/sda1", "/dev/mapper/control", "/dev/mapper/a-b-c", "/dev/vg1/../etc", "proc", "/dev/"})
        EXPECT_FALSE(tavo::ParseVolumePath(bad)) << bad;
    for (const char *good : {"lvs", "lvs1", "lvs20"})
        EXPECT_TRUE(tavo::IsSnapshotName(good, "lv")) << good;
    for (const char *bad : {"lv", "lvstore", "lv1", "lvs1x", "l"})
        EXPECT_FALSE(tavo::IsSnapshotName(bad, "lv")) << bad;
    for (const char *bad : {"/dev/vg1 /etc", "/dev/vg/../../etc", "/dev/vg1;", "/dev/md2", "/dev/vg..", "/dev/vg1/lv"})
        EXPECT_FALSE(tavo::IsGroupPath(bad)) << bad;
    EXPECT_TRUE(tavo::IsGroupPath("/dev/vg1"));
    EXPECT_TRUE(tavo::IsGroupPath("/dev/vg_a.b+c-d"));
}

TEST(MountTable, PathsAreDecoded)
{
    const auto mounts = tavo::ParseMounts("/dev/vg1/lvs1 /mnt/a\\040b\\134 ext4 rw 0 0\nshort line\n");
    ASSERT_EQ(mounts.size(), 1u);
    EXPECT_EQ(mounts[0].source, "/dev/vg1/lvs1");
    EXPECT_EQ(mounts[0].point, "/mnt/a b\\");
    EXPECT_EQ(mounts[0].type, "ext4");
}

}  // namespace
