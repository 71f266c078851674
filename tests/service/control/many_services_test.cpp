// Functions over many services at once.
#include "tavo_service.h"

#include "service_root.h"
#include "support/container_text.h"
#include "support/test.h"

using test::Services;
using test::WriteFile;

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
    TELL(TAVOServiceActionSet(12, TAVO_SERVICE_KEY_YES));
    TELL(TAVOServiceOnOffALL(1));
    TELL(test::IsUp(12));
    TELL(TAVOServiceOnOffALL(0));  // the last first
    TELL(test::HasEnded("ftpd"));
    WriteFile("/var/standin/ftpd.mode", "dies\n");
    TELL(TAVOServiceOnOffALL(1));  // the others go on after a failure
}

TEST_F(Services, AreListedByVolumeAndReleasedWithIt)
{
    for (const int share : {1, 6, 7})
        ASSERT_EQ(TAVOServiceSet(share, share == 7 ? "/volume1" : "/volume2"), 0);
    for (const char *volume : {"/volume1", "/volume2", "/volume3"})
        story_.Show(volume, NamesOnVolume(volume));
    TELL(TAVOServiceShareIsEmpty(1));
    WriteFile("/volume2/web/index.html", "x");
    TELL(TAVOServiceShareIsEmpty(1));
    TELL(TAVOServiceShareIsEmpty(2));

    TELL(TAVOServiceRemovebyID(0, 0));
    TELL(TAVOServiceRemoveAll(0));
    EXPECT_EQ(test::ReadFile("/volume2/web/index.html"), "x");

    // A service that cannot be released does not stop the others.
    ASSERT_EQ(TAVOServiceSet(1, "/volume2"), 0);
    ASSERT_EQ(TAVOServiceSet(2, "/volume2"), 0);
    std::filesystem::remove("/var/services/web");
    WriteFile("/var/services/web", "a file");
    TELL(TAVOServiceRemoveAll(0));
}

TEST_F(Services, ChangeTheirVolumeAndFindAnother)
{
    ASSERT_EQ(TAVOServiceActionSet(4, TAVO_SERVICE_ENABLE), 0);
    ASSERT_EQ(TAVOServiceActionSet(5, TAVO_SERVICE_ENABLE), 0);
    TELL(TAVOServiceVolumeChange(6, "/volume1"));  // all that use the folder and are enabled
    TELL(TAVOServiceVolumeChange(6, "nowhere"));
    // Only the record: nothing is linked or moved.
    TELL(TAVOServiceShareUpdate(6, "/volume2"));
    TELL(TAVOServiceShareUpdate(1, "/volume2"));
    WriteFile("/var/standin/S86tavodms.sh.status", "3\n");
    TELL(TAVOServiceVolumeChange(6, "/volume1"));
    std::filesystem::remove("/var/standin/S86tavodms.sh.status");

    // A volume is lost: services that have lost a folder are enabled again on the volumes left, the others go on. Here
    // pgsql, which never had a folder, and media; audio follows.
    ASSERT_EQ(::umount2("/volume1", MNT_DETACH), 0);
    TELL(TAVOServiceRestartfromVolumeNone());
    TELL(TAVOServiceRestartfromVolumeNone());
}

TEST_F(Services, OfPackagesRunInOrderAndBackwards)
{
    const std::string folder = "/usr/tavo/etc/rc.d/packages/";
    TELL(TAVOServiceThirdPartyAll("start"));
    std::filesystem::create_directories(folder);
    for (const char *name : {"20two.sh", "10one.sh", "30three.sh", "40failing.sh"})
        WriteFile(folder + name,
                  "#!/bin/sh\necho ${0##*/} $1 >>/var/standin/rc.log\n! expr $0 : '.*failing' >/dev/null\n", 0755);
    WriteFile(folder + "50switched_off.sh", "#!/bin/sh\necho no >>/var/standin/rc.log\n", 0644);
    WriteFile(folder + "README", "no script", 0755);
    TELL(TAVOServiceThirdPartyAll("start"));
    TELL(TAVOServiceThirdPartyAll("stop"));
    std::filesystem::remove_all(folder);
    WriteFile("/usr/tavo/etc/rc.d/packages", "no folder");
    TELL(TAVOServiceThirdPartyAll("start"));
}

TEST_F(Services, AreDisabledByTheirKeyAlone)
{
    ASSERT_EQ(TLIBFileSetKeyValue("/etc/tavoinfo.conf", "runweb", "yes", nullptr), 1);
    TELL(TAVOServiceDisableSet(1));
}

}  // namespace
