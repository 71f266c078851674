// Physical volumes, groups and volumes: read from the tools' lines, changed by exactly these commands.
#include "tavo_lvm.h"

#include "storage/storage_scene.h"

#include <gmock/gmock.h>

#include <cstdio>
#include <functional>

#include <unistd.h>

using test::CommandReply;
using test::List;
using test::MakeList;
using test::Quiet;
using testing::ElementsAre;
using testing::HasSubstr;
using testing::IsEmpty;

namespace {

const std::string kPvs = "/sbin/pvs --noheading -o pv_name,vg_name,vg_uuid,pv_count --separator \"|\"";

class Lvm : public test::StorageScene {
  protected:
    Lvm()
    {
        Model("supportraid=yes\n");
        tree_.Put("/proc/mounts", "");
        ::unlink(kMarker);
    }

    static void Mark() { std::fclose(std::fopen(kMarker, "w")); }
    static bool IsMarked() { return ::access(kMarker, F_OK) == 0; }

    static constexpr const char *kMarker = "/tmp/lvm_test";  // made by a command
};

TEST_F(Lvm, Readers)
{
    const std::string one = kPvs + " /dev/md0 2>/dev/null";
    const std::string all = kPvs + " 2>/dev/null";
    const std::string group = "/sbin/vgs --noheading -o vg_uuid /dev/vg0 2>/dev/null";
    const std::string lines = "  WARNING: something|else|is|wrong\n" + std::string(test::Capture("pvs-lvm2-2.03")) +
                              "  /dev/md3|vg0|lSQfeY-dso4-NzXN-Hbdv-wh1J-WThm-cNRXi7|2\n  /dev/md4|||0\n";
    commands_.Print({{one, lines}, {all, lines}, {group, std::string(test::Capture("vgs-lvm2-2.03"))}});
    LVMPV pv = {};
    EXPECT_EQ(LVMPvSBGet("/dev/md0", &pv), 1);
    EXPECT_STREQ(pv.szVg, "/dev/vg0");
    LVMPVLIST *list = nullptr;
    EXPECT_EQ(LVMPvSBEnum(&list), 3);
    EXPECT_STREQ(list->pNext->pNext->pv.szPv, "/dev/md4");
    LVMPvSBListFree(list);
    LVMVG vg = {};
    EXPECT_EQ(LVMVgSBGet("/dev/vg0", &vg), 1);
    EXPECT_STREQ(vg.szVg, "/dev/vg0");
    EXPECT_STREQ(vg.szUuid, "lSQfeY-dso4-NzXN-Hbdv-wh1J-WThm-cNRXi7");
    EXPECT_THAT(commands_.Take(), ElementsAre(one, all, group));

    LVMVGINFO *const info = LVMVgInfoAlloc();
    ASSERT_TRUE(info);
    EXPECT_EQ(info->fValid, 0);
    EXPECT_EQ(LVMVgSB2Info(&vg, info), 0);
    EXPECT_EQ(info->fValid, 1);
    EXPECT_EQ(info->nPv, 2);
    EXPECT_STREQ(info->szVg, "/dev/vg0");
    EXPECT_STREQ(info->szUuid, vg.szUuid);
    EXPECT_STREQ(info->pslPvs->pszItem[1], "/dev/md3");
    const LVMVG nameless = {};
    EXPECT_EQ(LVMVgSB2Info(&nameless, info), -1) << "md4 is in no group";
    EXPECT_EQ(info->nPv, 2);
    EXPECT_EQ(log_.Take(), "lvm_vg_sb2_info:# Bad parameters");
    const LVMVGLIST node = {info, nullptr};
    LVMVGINFO *found = nullptr;
    const struct {
        const char *vg, *pv;
        int result;
    } rows[] = {{"/dev/vg0", nullptr, 1},
                {nullptr, "/dev/md3", 1},
                {"/dev/vg1", "/dev/md3", 1},
                {"/dev/vg1", "/dev/md4", 0},
                {nullptr, nullptr, 0}};
    for (const auto &row : rows) {
        found = nullptr;
        const LVMVGKEY key = {row.vg, row.pv};
        EXPECT_EQ(LVMVgSBListSearch(&node, &key, &found), row.result);
        EXPECT_EQ(found == info, row.result == 1);
    }
    LVMVgInfoFree(info);

    commands_.Exit(5);
    EXPECT_EQ(LVMPvSBGet("/dev/md0", &pv), 0);
    EXPECT_EQ(LVMPvSBEnum(&list), 0);
    EXPECT_EQ(LVMVgSBGet("/dev/vg0", &vg), 0);
    commands_.Clear();
    Model("supportraid=no\n");
    EXPECT_EQ(LVMIsSupport(), 0);
    EXPECT_EQ(LVMPvSBGet("/dev/md0", &pv), 0);
    EXPECT_EQ(LVMPvSBEnum(&list), 0);
    EXPECT_EQ(LVMVgSBGet("/dev/vg0", &vg), 0);
    EXPECT_EQ(LVMCleanIllegal(), 0);
    EXPECT_THAT(commands_.Commands(), IsEmpty());
    EXPECT_THAT(log_.Lines(), IsEmpty());
}

TEST_F(Lvm, ChangesRunExactlyTheseCommands)
{
    const std::pair<std::function<int()>, std::string> rows[] = {
        {[] { return LVMPvCreate("/dev/md2"); }, Quiet("/sbin/pvcreate -ff -y --metadatasize 16K /dev/md2")},
        {[] { return LVMPvRemove("/dev/sda3"); }, Quiet("/sbin/pvremove -ff -y /dev/sda3")},
        {[] { return LVMPvScan(); }, Quiet("/sbin/pvscan")},
        {[] { return LVMRemove("/dev/vg1", "lv"); }, Quiet("/sbin/lvremove -f /dev/vg1")},
        {[] { return LVMVgRename("/dev/vg1", nullptr, "vg2"); }, Quiet("/sbin/lvm vgrename /dev/vg1 vg2")},
        {[] { return LVMVgRename(nullptr, "vg1", "vg2"); }, Quiet("/sbin/lvm vgrename vg1 vg2")},
    };
    for (const auto &[call, command] : rows) {
        commands_.Exit(0);
        EXPECT_EQ(call(), 0) << command;
        EXPECT_THAT(commands_.Take(), ElementsAre(command));
        EXPECT_EQ(log_.Take(), "");
        commands_.Exit(5);
        EXPECT_EQ(call(), -1) << command;
        EXPECT_EQ(log_.Lines().size(), 1u);
        EXPECT_THAT(log_.Take(), testing::EndsWith("Failed to '" + command + "'"));
        commands_.Clear();
    }
    EXPECT_EQ(LVMVgRemove("/dev/vg1"), -1);
    EXPECT_THAT(commands_.Take(), ElementsAre(Quiet("/sbin/vgremove /dev/vg1")));
    EXPECT_EQ(log_.Take(), "lvm_vg_remove:# Failed to vgremove '/dev/vg1'");
    commands_.Exit(0);
    EXPECT_EQ(LVMVgRemove("/dev/vg1"), 0);
    EXPECT_THAT(commands_.Take(), ElementsAre(Quiet("/sbin/vgremove /dev/vg1"), Quiet("/bin/rm -rf /dev/vg1")));
    EXPECT_EQ(LVMVgRemove("/dev/md2"), -1);
    EXPECT_EQ(LVMRemove("/dev/vg1", "pv"), -1);
    log_.Clear();
    EXPECT_EQ(LVMVgRename("/dev/vg1", "vg1", nullptr), -1);
    EXPECT_EQ(log_.Take(), "lvm_vg_rename:# BAD_PARAMETERS");
    EXPECT_THAT(commands_.Take(), IsEmpty());
}

TEST_F(Lvm, GroupIsTriedTwice)
{
    const List devices = MakeList({"/dev/md2", "/dev/md3"});
    const std::string command = Quiet("/sbin/vgcreate /dev/vg1  /dev/md2 /dev/md3");
    commands_.OnCommand([](const std::string &) {
        if (IsMarked())
            return CommandReply{0};
        Mark();
        return CommandReply{5};
    });
    EXPECT_EQ(LVMVgCreate("/dev/vg1", devices.get()), 0);
    EXPECT_THAT(commands_.Take(), ElementsAre(command, command));
    EXPECT_EQ(log_.Take(), "");
    commands_.Exit(5);
    EXPECT_EQ(LVMVgCreate("/dev/vg1", devices.get()), -1);
    EXPECT_EQ(log_.Take(), "lvm_vg_create:# Failed to '" + command + "', errno=5");
}

TEST_F(Lvm, CreateAllAtOnce)
{
    const List devices = MakeList({"/dev/md2", "/dev/md3"});
    const std::string query = "/sbin/vgs --noheading -o vg_uuid /dev/vg9 2>/dev/null";
    commands_.Print({{query, std::string(test::Capture("vgs-lvm2-2.03"))}});
    char uuid[8] = "";
    EXPECT_EQ(LVMCreate(devices.get(), "/dev/vg9", "lv", uuid, sizeof uuid), 0);
    EXPECT_STREQ(uuid, "lSQfeY-");
    EXPECT_THAT(commands_.Take(), ElementsAre(Quiet("/sbin/pvcreate -ff -y --metadatasize 16K /dev/md2"),
                                              Quiet("/sbin/pvcreate -ff -y --metadatasize 16K /dev/md3"),
                                              Quiet("/sbin/vgcreate /dev/vg9  /dev/md2 /dev/md3"), query,
                                              Quiet("/sbin/lvcreate /dev/vg9 -n lv -l100%VG")));
    EXPECT_EQ(log_.Take(), "lvm_lv_create:# Failed to chmod '/dev/vg9' to '1ED', errno=No such file or directory")
        << "and no failure";
    commands_.Exit(0);
    EXPECT_EQ(LVMCreate(devices.get(), "/dev/vg9", "lv", nullptr, 0), -1);
    EXPECT_EQ(log_.Take(), "lvm_create:# failed to get VG superblock: /dev/vg9, ret = 0");
}

TEST_F(Lvm, WipesWhatAnEarlierVolumeLeft)
{
    const std::string once = Quiet("/sbin/lvcreate /dev/vg9 -n lv -l100%VG");
    const std::string again = Quiet("/sbin/lvcreate -y /dev/vg9 -n lv -l100%VG");
    commands_.Fail(once, 5);
    EXPECT_EQ(LVMLvCreate("/dev/vg9", "lv"), 0);
    EXPECT_THAT(commands_.Take(), ElementsAre(once, again));
    commands_.Exit(5);
    log_.Clear();
    EXPECT_EQ(LVMLvCreate("/dev/vg9", "lv"), -1);
    EXPECT_EQ(log_.Take(), "lvm_lv_create:# Failed to '" + again + "'");
}

TEST_F(Lvm, ExpandTriesAll)
{
    LVMVGINFO *const info = LVMVgInfoAlloc();
    TLIBSzListPush(&info->pslPvs, "/dev/md2");
    TLIBSzListPush(&info->pslPvs, "/dev/md3");
    commands_.Fail("md2", 5);
    EXPECT_EQ(LVMPvExpand(info), -1);
    EXPECT_THAT(commands_.Take(), ElementsAre(Quiet("/sbin/pvresize /dev/md2"), Quiet("/sbin/pvresize /dev/md3")));
    LVMVgInfoFree(info);
}

TEST_F(Lvm, RemovesTheVolumeOfOneDeviceAlone)
{
    const auto query = [](const std::string &device) {
        return "pvs -o pv_name,vg_name,lv_name,origin --noheading --separator : | grep " + device;
    };
    const std::string lines = "  /dev/md10:vg2:other:\n  /dev/md1:vg1:lv:\n";
    commands_.Print({{query("/dev/md1"), lines}, {query("/dev/md3"), lines}, {query("/dev/md10"), lines}});
    tree_.Put("/proc/mounts",
              "/dev/vg1/lv /volume1 ext4 rw 0 0\n/dev/vg1/lvs1 /nowhere/a\\040b ext4 rw 0 0\n"
              "/dev/mapper/vg1-lvs2 /nowhere/c ext4 rw 0 0\n/dev/vg1/lvs3 /x aufs rw 0 0\n"
              "/dev/vg1/lvs4 / ext4 rw 0 0\n/dev/vg1/lvstore /y ext4 rw 0 0\n/dev/vg2/lvs1 /z ext4 rw 0 0\n");
    EXPECT_EQ(LVMRemoveLV("/dev/md1"), 0);
    EXPECT_THAT(commands_.Take(),
                ElementsAre(query("/dev/md1"), Quiet("umount -f '/nowhere/a b'"), Quiet("lvremove -f /dev/vg1/lvs1"),
                            Quiet("umount -f /nowhere/c"), Quiet("lvremove -f /dev/mapper/vg1-lvs2"),
                            Quiet("lvremove -f /dev/vg1/lv"), Quiet("vgremove -f /dev/vg1"),
                            Quiet("pvremove -f /dev/md1")));
    EXPECT_THAT(calls_.Take(), ElementsAre("sleep 1", "sleep 1"));
    EXPECT_EQ(log_.Take(),
              "lvm_remove_lv:# Failed to rmdir(/nowhere/a b)\nlvm_remove_lv:# Failed to rmdir(/nowhere/c)");
    EXPECT_EQ(LVMRemoveLV("/dev/md3"), 0) << "nothing on it";
    EXPECT_EQ(commands_.Take().size(), 1u);
    char path[64] = "";
    EXPECT_EQ(LVMGetLVPath("/dev/md10", path, sizeof path), 1);
    EXPECT_STREQ(path, "/dev/vg2/other");
    EXPECT_EQ(LVMGetLVPath("/dev/md10", path, 14), -1);
}

TEST_F(Lvm, CleansUnusedDisks)
{
    commands_.OnCommand([](const std::string &command) -> CommandReply {
        if (command.starts_with("/sbin/pvremove -ff -y /dev/sda3"))
            Mark();
        if (!command.starts_with("/sbin/pvs "))
            return {command.find("vg4") != command.npos ? 5 : 0};
        return {0, std::string(IsMarked() ? "" : "  /dev/sda3|vg1|u|1\n") +
                       "  /dev/sdb3|vg2|u|2\n  /dev/sdk1|vg2|u|2\n  /dev/sdc|root|u|1\n  /dev/md2|vg3|u|1\n"
                       "  /dev/sdd|vg4|u|1\n"};
    });
    const std::string scan = Quiet("/sbin/pvscan");
    const std::string pvs = kPvs + " 2>/dev/null";
    const std::string busy = Quiet("/sbin/lvremove -f /dev/vg4");
    tree_.Put("/sys/class/block/sdc/holders/dm-0", "");
    // What is in use is seen before anything is removed.
    tree_.Put("/proc/mounts", "/dev/mapper/vg2-lv /volume2 ext4 rw 0 0\n");
    EXPECT_EQ(LVMCleanIllegal(), -1);
    EXPECT_EQ(log_.Take(), "lvm_clean_illegal:# /dev/sdb3 is in use: /dev/vg2 is mounted");
    tree_.Put("/proc/mounts", "");
    tree_.Put("/sys/class/block/sdc/holders/md1", "");
    EXPECT_EQ(LVMCleanIllegal(), -1);
    tree_.Remove("/sys/class/block/sdc/holders/md1");
    tree_.Put("/sys/class/block/dm-0/dm/name", "other-lv\n");
    EXPECT_EQ(LVMCleanIllegal(), -1);
    const std::string stays = " stays: it is on a USB disk, or of a group that is\n";
    EXPECT_EQ(log_.Take(), "lvm_clean_illegal:# /dev/sdc is in use\nlvm_clean_illegal:# /dev/sdc is in use");
    EXPECT_THAT(commands_.Take(), ElementsAre(scan, pvs, scan, pvs, scan, pvs));
    tree_.Remove("/sys/class/block/dm-0");

    // The group on sdb3 reaches onto a stick.
    tree_.Put("/sys/block/sdk/device/idVendor", "0951\n");
    tree_.Put("/sys/block/sdk/device/idProduct", "1666\n");
    EXPECT_EQ(LVMCleanIllegal(), 0);
    EXPECT_THAT(commands_.Take(), ElementsAre(scan, pvs, Quiet("/sbin/lvremove -f /dev/vg1"),
                                              Quiet("/sbin/pvremove -ff -y /dev/sda3"), busy, scan, pvs, busy));
    EXPECT_THAT(log_.Take(),
                testing::StartsWith("lvm_clean_illegal:# /dev/sdb3" + stays + "lvm_clean_illegal:# /dev/sdk1" + stays));
    commands_.Exit(5);
    EXPECT_EQ(LVMCleanIllegal(), -1);
}

}  // namespace
