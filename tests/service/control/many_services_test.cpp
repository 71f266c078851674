// Functions over many services at once.
#include "tavo_service.h"

#include "service_root.h"
#include "support/container_text.h"
#include "support/test.h"

using test::FaultOf;
using test::LinkTarget;
using test::ScriptCalls;
using test::Services;
using testing::ElementsAre;

namespace {

std::vector<std::string> NamesOnVolume(const char *volume)
{
    test::List list = test::MakeList({});
    const int count = test::Moving(list, [&](auto **addr) { return TAVOServiceGetbyVolume(volume, addr); });
    EXPECT_EQ(count, list->nItem);
    return test::Items(list.get());
}

TEST_F(Services, AreSwitchedTogetherWhenEnabled)
{
    // Enabled on a new appliance: the database server, Windows sharing and the file page.
    ASSERT_EQ(TAVOServiceActionSet(12, TAVO_SERVICE_KEY_YES), 0);
    ScriptCalls();
    EXPECT_EQ(TAVOServiceOnOffALL(1), 4);
    EXPECT_THAT(ScriptCalls(), ElementsAre("S20pgsql.sh start", "S99ftpd.sh start", "S80samba.sh start"));
    EXPECT_TRUE(test::IsUp(12));
    EXPECT_EQ(TAVOServiceOnOffALL(0), 4);
    EXPECT_THAT(ScriptCalls(), ElementsAre("S80samba.sh stop", "S20pgsql.sh stop")) << "the last first";
    EXPECT_TRUE(test::HasEnded("ftpd"));
    EXPECT_EQ(test::Setting("runsamba"), "yes");

    test::WriteFile("/var/standin/ftpd.mode", "dies\n");
    log_.Clear();
    EXPECT_EQ(TAVOServiceOnOffALL(1), 3) << "a failure stops nobody";
    EXPECT_THAT(ScriptCalls(), ElementsAre("S20pgsql.sh start", "S99ftpd.sh start", "S80samba.sh start"));
    ASSERT_FALSE(log_.Lines().empty());
    EXPECT_THAT(log_.Lines().back().text,
                testing::MatchesRegex("service_on_off_all:[0-9]+ Failed to switch service ftp"));
}

TEST_F(Services, AreListedByVolumeAndReleasedWithIt)
{
    for (const int share : {1, 6, 7})
        ASSERT_EQ(TAVOServiceSet(share, share == 7 ? "/volume1" : "/volume2"), 0);
    EXPECT_THAT(NamesOnVolume("/volume2"), ElementsAre("web", "media", "audio", "itunes"));
    EXPECT_THAT(NamesOnVolume("/volume1"), ElementsAre("mysql"));
    EXPECT_THAT(NamesOnVolume("/volume3"), testing::IsEmpty());

    EXPECT_EQ(TAVOServiceShareIsEmpty(1), 1);
    test::WriteFile("/volume2/web/index.html", "x");
    EXPECT_EQ(TAVOServiceShareIsEmpty(1), 0);
    EXPECT_EQ(FaultOf(TAVOServiceShareIsEmpty(2)), (test::Fault{ERR_MAKE_PATH, "service_share_is_empty"}));

    EXPECT_EQ(TAVOServiceRemovebyID(0, 0), 0);
    EXPECT_EQ(LinkTarget("/var/services/web"), "");
    EXPECT_EQ(TAVOServiceRemoveAll(0), 0);
    EXPECT_THAT(NamesOnVolume("/volume1"), testing::IsEmpty());
    EXPECT_EQ(test::ReadFile("/volume2/web/index.html"), "x");
    EXPECT_EQ(test::ReadFile("/usr/tavo/etc/share.conf"), "");

    // A service that cannot be released does not stop the others.
    ASSERT_EQ(TAVOServiceSet(1, "/volume2"), 0);
    ASSERT_EQ(TAVOServiceSet(2, "/volume2"), 0);
    std::filesystem::remove("/var/services/web");
    test::WriteFile("/var/services/web", "a file");
    EXPECT_EQ(FaultOf(TAVOServiceRemoveAll(0)), (test::Fault{ERR_SERVICE_REMOVE, "service_remove_all"}));
    EXPECT_EQ(LinkTarget("/var/services/photo"), "");
}

TEST_F(Services, ChangeTheirVolumeAndFindAnother)
{
    ASSERT_EQ(TAVOServiceActionSet(4, TAVO_SERVICE_ENABLE), 0);
    ASSERT_EQ(TAVOServiceActionSet(5, TAVO_SERVICE_ENABLE), 0);
    ScriptCalls();
    EXPECT_EQ(TAVOServiceVolumeChange(6, "/volume1"), 0);
    EXPECT_EQ(LinkTarget("/var/services/music"), "/volume1/music");
    EXPECT_THAT(ScriptCalls(), ElementsAre("S86tavodms.sh restart", "S96tavorcd.sh restart", "S96tavoaudiod.sh restart",
                                           "S66tavoindexd.sh restart"))
        << "all that use the folder and are enabled";
    EXPECT_EQ(FaultOf(TAVOServiceVolumeChange(6, "nowhere")).code, ERR_BAD_PARAMETERS);

    // Only the record: nothing is linked or moved.
    EXPECT_EQ(TAVOServiceShareUpdate(6, "/volume2"), 0);
    char volume[52];
    EXPECT_EQ(TAVOServiceVolumeGetbyShare("music", volume, sizeof volume), 9);
    EXPECT_STREQ(volume, "/volume2");
    EXPECT_EQ(LinkTarget("/var/services/music"), "/volume1/music");
    EXPECT_EQ(FaultOf(TAVOServiceShareUpdate(1, "/volume2")), (test::Fault{ERR_NO_SUCH_SHARE, "service_share_update"}));

    // A volume is lost: services that have lost a folder are enabled again on the volumes left, the others go on.
    ASSERT_EQ(::umount2("/volume1", MNT_DETACH), 0);
    ScriptCalls();
    EXPECT_EQ(TAVOServiceRestartfromVolumeNone(), 2) << "pgsql, which never had a folder, and media; audio follows";
    EXPECT_EQ(LinkTarget("/var/services/music"), "/volume2/music");
    EXPECT_EQ(LinkTarget("/var/services/pgsql"), "/volume2/@database/pgsql");
    EXPECT_THAT(ScriptCalls(), ElementsAre("S86tavodms.sh start", "S20pgsql.sh start"));
    EXPECT_EQ(TAVOServiceRestartfromVolumeNone(), 0);
}

TEST(ServiceThirdPartyAll, RunsPackagesInOrderAndBackwards)
{
    const std::string folder = "/usr/tavo/etc/rc.d/packages/";
    std::filesystem::create_directories(folder);
    for (const char *name : {"20two.sh", "10one.sh", "30three.sh"})
        test::WriteFile(folder + name, "#!/bin/sh\necho ${0##*/} $1 >>/var/standin/rc.log\n", 0755);
    test::WriteFile(folder + "40failing.sh", "#!/bin/sh\nexit 1\n", 0755);
    test::WriteFile(folder + "50switched_off.sh", "#!/bin/sh\necho no >>/var/standin/rc.log\n", 0644);
    test::WriteFile(folder + "README", "no script", 0755);
    test::ScriptEvents();
    test::CapturedLog log;
    EXPECT_EQ(TAVOServiceThirdPartyAll("start"), 3);
    EXPECT_THAT(test::ScriptEvents(), ElementsAre("10one.sh start", "20two.sh start", "30three.sh start"));
    EXPECT_EQ(log.Lines().size(), 1u) << "the one that failed";
    EXPECT_EQ(TAVOServiceThirdPartyAll("stop"), 3);
    EXPECT_THAT(test::ScriptEvents(), ElementsAre("30three.sh stop", "20two.sh stop", "10one.sh stop"));
}

TEST(ServiceDisableSet, WritesTheKeyAlone)
{
    ScriptCalls();
    ASSERT_EQ(TLIBFileSetKeyValue("/etc/tavoinfo.conf", "runweb", "yes", nullptr), 1);
    EXPECT_EQ(TAVOServiceDisableSet(1), 0);
    EXPECT_EQ(test::Setting("runweb"), "no");
    EXPECT_THAT(ScriptCalls(), testing::IsEmpty());
}

}  // namespace
