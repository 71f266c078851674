// Services when memory runs out: the failure and its code, nothing left allocated, and the files as they were.
#include "tavo_service.h"

#include "tavo_file.h"

#include "support/appliance_root.h"
#include "support/captured_log.h"
#include "support/failing_malloc.h"
#include "support/fault_state.h"
#include "support/scratch_dir.h"

#include <gtest/gtest.h>

#include <cerrno>
#include <cstring>
#include <filesystem>
#include <functional>

#include <sys/mount.h>
#include <sys/stat.h>
#include <unistd.h>

namespace {

constexpr const char *kVolume = "/volume1";
constexpr const char *kShares = "/usr/tavo/etc/share.conf";

class Memory : public testing::Test {
  protected:
    void SetUp() override
    {
        if (test::RootLacks("mount"))
            GTEST_SKIP() << "volumes cannot be mounted here";
        // Takes syslog's place and goes: lines are kept nowhere, or keeping them would be counted too.
        const test::CapturedLog silence;
        ::mkdir(kVolume, 0755);
        if (::mount("tmpfs", kVolume, "tmpfs", 0, "size=4m") != 0)
            GTEST_SKIP() << "volumes cannot be mounted here: " << std::strerror(errno);
        ASSERT_EQ(TAVOServiceSet(1, kVolume), 0);
        ASSERT_EQ(TLIBFileSetKeyValue("/etc/tavoinfo.conf", "runftpd", "yes", nullptr), 1);
    }

    void TearDown() override
    {
        if (IsSkipped())
            return;
        TAVOServiceRemoveAll(1);
        ::umount2(kVolume, MNT_DETACH);
    }

    // Each allocation of the call fails once; the call then fails with the code of memory, or does without.
    static void Check(const char *what, int success, int failure, const std::function<int()> &call)
    {
        SCOPED_TRACE(what);
        test::EachAllocation faults;
        while (faults.Next()) {
            const std::string shares = test::ReadFile(kShares);
            test::ForgetFault();
            faults.Arm();
            const int result = call();
            faults.Disarm();
            if (!faults.Fired()) {
                EXPECT_EQ(result, success);
            } else if (result == failure) {
                const int code = TLIBErrGet();
                EXPECT_TRUE(code == ERR_OUT_OF_MEMORY || code == ERR_NOT_ENOUGH_MEMORY || code == ERR_SERVICE_REMOVE)
                    << std::hex << code;
                EXPECT_EQ(test::ReadFile(kShares), shares);
            } else {
                EXPECT_EQ(result, success) << "what is not needed may fail";
            }
            EXPECT_EQ(faults.LeftAllocated(), 0);
        }
        EXPECT_GT(faults.Count(), 0) << "it allocates nothing: it need not stand here";
    }
};

TEST_F(Memory, Reading)
{
    TAVOSERVICESHARE share;
    char text[64];
    Check("TAVOServiceSettingGet", 1, -1, [&] { return TAVOServiceSettingGet(1, &share); });
    Check("TAVOServiceNewVolumeDecide", 1, -1, [&] { return TAVOServiceNewVolumeDecide(2, text, sizeof text); });
    Check("TAVOServiceDataSearch", 1, -1, [&] { return TAVOServiceDataSearch(1, text, sizeof text); });
    Check("TAVOServiceVolumeGetbyShare", 9, -1, [&] { return TAVOServiceVolumeGetbyShare("web", text, sizeof text); });
    Check("TAVOServiceThirdPartyAll", 0, -1, [] { return TAVOServiceThirdPartyAll("start"); });
    for (const int id : {12, 13, 21})
        Check(TAVOServiceNameGet(id), 0, -1, [&] { return TAVOServiceStatusGet(id) == 1; });
}

TEST_F(Memory, Writing)
{
    Check("TAVOServiceShareCreate", 0, -1, [] { return TAVOServiceShareCreate(2, kVolume); });
    Check("TAVOServiceShareUpdate", 0, -1, [] { return TAVOServiceShareUpdate(1, kVolume); });
    Check("TAVOServiceSet", 0, -1, [] { return TAVOServiceSet(1, kVolume); });
    Check("TAVOServiceLinkSet", 0, -1, [] { return TAVOServiceLinkSet(1, "/volume1/web"); });
    Check("TAVOServiceShareRemove", 0, -1, [] { return TAVOServiceShareRemove(2, 0); });
}

}  // namespace
