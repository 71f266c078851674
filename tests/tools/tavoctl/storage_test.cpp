// tavoctl disk, partition, raid and lvm where there are no disks: what they refuse, what they run, what they show.
#include "run_tavoctl.h"
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
    const struct {
        Words words;
        int status;
        const char *says;
    } cases[] = {
        {{"disk", "info", "sda"}, 3, "cannot use /dev/sda"},
        {{"disk", "standby"}, 2, "name disks"},
        {{"disk", "standby", "--all", "--timer", "5"}, 2, "name disks"},
        {{"disk", "standby", "--yes", "--timer", "25"}, 2, "multiples of 30"},
        {{"disk", "standby", "--timer", "20"}, 2, "--yes does it"},
        {{"disk", "wipe-status", "sda"}, 3, "no such job"},
        {{"partition", "create", "sda"}, 3, "cannot use /dev/sda"},
        {{"raid", "create", "--level", "5", "md2", "sda3", "sda3"}, 2, "named twice"},
        {{"raid", "create", "md2", "sda3"}, 2, "--level is required"},
        {{"raid", "create", "--yes", "--level", "1", "md2", "sda3"}, 3, "check the name"},
        {{"raid", "info", "md77"}, 3, "ERR_PATH_NOT_FOUND"},
        {{"raid", "stop", "--yes", "/dev/md77"}, 3, "ERR_PATH_NOT_FOUND"},
        {{"raid", "assemble", "md2", "1:2"}, 2, "ERR_BAD_PARAMETERS"},
        {{"raid", "assemble"}, 2, "name an array, or use --all"},
        {{"raid", "assemble", "--all", "md2"}, 2, "name an array, or use --all"},
        {{"raid", "assemble", "--all", "--force"}, 2, "--all without --force"},
        {{"raid", "assemble", "--force", "md2"}, 3, "raid list --all"},
        {{"raid", "replace", "--yes", "md2", "sdd"}, 3, "ERR_PATH_NOT_FOUND"},
        {{"raid", "scrub", "md2"}, 3, "ERR_PATH_NOT_FOUND"},
        {{"raid", "erase"}, 2, "name members"},
        {{"raid", "erase", "--yes", "--uuid", ":::"}, 2, "ERR_BAD_PARAMETERS"},
        {{"volume", "mount"}, 2, "name one, or use --all"},
        {{"lvm", "rename", "vg1", "../vg2"}, 2, "begins with vg"},
    };
    for (const auto &[words, status, says] : cases)
        test::IsRefused(words, says, status);
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
    const json rows = test::Facts({"lvm", "list", "--json"});
    ASSERT_EQ(rows.size(), 3u);
    EXPECT_EQ(rows[0].at("device"), "md2");
    EXPECT_EQ(rows[0].at("group"), "vg1");
    EXPECT_EQ(rows[0].at("devices"), 2);
    EXPECT_EQ(rows[0].at("volume"), "/dev/vg1/lv");
    EXPECT_EQ(rows[0].at("size"), nullptr);
    EXPECT_EQ(rows[2].at("group"), nullptr);

    scenario.Expect(vgs).Prints(group);
    EXPECT_EQ(Tavoctl({"lvm", "rename", "--dry-run", "vg1", "vg2"}).status, 0);
    scenario.Expect(vgs).Prints(group);
    scenario.Expect({"/sbin/lvm", "vgrename", "/dev/vg1", "vg2"});
    EXPECT_EQ(Tavoctl({"lvm", "rename", "vg1", "vg2"}).status, 0);

    scenario.Expect(vgs).Prints(group);
    scenario.Expect(list).Prints(pvs);
    scenario.Expect({"/sbin/pvresize", "/dev/md2"});
    scenario.Expect({"/sbin/pvresize", "/dev/md3"});
    EXPECT_EQ(Tavoctl({"lvm", "expand", "vg1"}).status, 0);

    scenario.Expect(vgs).Prints(group);
    scenario.Expect(list).Prints(pvs);
    scenario.Expect({"/sbin/lvremove", "-f", "/dev/vg1"});
    scenario.Expect({"/sbin/vgremove", "/dev/vg1"});
    scenario.Expect({"/sbin/pvremove", "-ff", "-y", "/dev/md2"});
    scenario.Expect({"/sbin/pvremove", "-ff", "-y", "/dev/md3"}).Exits(5);
    test::IsRefused({"lvm", "remove", "--yes", "vg1"}, "/dev/md3", 1);

    scenario.Expect(vgs);
    EXPECT_EQ(Tavoctl({"lvm", "expand", "vg1"}).status, 3);
}

