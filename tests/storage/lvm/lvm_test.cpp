// Physical volumes, groups and volumes: read from the tools' lines, changed by exactly these commands.
#include "tavo_lvm.h"

#include "storage/storage_scene.h"
#include "support/test.h"

#include <initializer_list>

using test::CommandReply;
using test::List;
using test::MakeList;

namespace {

const std::string kPvs = "/sbin/pvs --noheading -o pv_name,vg_name,vg_uuid,pv_count --separator \"|\"";

class Lvm : public test::StorageStory {
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
    TELL(LVMPvSBGet("/dev/md0", &pv));
    story_.Show("group", pv.szVg);
    LVMPVLIST *list = nullptr;
    TELL(LVMPvSBEnum(&list));
    story_.Show("third", list->pNext->pNext->pv.szPv);
    LVMPvSBListFree(list);
    LVMVG vg = {};
    TELL(LVMVgSBGet("/dev/vg0", &vg));
    story_.Show("group", vg.szVg);
    story_.Show("UUID", vg.szUuid);

    LVMVGINFO *const info = LVMVgInfoAlloc();
    ASSERT_TRUE(info);
    EXPECT_EQ(info->fValid, 0);
    const LVMVG nameless = {};  // as the group of md4
    for (const LVMVG *group_of : std::initializer_list<const LVMVG *>{&vg, &nameless}) {
        TELL(LVMVgSB2Info(group_of, info));
        story_.Show("valid", info->fValid);
        story_.Show("group", info->szVg);
        story_.Show("UUID", info->szUuid);
        story_.Show("volumes", test::Items(info->pslPvs));
        EXPECT_EQ(info->nPv, 2);
    }
    const LVMVGLIST node = {info, nullptr};
    LVMVGINFO *found = nullptr;
    const std::pair<LVMVGKEY, int> keys[] = {{{"/dev/vg0", nullptr}, 1},
                                             {{nullptr, "/dev/md3"}, 1},
                                             {{"/dev/vg1", "/dev/md3"}, 1},
                                             {{"/dev/vg1", "/dev/md4"}, 0},
                                             {{nullptr, nullptr}, 0}};
    for (const auto &[key, result] : keys) {
        found = nullptr;
        EXPECT_EQ(LVMVgSBListSearch(&node, &key, &found), result);
        EXPECT_EQ(found == info, result == 1);
    }
    LVMVgInfoFree(info);

