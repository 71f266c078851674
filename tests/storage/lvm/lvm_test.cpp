// Physical volumes, groups and volumes: read from the tools' lines, changed by exactly these commands.
#include "tavo_lvm.h"

#include "support/captured_log.h"
#include "support/captures.h"
#include "support/container_text.h"
#include "support/device_tree.h"
#include "support/recorded_calls.h"
#include "support/recorded_commands.h"

#include <gmock/gmock.h>

#include <functional>
#include <memory>

#include <unistd.h>

using test::List;
using test::MakeList;
using testing::Contains;
using testing::ElementsAre;
using testing::IsEmpty;
using testing::MatchesRegex;

namespace {

const std::string kPvs = "/sbin/pvs --noheading -o pv_name,vg_name,vg_uuid,pv_count --separator \"|\"";

class Lvm : public testing::Test {
  protected:
    Lvm()
    {
        tree_.Put("/etc.defaults/tavoinfo.conf", "supportraid=yes\n");
        tree_.Put("/proc/mounts", "");
    }

    test::DeviceTree tree_;
    test::CapturedLog log_;
    test::RecordedCalls calls_;
    test::RecordedCommands commands_;
};

TEST_F(Lvm, Readers)
{
    commands_.OnCommand([](const std::string &command) -> test::CommandReply {
        if (command.starts_with("/sbin/pvs "))
            return {0, "  WARNING: something|else|is|wrong\n" + std::string(test::Capture("pvs-lvm2-2.03")) +
                           "  /dev/md3|vg0|lSQfeY-dso4-NzXN-Hbdv-wh1J-WThm-cNRXi7|2\n  /dev/md4|||0\n"};
        return {0, std::string(test::Capture("vgs-lvm2-2.03"))};
    });
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
    EXPECT_THAT(commands_.Commands(), ElementsAre(kPvs + " /dev/md0 2>/dev/null", kPvs + " 2>/dev/null",
                                                  "/sbin/vgs --noheading -o vg_uuid /dev/vg0 2>/dev/null"));

    LVMVGINFO *const info = LVMVgInfoAlloc();
    ASSERT_TRUE(info);
    EXPECT_EQ(info->fValid, 0);
    EXPECT_EQ(LVMVgSB2Info(&vg, info), 0);
    EXPECT_EQ(info->fValid, 1);
    EXPECT_EQ(info->nPv, 2);
    EXPECT_STREQ(info->szVg, "/dev/vg0");
    EXPECT_STREQ(info->szUuid, vg.szUuid);
    EXPECT_STREQ(info->pslPvs->pszItem[1], "/dev/md3");
    log_.Clear();
    const LVMVG nameless = {};
    EXPECT_EQ(LVMVgSB2Info(&nameless, info), -1) << "md4 is in no group";
    EXPECT_EQ(info->nPv, 2);
    EXPECT_THAT(log_.Texts(), ElementsAre(MatchesRegex("lvm_vg_sb2_info:[0-9]+ Bad parameters")));
    log_.Clear();
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

    commands_.OnCommand([](const std::string &) -> test::CommandReply { return {5, ""}; });
    EXPECT_EQ(LVMPvSBGet("/dev/md0", &pv), 0);
    EXPECT_EQ(LVMPvSBEnum(&list), 0);
    EXPECT_EQ(LVMVgSBGet("/dev/vg0", &vg), 0);
    commands_.Clear();
    tree_.Put("/etc.defaults/tavoinfo.conf", "supportraid=no\n");
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
        {[] { return LVMPvCreate("/dev/md2"); }, "/sbin/pvcreate -ff -y --metadatasize 16K /dev/md2 > /dev/null 2>&1"},
        {[] { return LVMPvRemove("/dev/sda3"); }, "/sbin/pvremove -ff -y /dev/sda3 > /dev/null 2>&1"},
        {[] { return LVMPvScan(); }, "/sbin/pvscan > /dev/null 2>&1"},
        {[] { return LVMRemove("/dev/vg1", "lv"); }, "/sbin/lvremove -f /dev/vg1 > /dev/null 2>&1"},
        {[] { return LVMVgRename("/dev/vg1", nullptr, "vg2"); }, "/sbin/lvm vgrename /dev/vg1 vg2 > /dev/null 2>&1"},
        {[] { return LVMVgRename(nullptr, "vg1", "vg2"); }, "/sbin/lvm vgrename vg1 vg2 > /dev/null 2>&1"},
    };
    for (const auto &[call, command] : rows) {
        commands_.OnCommand({});
        commands_.Clear();
        log_.Clear();
        EXPECT_EQ(call(), 0) << command;
        EXPECT_THAT(commands_.Commands(), ElementsAre(command));
        EXPECT_THAT(log_.Lines(), IsEmpty());
        commands_.OnCommand([](const std::string &) -> test::CommandReply { return {5, ""}; });
        EXPECT_EQ(call(), -1) << command;
        EXPECT_THAT(log_.Texts(), ElementsAre(testing::HasSubstr("Failed to '" + command + "'")));
    }
    commands_.Clear();
    log_.Clear();
    EXPECT_EQ(LVMVgRemove("/dev/vg1"), -1);
    EXPECT_THAT(commands_.Commands(), ElementsAre("/sbin/vgremove /dev/vg1 > /dev/null 2>&1"));
    EXPECT_THAT(log_.Texts(), ElementsAre(MatchesRegex("lvm_vg_remove:[0-9]+ Failed to vgremove '/dev/vg1'")));
    commands_.OnCommand({});
    commands_.Clear();
    EXPECT_EQ(LVMVgRemove("/dev/vg1"), 0);
    EXPECT_THAT(commands_.Commands(),
                ElementsAre("/sbin/vgremove /dev/vg1 > /dev/null 2>&1", "/bin/rm -rf /dev/vg1 > /dev/null 2>&1"));
    EXPECT_EQ(LVMRemove("/dev/vg1", "pv"), -1);
    log_.Clear();
    EXPECT_EQ(LVMVgRename("/dev/vg1", "vg1", nullptr), -1);
    EXPECT_THAT(log_.Texts(), ElementsAre(MatchesRegex("lvm_vg_rename:[0-9]+ BAD_PARAMETERS")));
}

