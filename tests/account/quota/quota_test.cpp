// Quotas: the requests to the kernel, the commands, and the handling of their results.
#include "tavo_quota.h"
#include "tavo_user.h"

#include "account/user/user_fixture.h"
#include "support/container_text.h"
#include "support/device_tree.h"
#include "support/scenario.h"
#include "support/story.h"
#include "support/test.h"

#include <cmath>
#include <limits>

#include <sys/quota.h>

namespace {

std::vector<std::string> kernel_calls;
int kernel_errno = 0;
std::string failing_device = {};
dqblk kernel_block = {};

}  // namespace

// Takes the place of the kernel's quotas.
extern "C" int quotactl(int command, const char *device, int id, caddr_t data) noexcept
{
    std::string call = std::string(device) + " " + std::to_string(id) +
                       (command == QCMD(Q_SETQUOTA, USRQUOTA) ? " set"
                        : command == QCMD(Q_SYNC, USRQUOTA)   ? " sync"
                                                              : " get");
    if (command == QCMD(Q_SETQUOTA, USRQUOTA)) {
        dqblk block;
        std::memcpy(&block, data, sizeof block);
        call += " " + std::to_string(block.dqb_bsoftlimit) + "/" + std::to_string(block.dqb_bhardlimit) + " KiB";
        EXPECT_EQ(block.dqb_ihardlimit + block.dqb_isoftlimit + block.dqb_btime + block.dqb_itime, 0u);
        EXPECT_EQ(block.dqb_valid, uint32_t{QIF_BLIMITS | QIF_ILIMITS | QIF_BTIME | QIF_ITIME});
    }
    kernel_calls.push_back(call);
    if (kernel_errno != 0 && (failing_device.empty() || failing_device == device)) {
        errno = kernel_errno;
        return -1;
    }
    if (command == QCMD(Q_GETQUOTA, USRQUOTA))
        std::memcpy(data, &kernel_block, sizeof kernel_block);
    if (command == QCMD(Q_GETFMT, USRQUOTA)) {
        const uint32_t format = 2;
        std::memcpy(data, &format, sizeof format);
    }
    return 0;
}

namespace {

constexpr char kDevice[] = "/dev/vg1/volume_1";

class Quota : public testing::Test {
  protected:
    void SetUp() override
    {
        kernel_calls.clear();
        kernel_errno = 0;
        failing_device.clear();
        test::AddUser({.name = "alice", .uid = 2000});
    }

    static std::vector<std::string> KernelCalls() { return std::exchange(kernel_calls, {}); }