    LVMVgInfoFree(nullptr);
    for (const int status : {0, 5, -9}) {
        commands_.Exit(status);
        story_.Head("the commands end with " + std::to_string(status));
        TELL(LVMPvSBGet("/dev/md0", &pv));
        TELL(LVMPvSBEnum(&list));
        TELL(LVMVgSBGet("/dev/vg0", &vg));
    }
    Model("supportraid=no\n");
    TELL(LVMIsSupport());
    TELL(LVMPvSBGet("/dev/md0", &pv));
    TELL(LVMPvSBEnum(&list));
    TELL(LVMVgSBGet("/dev/vg0", &vg));
    TELL(LVMCleanIllegal());
}

TEST_F(Lvm, ChangesRunExactlyTheseCommands)
{
    for (const int status : {0, 5, -9}) {
        commands_.Exit(status);
        story_.Head("the commands end with " + std::to_string(status));
        TELL(LVMPvCreate("/dev/md2"));
        TELL(LVMPvRemove("/dev/sda3"));
        TELL(LVMPvScan());
        TELL(LVMRemove("/dev/vg1", "lv"));
        TELL(LVMVgRename("/dev/vg1", nullptr, "vg2"));
        TELL(LVMVgRename(nullptr, "vg1", "vg2"));
        TELL(LVMVgRemove("/dev/vg1"));
    }
    commands_.Fail("/bin/rm");
    TELL(LVMVgRemove("/dev/vg1"));
    TELL(LVMVgRemove("/dev/md2"));
    TELL(LVMRemove("/dev/vg1", "pv"));
    TELL(LVMVgRename("/dev/vg1", "vg1", nullptr));
}

TEST_F(Lvm, GroupIsTriedTwice)
{
    const List devices = MakeList({"/dev/md2", "/dev/md3"});
    commands_.OnCommand([](const std::string &) {
        if (IsMarked())
            return CommandReply{0};
        Mark();
        return CommandReply{5};
    });
    TELL(LVMVgCreate("/dev/vg1", devices.get()));
    commands_.Exit(5);
    TELL(LVMVgCreate("/dev/vg1", devices.get()));
}

TEST_F(Lvm, CreateAllAtOnce)
{
    const List devices = MakeList({"/dev/md2", "/dev/md3"});
    commands_.Print(
        {{"/sbin/vgs --noheading -o vg_uuid /dev/vg9 2>/dev/null", std::string(test::Capture("vgs-lvm2-2.03"))}});
    char uuid[8] = "";
    TELL(LVMCreate(devices.get(), "/dev/vg9", "lv", uuid, sizeof uuid));  // with a mode that cannot be changed
    story_.Show("UUID", uuid);
    commands_.Exit(0);
    TELL(LVMCreate(devices.get(), "/dev/vg9", "lv", nullptr, 0));
}

TEST_F(Lvm, WipesWhatAnEarlierVolumeLeft)
{
    commands_.Fail("/sbin/lvcreate /dev", 5);
    TELL(LVMLvCreate("/dev/vg9", "lv"));
    commands_.Exit(5);
    TELL(LVMLvCreate("/dev/vg9", "lv"));
}

TEST_F(Lvm, ExpandTriesAll)
{
    LVMVGINFO *const info = LVMVgInfoAlloc();
    TLIBSzListPush(&info->pslPvs, "/dev/md2");
    TLIBSzListPush(&info->pslPvs, "/dev/md3");
    commands_.Fail("md2", 5);
    TELL(LVMPvExpand(info));
    LVMVgInfoFree(info);
}

TEST_F(Lvm, RemovesTheVolumeOfOneDeviceAlone)
{
    const auto query = [](const std::string &device) {
        return "pvs -o pv_name,vg_name,lv_name,origin --noheading --separator : | grep " + device;
    };
    const std::string lines = "  WARNING: foreign\n  /dev/md10:vg2:other:\n  /dev/md1:vg1:lv:\n";
    commands_.Print({{query("/dev/md1"), lines}, {query("/dev/md3"), lines}, {query("/dev/md10"), lines}});
    tree_.Put("/proc/mounts",
              "/dev/vg1/lv /volume1 ext4 rw 0 0\n/dev/vg1/lvs1 /nowhere/a\\040b ext4 rw 0 0\n"
              "/dev/mapper/vg1-lvs2 /nowhere/c ext4 rw 0 0\n/dev/vg1/lvs3 /x aufs rw 0 0\n"
              "/dev/vg1/lvs4 / ext4 rw 0 0\n/dev/vg1/lvstore /y ext4 rw 0 0\n/dev/vg2/lvs1 /z ext4 rw 0 0\n");
    TELL(LVMRemoveLV("/dev/md1"));
    TELL(LVMRemoveLV("/dev/md3"));  // nothing on it
    char path[64] = "";
    TELL(LVMGetLVPath("/dev/md10", path, sizeof path));
    story_.Show("path", path);
    TELL(LVMGetLVPath("/dev/md10", path, 14));
    TELL(LVMGetLVPath("/dev/md10", path, 1));
    tree_.Remove("/proc/mounts");
    commands_.Print({{query("/dev/md1"), lines}}, 5);
    TELL(LVMRemoveLV("/dev/md1"));
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
    tree_.Put("/sys/class/block/sdc/holders/dm-0", "");
    // What is in use is seen before anything is removed.
    tree_.Put("/proc/mounts", "/dev/mapper/vg2-lv /volume2 ext4 rw 0 0\n");
    TELL(LVMCleanIllegal());
    tree_.Put("/proc/mounts", "");
    tree_.Put("/sys/class/block/sdc/holders/md1", "");
    TELL(LVMCleanIllegal());
    tree_.Remove("/sys/class/block/sdc/holders/md1");
    tree_.Put("/sys/class/block/dm-0/dm/name", "other-lv\n");
    TELL(LVMCleanIllegal());
    tree_.Remove("/sys/class/block/dm-0");

    // The group on sdb3 reaches onto a stick.
    tree_.Put("/sys/block/sdk/device/idVendor", "0951\n");
    tree_.Put("/sys/block/sdk/device/idProduct", "1666\n");
    TELL(LVMCleanIllegal());
    commands_.Exit(5);
    TELL(LVMCleanIllegal());
}

}  // namespace