TEST_F(Lvm, GroupIsTriedTwice)
{
    const List devices = MakeList({"/dev/md2", "/dev/md3"});
    const std::string marker = "/tmp/lvm_test_vgcreate";
    const std::string command = "/sbin/vgcreate /dev/vg1  /dev/md2 /dev/md3 > /dev/null 2>&1";
    ::unlink(marker.c_str());
    commands_.OnCommand([&](const std::string &) -> test::CommandReply {
        if (::access(marker.c_str(), F_OK) == 0)
            return {0, ""};
        std::fclose(std::fopen(marker.c_str(), "w"));
        return {5, ""};
    });
    EXPECT_EQ(LVMVgCreate("/dev/vg1", devices.get()), 0);
    EXPECT_THAT(commands_.Commands(), ElementsAre(command, command));
    EXPECT_THAT(log_.Lines(), IsEmpty());
    ::unlink(marker.c_str());
    commands_.OnCommand([](const std::string &) -> test::CommandReply { return {5, ""}; });
    EXPECT_EQ(LVMVgCreate("/dev/vg1", devices.get()), -1);
    EXPECT_THAT(log_.Texts(), ElementsAre(MatchesRegex("lvm_vg_create:[0-9]+ Failed to '/sbin/vgcreate .*', errno=5")));
}

TEST_F(Lvm, CreateAllAtOnce)
{
    const List devices = MakeList({"/dev/md2", "/dev/md3"});
    commands_.OnCommand([](const std::string &command) -> test::CommandReply {
        return {0, command.starts_with("/sbin/vgs") ? std::string(test::Capture("vgs-lvm2-2.03")) : ""};
    });
    char uuid[8] = "";
    EXPECT_EQ(LVMCreate(devices.get(), "/dev/vg9", "lv", uuid, sizeof uuid), 0);
    EXPECT_STREQ(uuid, "lSQfeY-");
    EXPECT_THAT(commands_.Commands(), ElementsAre("/sbin/pvcreate -ff -y --metadatasize 16K /dev/md2 > /dev/null 2>&1",
                                                  "/sbin/pvcreate -ff -y --metadatasize 16K /dev/md3 > /dev/null 2>&1",
                                                  "/sbin/vgcreate /dev/vg9  /dev/md2 /dev/md3 > /dev/null 2>&1",
                                                  "/sbin/vgs --noheading -o vg_uuid /dev/vg9 2>/dev/null",
                                                  "/sbin/lvcreate /dev/vg9 -n lv -l100%VG > /dev/null 2>&1"));
    EXPECT_THAT(log_.Texts(),
                ElementsAre(MatchesRegex("lvm_lv_create:[0-9]+ Failed to chmod '/dev/vg9' to '1ED', errno=.*")))
        << "and no failure";
    commands_.OnCommand([](const std::string &) -> test::CommandReply { return {0, ""}; });
    log_.Clear();
    EXPECT_EQ(LVMCreate(devices.get(), "/dev/vg9", "lv", nullptr, 0), -1);
    EXPECT_THAT(log_.Texts(), ElementsAre(MatchesRegex(".* failed to get VG superblock: /dev/vg9, ret = 0")));
}