TEST(TavoctlStorage, AVolumeThatIsNotThereIsLookedForInEveryGroup)
{
    const Words list = {"/sbin/pvs", "--noheading", "-o", "pv_name,vg_name,vg_uuid,pv_count", "--separator", "|"};
    const std::string pvs = "  /dev/md2|vg1|" + std::string(38, 'u') + "|1\n";
    test::Scenario scenario;
    for (const Words &words : {Words{"volume", "mount", "7"},
                               {"volume", "unmount", "7"},
                               {"volume", "check", "7"},
                               {"volume", "grow", "7"}}) {
        scenario.Expect(list).Prints(pvs);
        test::IsRefused(words, "there is no volume 7", 3);
    }
    // A group that is not active is listed; mounting it has the kernel know it first.
    scenario.Expect(list).Prints(pvs);
    const json volumes = test::Facts({"volume", "list", "--json"});
    ASSERT_EQ(volumes.size(), 1u);
    EXPECT_EQ(volumes[0].at("volume"), 1);
    EXPECT_EQ(volumes[0].at("device"), "/dev/vg1/lv");
    EXPECT_EQ(volumes[0].at("devices"), json({"md2"}));
    EXPECT_EQ(volumes[0].at("active"), false);
    EXPECT_EQ(volumes[0].at("path"), nullptr);
    scenario.Expect(list).Prints(pvs);
    scenario.Expect({"/sbin/vgchange", "-a", "y", "vg1"}).Prints("no such group\n").Exits(5);
    test::IsRefused({"volume", "mount", "1"}, "cannot mount /dev/vg1/lv on /volume1: /sbin/vgchange: no such group", 1);
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
    const test::Ran ran = Tavoctl({"raid", "superblock", "--json", "sda3", "/dev/sdb3"});
    ASSERT_EQ(ran.status, 0) << ran;
    const json rows = test::Facts(ran);
    ASSERT_EQ(rows.size(), 1u);
    EXPECT_EQ(rows[0].at("member"), "sda3");
    EXPECT_EQ(rows[0].at("level"), "raid5");
    EXPECT_EQ(rows[0].at("version"), "1.2");
    EXPECT_EQ(rows[0].at("uuid").get<std::string>().size(), std::string(uuid).size());

    scenario.Expect({"/sbin/mdadm", "-E", "/dev/sdb3"});
    EXPECT_EQ(Tavoctl({"raid", "superblock", "sdb3"}).status, 3);
    scenario.Expect({"/sbin/mdadm", "-A", "/dev/md2", "-u", uuid});
    EXPECT_EQ(Tavoctl({"raid", "assemble", "2", uuid}).status, 0);
}

TEST(TavoctlStorage, WipingTellsHowFarItIs)
{
    const std::string file = "/tmp/tavodd.sdz";
    test::WriteFile(file, "1610612736/4294967296\n");
    const json facts = test::Facts({"disk", "wipe-status", "--json", "sdz"});
    EXPECT_EQ(facts.at("done"), 1610612736);
    EXPECT_EQ(facts.at("percent"), 37);
    EXPECT_THAT(Tavoctl({"disk", "wipe-status", "sdz"}).out,
                AllOf(testing::HasSubstr("done:     1.5 GiB\n"), testing::HasSubstr("total:    4.0 GiB\n")));
    test::WriteFile(file, "much\n");
    EXPECT_EQ(Tavoctl({"disk", "wipe-status", "sdz"}).status, 1);
    std::filesystem::remove(file);
}

TEST(TavoctlStorage, LayoutsAreAllThereHaveBeen)
{
    test::Scenario scenario;  // no disk is asked: there is none
    const test::Ran ran = Tavoctl({"partition", "layout", "--wake", "--json"});
    ASSERT_EQ(ran.status, 0) << ran;
    const json rows = test::Facts(ran);
    ASSERT_EQ(rows.size(), 10u);
    EXPECT_EQ(rows[6].at("types"), json({"0xFD", "0xFD", "0xFD"}));
    for (const json &row : rows)
        EXPECT_EQ(row.at("current"), row.at("version") == 7 && row.at("raid") == true) << row;
    scenario.Finish();
}

}  // namespace
