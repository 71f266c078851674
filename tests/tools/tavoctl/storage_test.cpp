// tavoctl disk, partition, raid and lvm where there are no disks: what they refuse, what they run, what they show.
#include "command_story.h"
#include "support/captures.h"
#include "support/hostile_names.h"
#include "support/scenario.h"
#include "support/test.h"

#include <nlohmann/json.hpp>

namespace {

using nlohmann::json;
using test::Tavoctl;
using test::Words;

constexpr char uuid[] = "495e879a:4e806313:a484c744:9c844bd2";

TEST(TavoctlStorage, WrongWordsRunNothing)
{
    test::Scenario scenario;
    test::CommandStory story({});
    story.Run({
        {"disk", "info", "sda"},
        {"disk", "standby"},
        {"disk", "standby", "--all", "--timer", "5"},
        {"disk", "standby", "--yes", "--timer", "25"},
        {"disk", "standby", "--timer", "20"},
        {"disk", "wipe-status", "sda"},
        {"partition", "create", "sda"},
        {"raid", "create", "--level", "5", "md2", "sda3", "sda3"},
        {"raid", "create", "md2", "sda3"},
        {"raid", "create", "--yes", "--level", "1", "md2", "sda3"},
        {"raid", "info", "md77"},
        {"raid", "stop", "--yes", "/dev/md77"},
        {"raid", "assemble", "md2", "1:2"},
        {"raid", "assemble"},
        {"raid", "assemble", "--all", "md2"},
        {"raid", "assemble", "--all", "--force"},
        {"raid", "assemble", "--force", "md2"},
        {"raid", "replace", "--yes", "md2", "sdd"},
        {"raid", "scrub", "md2"},
        {"raid", "erase"},
        {"raid", "erase", "--yes", "--uuid", ":::"},
        {"volume", "mount"},
        {"lvm", "rename", "vg1", "../vg2"},
    });
    EXPECT_EQ(scenario.Finish(), "");
}

TEST(TavoctlStorage, NoNameBecomesACommand)
{
    test::Scenario scenario;
    const std::vector<std::string> names = test::HostileNames();
    for (std::size_t i = 0; i < names.size(); i += 9) {
        const Words lines[] = {
            {"disk", "info", "--", names[i]},
            {"partition", "clean", "--yes", "--system", "--", names[i]},
            {"raid", "superblock", "--wake", "--", names[i]},
            {"raid", "erase", "--yes", "--", names[i]},
            {"lvm", "create", "--yes", "--", "vg1", names[i]},
            {"lvm", "remove", "--yes", "--", names[i]},
        };
        const Words &words = lines[i / 9 % std::size(lines)];
        EXPECT_THAT(Tavoctl(words).status, testing::AnyOf(2, 3)) << testing::PrintToString(words);
    }
    EXPECT_FALSE(std::filesystem::exists(test::kCanary));
    // Whether there is such a group is asked before its devices are looked at.
    for (const std::string &call : test::Scenario::Calls())
        EXPECT_EQ(call, "/sbin/vgs --noheading -o vg_uuid /dev/vg1");
    scenario.Finish();
}

TEST(TavoctlStorage, WithoutAnAnswerNothingIsDestroyed)
{
    test::Scenario scenario;
    const std::string vgs(test::Capture("vgs-lvm2-2.03"));
    scenario.Expect({"/sbin/vgs", "--noheading", "-o", "vg_uuid", "/dev/vg1"}).Prints(vgs);
    scenario.ExpectAny("/sbin/pvs").Prints("  /dev/md2|vg1|" + std::string(38, 'u') + "|1\n");
    test::IsRefused({"lvm", "remove", "vg1"}, "Lose /dev/vg1 and what is on it?", 2);
}

TEST(TavoctlStorage, VolumesAreListedAndChanged)
{
    const std::string group(test::Capture("vgs-lvm2-2.03"));
    const std::string of_group = "|vg1|" + group.substr(2, 38) + "|2\n";
    const std::string pvs = "  /dev/md2" + of_group + "  /dev/md3" + of_group + "  /dev/md4|||0\n";
    test::Scenario scenario;
    const Words list = {"/sbin/pvs", "--noheading", "-o", "pv_name,vg_name,vg_uuid,pv_count", "--separator", "|"};
    const Words vgs = {"/sbin/vgs", "--noheading", "-o", "vg_uuid", "/dev/vg1"};
    const Words volumes = {"pvs", "-o", "pv_name,vg_name,lv_name,origin", "--noheading", "--separator", ":"};
    const std::string has_volume = "  /dev/md2:vg1:lv:\n  /dev/md3:vg1:lv:\n";

    scenario.Expect(list).Prints(pvs);
    scenario.Expect(volumes).Prints(has_volume).Times(2);
    test::CommandStory story({});
    story.Run({"lvm", "list", "--json"});

    scenario.Expect(vgs).Prints(group);
    story.Run({"lvm", "rename", "--dry-run", "vg1", "vg2"});
    scenario.Expect(vgs).Prints(group);
    scenario.Expect({"/sbin/lvm", "vgrename", "/dev/vg1", "vg2"});
    story.Run({"lvm", "rename", "vg1", "vg2"});

    scenario.Expect(vgs).Prints(group);
    scenario.Expect(list).Prints(pvs);
    scenario.Expect({"/sbin/pvresize", "/dev/md2"});
    scenario.Expect({"/sbin/pvresize", "/dev/md3"});
    story.Run({"lvm", "expand", "vg1"});

    scenario.Expect(vgs).Prints(group);
    scenario.Expect(list).Prints(pvs);
    scenario.Expect({"/sbin/lvremove", "-f", "/dev/vg1"});
    scenario.Expect({"/sbin/vgremove", "/dev/vg1"});
    scenario.Expect({"/sbin/pvremove", "-ff", "-y", "/dev/md2"});
    scenario.Expect({"/sbin/pvremove", "-ff", "-y", "/dev/md3"}).Exits(5);
    story.Run({"lvm", "remove", "--yes", "vg1"});

    scenario.Expect(vgs);
    story.Run({"lvm", "expand", "vg1"});
}

TEST(TavoctlStorage, AVolumeThatIsNotThereIsLookedForInEveryGroup)
{
    const Words list = {"/sbin/pvs", "--noheading", "-o", "pv_name,vg_name,vg_uuid,pv_count", "--separator", "|"};
    const std::string pvs = "  /dev/md2|vg1|" + std::string(38, 'u') + "|1\n";
    test::Scenario scenario;
    test::CommandStory story({});
    for (const Words &words : {Words{"volume", "mount", "7"},
                               {"volume", "unmount", "7"},
                               {"volume", "check", "7"},
                               {"volume", "grow", "7"}}) {
        scenario.Expect(list).Prints(pvs);
        story.Run(words);
    }
    // A group that is not active is listed; mounting it has the kernel know it first.
    scenario.Expect(list).Prints(pvs);
    story.Run({"volume", "list", "--json"});
    scenario.Expect(list).Prints(pvs);
    scenario.Expect({"/sbin/vgchange", "-a", "y", "vg1"}).Prints("no such group\n").Exits(5);
    story.Run({"volume", "mount", "1"});
    EXPECT_FALSE(std::filesystem::exists("/volume1"));
}

TEST(TavoctlStorage, EmptyBaysAreShown)
{
    test::Scenario scenario;
    const json disks = test::Facts({"disk", "list", "--json"});
    ASSERT_GE(disks.size(), 4u);
    for (std::size_t bay = 0; bay < disks.size(); ++bay) {
        EXPECT_EQ(disks[bay].at("bay"), std::to_string(bay + 1));
        EXPECT_EQ(disks[bay].at("state"), "empty");
        EXPECT_EQ(disks[bay].at("size"), nullptr);
    }
    scenario.ExpectAny("/sbin/pvs");
    const json tree = test::Facts({"storage", "--json"});
    ASSERT_EQ(tree.size(), disks.size());
    EXPECT_EQ(tree[0].at("kind"), "bay");
    EXPECT_EQ(tree[0].at("bay"), "1");
}

TEST(TavoctlStorage, SuperblocksAreATable)
{
    test::Scenario scenario;
    scenario.Expect({"/sbin/mdadm", "-E", "/dev/sda3"}).Prints(test::Capture("mdadm_E_1.2_raid5-mdadm-4.2"));
    scenario.Expect({"/sbin/mdadm", "-E", "/dev/sdb3"});
    test::CommandStory story({});
    story.Run({"raid", "superblock", "--json", "sda3", "/dev/sdb3"});
    scenario.Expect({"/sbin/mdadm", "-E", "/dev/sdb3"});
    story.Run({"raid", "superblock", "sdb3"});
    scenario.Expect({"/sbin/mdadm", "-A", "/dev/md2", "-u", uuid});
    story.Run({"raid", "assemble", "2", uuid});
}

TEST(TavoctlStorage, WipingTellsHowFarItIs)
{
    const std::string file = "/tmp/tavodd.sdz";
    test::CommandStory story({});
    test::WriteFile(file, "1610612736/4294967296\n");
    story.Run({{"disk", "wipe-status", "--json", "sdz"}, {"disk", "wipe-status", "sdz"}});
    test::WriteFile(file, "much\n");
    story.Run({"disk", "wipe-status", "sdz"});
    std::filesystem::remove(file);
}

TEST(TavoctlStorage, LayoutsAreAllThereHaveBeen)
{
    const test::Scenario scenario;  // no disk is asked: there is none
    test::CommandStory story({});
    story.Run({"partition", "layout", "--wake"});
}

}  // namespace