TEST_F(Lvm, WipesWhatAnEarlierVolumeLeft)
{
    const std::string once = "/sbin/lvcreate /dev/vg9 -n lv -l100%VG > /dev/null 2>&1";
    const std::string again = "/sbin/lvcreate -y /dev/vg9 -n lv -l100%VG > /dev/null 2>&1";
    commands_.OnCommand([&](const std::string &command) -> test::CommandReply {
        return {command == once ? 5 : 0, ""};
    });
    EXPECT_EQ(LVMLvCreate("/dev/vg9", "lv"), 0);
    EXPECT_THAT(commands_.Commands(), ElementsAre(once, again));
    commands_.OnCommand([](const std::string &) -> test::CommandReply { return {5, ""}; });
    log_.Clear();
    EXPECT_EQ(LVMLvCreate("/dev/vg9", "lv"), -1);
    EXPECT_THAT(log_.Texts(), ElementsAre(testing::HasSubstr("Failed to '" + again + "'")));
}

TEST_F(Lvm, ExpandTriesAll)
{
    LVMVGINFO *const info = LVMVgInfoAlloc();
    TLIBSzListPush(&info->pslPvs, "/dev/md2");
    TLIBSzListPush(&info->pslPvs, "/dev/md3");
    commands_.OnCommand([](const std::string &command) -> test::CommandReply {
        return {command.find("md2") != command.npos ? 5 : 0, ""};
    });
    EXPECT_EQ(LVMPvExpand(info), -1);
    EXPECT_THAT(commands_.Commands(),
                ElementsAre("/sbin/pvresize /dev/md2 > /dev/null 2>&1", "/sbin/pvresize /dev/md3 > /dev/null 2>&1"));
    LVMVgInfoFree(info);
}

TEST_F(Lvm, RemovesTheVolumeOfOneDeviceAlone)
{
    commands_.OnCommand([](const std::string &command) -> test::CommandReply {
        return {0, command.starts_with("pvs ") ? "  /dev/md10:vg2:other:\n  /dev/md1:vg1:lv:\n" : ""};
    });
    tree_.Put("/proc/mounts",
              "/dev/vg1/lv /volume1 ext4 rw 0 0\n/dev/vg1/lvs1 /nowhere/a\\040b ext4 rw 0 0\n"
              "/dev/mapper/vg1-lvs2 /nowhere/c ext4 rw 0 0\n/dev/vg1/lvs3 /x aufs rw 0 0\n"
              "/dev/vg1/lvs4 / ext4 rw 0 0\n/dev/vg1/lvstore /y ext4 rw 0 0\n/dev/vg2/lvs1 /z ext4 rw 0 0\n");
    EXPECT_EQ(LVMRemoveLV("/dev/md1"), 0);
    EXPECT_THAT(commands_.Commands(),
                ElementsAre("pvs -o pv_name,vg_name,lv_name,origin --noheading --separator : | grep /dev/md1",
                            "umount -f '/nowhere/a b' > /dev/null 2>&1", "lvremove -f /dev/vg1/lvs1 > /dev/null 2>&1",
                            "umount -f /nowhere/c > /dev/null 2>&1",
                            "lvremove -f /dev/mapper/vg1-lvs2 > /dev/null 2>&1",
                            "lvremove -f /dev/vg1/lv > /dev/null 2>&1", "vgremove -f /dev/vg1 > /dev/null 2>&1",
                            "pvremove -f /dev/md1 > /dev/null 2>&1"));
    EXPECT_THAT(calls_.Calls(), ElementsAre("sleep 1", "sleep 1"));
    EXPECT_THAT(log_.Texts(), ElementsAre(MatchesRegex("lvm_remove_lv:[0-9]+ Failed to rmdir\\(/nowhere/a b\\)"),
                                          MatchesRegex("lvm_remove_lv:[0-9]+ Failed to rmdir\\(/nowhere/c\\)")));
    commands_.Clear();
    EXPECT_EQ(LVMRemoveLV("/dev/md3"), 0) << "nothing on it";
    EXPECT_EQ(commands_.Commands().size(), 1u);
    char path[64] = "";
    EXPECT_EQ(LVMGetLVPath("/dev/md10", path, sizeof path), 1);
    EXPECT_STREQ(path, "/dev/vg2/other");
    EXPECT_EQ(LVMGetLVPath("/dev/md10", path, 14), -1);
}

