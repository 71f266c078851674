// What mdadm and the LVM tools print, and what becomes the name of an array, a group or a volume.
#include "core/detail/text_fields.h"
#include "storage/detail/array_name.h"
#include "storage/detail/lvm_line.h"
#include "storage/detail/mdadm_examine.h"
#include "storage/detail/volume_name.h"
#include "support/captures.h"
#include "support/test.h"

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
    // Version, UUID, array, level, members, role and events.
    const std::pair<const char *, const char *> rows[] = {
        {"mdadm_E_0.90-mdadm-4.2", "0.90 99a1cb1e:1aaa3c52:49268cdc:b4e6580a /dev/md1 2 2 0 18"},
        {"mdadm_E_1.2-mdadm-4.2", "1.2 495e879a:4e806313:a484c744:9c844bd2 /dev/md0 2 2 0 19"},
        {"mdadm_E_1.2_raid5-mdadm-4.2", "1.2 b7e9ed0e:bf1ea758:5bf5fba6:7c359649 /dev/md5 4 3 0 19"},
        {"mdadm_E_0.90-mdadm-4.4", "0.90 7f3ba539:4502fd79:c7780c0e:bc15422d /dev/md1 2 2 0 1"},
        {"mdadm_E_1.1-mdadm-4.4", "1.1 ec25d9d6:a7330043:4ae7249b:66581f6c /dev/md0 2 2 0 0"},
        {"mdadm_E_1.2_raid5-mdadm-4.4", "1.2 35dd76be:fd15b260:63ed28c1:35177f1d /dev/md5 4 3 0 18"},
        {"mdadm_E_1.2_raid5_spare-mdadm-4.4", "1.2 35dd76be:fd15b260:63ed28c1:35177f1d /dev/md5 4 3 -1 18"},
    };
    for (const auto &[capture, record] : rows) {
        const RAIDSUPERBLOCK superblock = Examine(test::Capture(capture));
        std::ostringstream text;
        text << superblock.nMajor << "." << superblock.nMinor << " " << superblock.szUuid << " " << superblock.szArray
             << " " << superblock.fLevel << " " << superblock.nMember << " " << superblock.iRole << " "
             << superblock.nEvent;
        EXPECT_EQ(text.str(), record) << capture;
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
    const std::pair<const char *, const char *> names[] = {
        {"nas:data", ""},     {"nas:7  (local to host nas)", "/dev/md7"},
        {"12", "/dev/md12"},  {"nas:data (host a:3)", ""},
        {"nas:-1", ""},       {"nas:03", ""},
        {"nas:9999999", ""},  {"", ""},
        {"a:b:4", "/dev/md4"}};
    for (const auto &[name, array] : names)
        EXPECT_STREQ(Examine(std::string("Name : ") + name + "\n").szArray, array) << name;
    const std::pair<const char *, int> levels[] = {{"raid0", 1},   {"raid1", 2},   {"raid5", 4}, {"raid6", 8},
                                                   {"raid10", 16}, {"linear", 32}, {"raid4", 4}};
    for (const auto &[name, level] : levels)
        EXPECT_EQ(Examine(std::string("Raid Level : ") + name + "\n").fLevel, level) << name;
    const std::string longest = "UUID : " + std::string(4096, 'a');
    EXPECT_EQ(std::string(Examine(longest).szUuid).size(), 63u);
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

std::string Text(const std::optional<LVMPV> &pv)
{
    if (!pv)
        return "none";
    return std::string(pv->szPv) + "|" + pv->szVg + "|" + pv->szUuid + "|" + std::to_string(pv->nPv);
}

std::string Text(const std::optional<tavo::PvVolume> &found)
{
    return found ? std::string(found->device) + ":" + std::string(found->group) + ":" + std::string(found->volume)
                 : "none";
}

TEST(LvmLines, PhysicalVolumes)
{
    std::string_view text = test::Capture("pvs-lvm2-2.03.31");
    const std::string_view alone = tavo::TakeLine(text);
    const std::string_view grouped = tavo::TakeLine(text);
    const std::pair<std::string_view, std::string> rows[] = {
        {test::Capture("pvs-lvm2-2.03"), "/dev/md0|/dev/vg0|lSQfeY-dso4-NzXN-Hbdv-wh1J-WThm-cNRXi7|1"},
        {alone, "/dev/md1|||0"},
        {grouped, "/dev/md5|/dev/vg1|I5URFi-Bxlx-qBSq-PkGD-bnBP-0a8g-N821GL|1"},
        {"  /dev/sdb|||0\n", "/dev/sdb|||0"},
        {"  /dev/sdb|data|u|2", "/dev/sdb||u|2"},
        {"  /dev/sdb|vg1|u|12|more\n", "/dev/sdb|/dev/vg1|u|12"},
        {"  /dev/sdb|vg1|u|1x\n", "/dev/sdb|/dev/vg1|u|0"},
    };
    for (const auto &[line, record] : rows)
        EXPECT_EQ(Text(tavo::ParsePvLine(line)), record) << line;
    for (const char *bad :
         {"", "  ", "/dev/sdb|vg1|u|1", "  WARNING: a|b|c|d", "  /dev/sdb|vg1|u", "\t /dev/sdb|v|u|1"})
        EXPECT_FALSE(tavo::ParsePvLine(bad)) << bad;
    const std::string name(1000, 'a');
    const auto longest = tavo::ParsePvLine("  /dev/" + name + "|vg" + name + "|" + name + "|1");
    EXPECT_EQ(std::string(longest->szPv).size(), 127u);
    EXPECT_EQ(std::string(longest->szVg).size(), 127u);
    EXPECT_EQ(std::string(longest->szUuid).size(), 255u);
    for (text = test::Capture("pvs_plain-lvm2-2.03"); !text.empty();)
        EXPECT_FALSE(tavo::ParsePvLine(tavo::TakeLine(text)));
}

TEST(LvmLines, GroupsAndVolumes)
{
    EXPECT_EQ(tavo::ParseVgLine(test::Capture("vgs-lvm2-2.03")), "lSQfeY-dso4-NzXN-Hbdv-wh1J-WThm-cNRXi7");
    EXPECT_EQ(tavo::ParseVgLine(test::Capture("vgs-lvm2-2.03.31")), "I5URFi-Bxlx-qBSq-PkGD-bnBP-0a8g-N821GL");
    for (const char *bad : {"", "  \n", "UUID", "  WARNING: device is missing"})
        EXPECT_FALSE(tavo::ParseVgLine(bad)) << bad;
    std::string_view text = test::Capture("pvs_lv-lvm2-2.03.31");
    EXPECT_FALSE(tavo::ParsePvVolumeLine(tavo::TakeLine(text))) << "in no group";
    EXPECT_EQ(Text(tavo::ParsePvVolumeLine(tavo::TakeLine(text))), "/dev/md5:vg1:lv");
    EXPECT_EQ(Text(tavo::ParsePvVolumeLine("  /dev/md1:vg1:volume_1:")), "/dev/md1:vg1:volume_1");
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

}  // namespace