    test::DeviceTree tree_;
    test::CapturedLog log_;
    test::Story story_{TEST_GOLDEN, {KernelCalls, test::LogOf(log_, LOG_NOTICE)}};
};

TEST_F(Quota, UnitsOfSpace)
{
    const struct {
        int mode;
        float value;
        float result;
    } rows[] = {{0, 1.5, 1572864}, {1, 1572864, 1.5}, {2, 1536, 1.5}, {3, 1.5, 1536},
                {4, 1.5, 1536},    {5, 1536, 1.5},    {6, 5, 0},      {-1, 5, 0}};
    for (const auto &row : rows)
        EXPECT_EQ(TAVOUnitTrans(row.mode, row.value), row.result) << row.mode;
}

TEST_F(Quota, SetsHardAndSoftLimit)
{
    for (const float limit : {1.5f, 0.f, 0.0009765625f, 0.0009f, 8388608.f}) {
        story_.Head(std::to_string(limit) + " MiB");
        TELL(TAVOQuotaSet("ALICE", kDevice, &limit));
    }
}

TEST_F(Quota, RefusalsReachNoKernel)
{
    for (const float limit : {-0.5f, std::nanf(""), std::numeric_limits<float>::infinity(), 1e30f})
        TELL(TAVOQuotaSet("alice", kDevice, &limit));
    const float limit = 1;
    TAVOQUOTA quota = {7, 8};
    for (const char *user : {"users", "@users", "ghost", "DOM\\alice"}) {
        story_.Head(user);
        TELL(TAVOQuotaSet(user, kDevice, &limit));
        TELL(TAVOQuotaGet(user, kDevice, &quota));
    }
    EXPECT_EQ(quota.rLimit, 7);
}

TEST_F(Quota, KernelErrorsAreCodes)
{
    const float limit = 1;
    TAVOQUOTA quota = {7, 8};
    for (const int error : {ESRCH, ENOENT, EINVAL, EPERM, 0}) {
        kernel_errno = error;
        story_.Head("errno " + std::to_string(error));
        TELL(TAVOQuotaSet("alice", kDevice, &limit));
        if (error) {
            TELL(TAVOQuotaGet("alice", kDevice, &quota));
        }
        TELL(TAVOQuotaFmtGet(kDevice));
    }
    EXPECT_EQ(quota.cbUsed, 8u);
}

TEST_F(Quota, ReadsLimitAndUse)
{
    kernel_block.dqb_bhardlimit = 1536;
    kernel_block.dqb_curspace = 5000000001;
    TAVOQUOTA quota = {};
    ASSERT_EQ(TAVOQuotaGet("alice", kDevice, &quota), 0);
    EXPECT_EQ(quota.rLimit, 1.5f);
    EXPECT_EQ(quota.cbUsed, 5000000001u);
    kernel_block.dqb_bhardlimit = 0;
    ASSERT_EQ(TAVOQuotaGet("alice", kDevice, &quota), 0);
    EXPECT_EQ(quota.rLimit, 0);
}

TEST_F(Quota, CleansWhoIsThereOnEveryVolume)
{
    const test::List some = test::MakeList({"ghost", "", "alice"});
    TELL(TAVOQuotaClean(some.get(), kDevice));  // alice, after the failure
    const test::List alice = test::MakeList({"alice"});
    tree_.Put("/proc/mounts", "/dev/md0 / ext4 rw,usrquota 0 0\n/dev/md2 /volume1 ext4 rw,usrquota,grpquota 0 0\n"
                              "/dev/md3 /volume2 ext4 rw 0 0\n/dev/md4 /volume13 ext4 rw,usrjquota=aquota.user 0 0\n"
                              "/dev/md5 /volume1/sub ext4 rw,usrquota 0 0\n/dev/md6 /volume4 ext4 rw,quota 0 0\n"
                              "/dev/md7 /volume5 xfs rw,uquota 0 0\n/dev/md8 /volume ext4 rw,usrquota 0 0\n"
                              "/dev/md9 /volume/6 ext4 rw,usrquota 0 0\n/dev/md10 /volume: ext4 rw,usrquota 0 0\n");
    TELL(TAVOQuotaCleanAllVols(alice.get()));
    kernel_errno = EPERM;
    failing_device = "/dev/md2";
    TELL(TAVOQuotaCleanAllVols(alice.get()));  // the second volume too
}

const std::vector<std::string> kRemount{"mount", "-o", "remount,usrquota,grpquota", "/volume1"};
const std::vector<std::string> kCheck{"quotacheck", "-c", "-g", "-u", "-F", "vfsv0", "/volume1"};
const std::vector<std::string> kOn{"quotaon", "-F", "vfsv0", "/volume1"};
const std::vector<std::string> kOff{"quotaoff", "/volume1"};

TEST_F(Quota, SwitchesInSteps)
{
    tree_.Put("/proc/mounts", "/dev/md2 /volume1 ext4 rw 0 0\n");
    const std::vector<std::string> steps[] = {kRemount, kCheck, kOn};
    for (size_t failing = 0; failing <= std::size(steps); ++failing) {
        test::Scenario scenario;
        for (size_t i = 0; i < std::size(steps) && i <= failing; ++i)
            scenario.Expect(steps[i]).Exits(i == failing ? 1 : 0);
        TELL(TAVOQuotaInit(1));
    }
    test::Scenario scenario;
    scenario.Expect(kOff);
    scenario.Expect(kOff).Exits(2);
    TELL(TAVOQuotaOff(1));
    TELL(TAVOQuotaOff(1));
}

TEST_F(Quota, NothingRunsOnAVolumeThatIsNotMounted)
{
    test::Scenario scenario;
    tree_.Put("/proc/mounts", "/dev/md2 /volume10 ext4 rw 0 0\n/dev/volume1 /mnt/volume1 ext4 rw 0 0\n");
    for (const int volume : {1, 0, -1, 101}) {
        TELL(TAVOQuotaInit(volume));
        TELL(TAVOQuotaOff(volume));
    }
}

}  // namespace