TEST_F(Lvm, CleansUnusedDisks)
{
    const std::string marker = "/tmp/lvm_test_removed";
    ::unlink(marker.c_str());
    commands_.OnCommand([&](const std::string &command) -> test::CommandReply {
        if (command.find("/sbin/pvremove -ff -y /dev/sda3") == 0)
            std::fclose(std::fopen(marker.c_str(), "w"));
        if (!command.starts_with("/sbin/pvs "))
            return {command.find("vg4") != command.npos ? 5 : 0, ""};
        const std::string rest =
            "  /dev/sdb3|vg2|u|2\n  /dev/sdk1|vg2|u|2\n  /dev/sdc|root|u|1\n  /dev/md2|vg3|u|1\n  /dev/sdd|vg4|u|1\n";
        return {0, (::access(marker.c_str(), F_OK) == 0 ? "" : "  /dev/sda3|vg1|u|1\n") + rest};
    });
    const std::string scan = "/sbin/pvscan > /dev/null 2>&1";
    const std::string pvs = kPvs + " 2>/dev/null";
    const std::string busy = "/sbin/lvremove -f /dev/vg4 > /dev/null 2>&1";
    tree_.Put("/sys/class/block/sdc/holders/dm-0", "");
    // What is in use is seen before anything is removed.
    tree_.Put("/proc/mounts", "/dev/mapper/vg2-lv /volume2 ext4 rw 0 0\n");
    EXPECT_EQ(LVMCleanIllegal(), -1);
    EXPECT_THAT(log_.Texts(),
                ElementsAre(MatchesRegex("lvm_clean_illegal:[0-9]+ /dev/sdb3 is in use: /dev/vg2 is mounted")));
    tree_.Put("/proc/mounts", "");
    tree_.Put("/sys/class/block/sdc/holders/md1", "");
    EXPECT_EQ(LVMCleanIllegal(), -1);
    tree_.Remove("/sys/class/block/sdc/holders/md1");
    tree_.Put("/sys/class/block/dm-0/dm/name", "other-lv\n");
    EXPECT_EQ(LVMCleanIllegal(), -1);
    EXPECT_THAT(log_.Texts(), Contains(MatchesRegex("lvm_clean_illegal:[0-9]+ /dev/sdc is in use")).Times(2));
    EXPECT_THAT(commands_.Commands(), ElementsAre(scan, pvs, scan, pvs, scan, pvs));
    tree_.Remove("/sys/class/block/dm-0");
    commands_.Clear();

    // The group on sdb3 reaches onto a stick.
    tree_.Put("/sys/block/sdk/device/idVendor", "0951\n");
    tree_.Put("/sys/block/sdk/device/idProduct", "1666\n");
    EXPECT_EQ(LVMCleanIllegal(), 0);
    EXPECT_THAT(commands_.Commands(),
                ElementsAre(scan, pvs, "/sbin/lvremove -f /dev/vg1 > /dev/null 2>&1",
                            "/sbin/pvremove -ff -y /dev/sda3 > /dev/null 2>&1", busy, scan, pvs, busy));
    EXPECT_THAT(log_.Texts(), Contains(MatchesRegex("lvm_clean_illegal:[0-9]+ /dev/sdk1 stays: .* USB .*")));
    EXPECT_THAT(log_.Texts(), Contains(MatchesRegex("lvm_clean_illegal:[0-9]+ /dev/sdb3 stays: .*")));
    ::unlink(marker.c_str());
    commands_.OnCommand([](const std::string &) -> test::CommandReply { return {5, ""}; });
    EXPECT_EQ(LVMCleanIllegal(), -1);
}

}  // namespace
