// Quotas: the requests to the kernel, the commands, and the handling of their results.
#include "tavo_quota.h"
#include "tavo_user.h"

#include "account/user/user_fixture.h"
#include "support/captured_log.h"
#include "support/device_tree.h"
#include "support/fault_state.h"
#include "support/scenario.h"

#include <gmock/gmock.h>

#include <cmath>
#include <cstring>
#include <limits>

#include <errno.h>
#include <sys/quota.h>

using test::FaultOf;

namespace {

struct KernelCall {
    int command;
    std::string device;
    int id;
    dqblk block = {};
    bool operator==(const KernelCall &other) const
    {
        return command == other.command && device == other.device && id == other.id;
    }
};

std::vector<KernelCall> kernel_calls;
int kernel_errno = 0;
std::string failing_device = {};
dqblk kernel_block = {};

}  // namespace

// Takes the place of the kernel's quotas.
extern "C" int quotactl(int command, const char *device, int id, caddr_t data) noexcept
{
    KernelCall call{command, device, id};
    if (command == QCMD(Q_SETQUOTA, USRQUOTA))
        std::memcpy(&call.block, data, sizeof call.block);
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
        test::ForgetFault();
    }

    test::DeviceTree tree_;
};

int Set(const char *user, const char *device, float limit)
{
    test::ForgetFault();
    return TAVOQuotaSet(user, device, &limit) == 0 ? 0 : TLIBErrGet();
}

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
    const struct {
        float limit;
        uint64_t kb;
    } rows[] = {{1.5, 1536}, {0, 0}, {0.0009765625, 1}, {0.0009f, 0}, {8388608, 8589934592}};
    for (const auto &row : rows) {
        kernel_calls.clear();
        ASSERT_EQ(Set("ALICE", kDevice, row.limit), 0) << row.limit;
        EXPECT_THAT(kernel_calls, testing::ElementsAre(KernelCall{QCMD(Q_SETQUOTA, USRQUOTA), kDevice, 2000},
                                                       KernelCall{QCMD(Q_SYNC, USRQUOTA), kDevice, 0}));
        const dqblk &block = kernel_calls[0].block;
        EXPECT_EQ(block.dqb_bhardlimit, row.kb);
        EXPECT_EQ(block.dqb_bsoftlimit, row.kb);
        EXPECT_EQ(block.dqb_ihardlimit + block.dqb_isoftlimit + block.dqb_btime + block.dqb_itime, 0u);
        EXPECT_EQ(block.dqb_valid, uint32_t{QIF_BLIMITS | QIF_ILIMITS | QIF_BTIME | QIF_ITIME});
    }
}

TEST_F(Quota, RefusalsReachNoKernel)
{
    const struct {
        const char *user;
        const char *device;
        float limit;
        int code;
    } rows[] = {
        {"alice", kDevice, -0.5, ERR_BAD_PARAMETERS},
        {"alice", kDevice, std::nanf(""), ERR_BAD_PARAMETERS},
        {"alice", kDevice, std::numeric_limits<float>::infinity(), ERR_BAD_PARAMETERS},
        {"alice", kDevice, 1e30f, ERR_BAD_PARAMETERS},
        {"", kDevice, 1, ERR_BAD_PARAMETERS},
        {nullptr, kDevice, 1, ERR_BAD_PARAMETERS},
        {"alice", "", 1, ERR_BAD_PARAMETERS},
        {"alice", nullptr, 1, ERR_BAD_PARAMETERS},
        {"users", kDevice, 1, ERR_SYS_UNKNOWN},
        {"@users", kDevice, 1, ERR_SYS_UNKNOWN},
        {"ghost", kDevice, 1, ERR_NO_SUCH_USER},
        {"DOM\\alice", kDevice, 1, ERR_NO_SUCH_USER},
    };
    for (const auto &row : rows)
        EXPECT_EQ(Set(row.user, row.device, row.limit), row.code) << (row.user ? row.user : "NULL");
    EXPECT_EQ(TAVOQuotaSet("alice", kDevice, nullptr), -1);
    TAVOQUOTA quota = {7, 8};
    EXPECT_EQ(FaultOf(TAVOQuotaGet("users", kDevice, &quota)).code, ERR_SYS_UNKNOWN);
    EXPECT_EQ(TAVOQuotaGet("alice", kDevice, nullptr), -1);
    EXPECT_TRUE(kernel_calls.empty());
    EXPECT_EQ(quota.rLimit, 7);
}

TEST_F(Quota, KernelErrorsAreCodes)
{
    const struct {
        int error;
        int set;
        int get;
    } rows[] = {{ESRCH, ERR_QUOTA_NOT_ENABLED, ERR_QUOTA_NOT_ENABLED},
                {ENOENT, ERR_FILE_NOT_FOUND, ERR_SYS_UNKNOWN},
                {EINVAL, ERR_QUOTA_BAD_ARGUMENT, ERR_SYS_UNKNOWN},
                {EPERM, ERR_SYS_UNKNOWN, ERR_SYS_UNKNOWN}};
    TAVOQUOTA quota = {7, 8};
    for (const auto &row : rows) {
        kernel_errno = row.error;
        EXPECT_EQ(Set("alice", kDevice, 1), row.set) << row.error;
        EXPECT_EQ(FaultOf(TAVOQuotaGet("alice", kDevice, &quota)), (test::Fault{row.get, "quota_get"})) << row.error;
        EXPECT_EQ(TAVOQuotaFmtGet(kDevice), -1);
    }
    EXPECT_EQ(quota.cbUsed, 8u);
    kernel_errno = 0;
    EXPECT_EQ(TAVOQuotaFmtGet(kDevice), 2);
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
    TLIBSZLIST *users = PslTLIBSzListAlloc(512);
    for (const char *name : {"ghost", "", "alice"})
        TLIBSzListPush(&users, name);
    EXPECT_EQ(FaultOf(TAVOQuotaClean(users, kDevice)), (test::Fault{ERR_NO_SUCH_USER, "quota_clean"}));
    EXPECT_EQ(kernel_calls.size(), 2u) << "alice, after the failure";

    TLIBSzListRemoveAll(users);
    TLIBSzListPush(&users, "alice");
    kernel_calls.clear();
    tree_.Put("/proc/mounts", "/dev/md0 / ext4 rw,usrquota 0 0\n/dev/md2 /volume1 ext4 rw,usrquota,grpquota 0 0\n"
                              "/dev/md3 /volume2 ext4 rw 0 0\n/dev/md4 /volume13 ext4 rw,usrjquota=aquota.user 0 0\n"
                              "/dev/md5 /volume1/sub ext4 rw,usrquota 0 0\n");
    EXPECT_EQ(TAVOQuotaCleanAllVols(users), 0);
    ASSERT_EQ(kernel_calls.size(), 4u);
    EXPECT_EQ(kernel_calls[0].device, "/dev/md2");
    EXPECT_EQ(kernel_calls[2].device, "/dev/md4");
    EXPECT_EQ(kernel_calls[2].block.dqb_bhardlimit, 0u);

    kernel_errno = EPERM;
    failing_device = "/dev/md2";
    kernel_calls.clear();
    test::CapturedLog log;
    EXPECT_EQ(TAVOQuotaCleanAllVols(users), -1);
    EXPECT_EQ(kernel_calls.size(), 3u) << "the second volume too";
    EXPECT_THAT(log.Texts(),
                testing::ElementsAre(testing::HasSubstr("Failed to clean quota on /volume1, errno=0x8100")));
    TLIBSzListFree(users);
    EXPECT_EQ(TAVOQuotaCleanAllVols(nullptr), -1);
}

const std::vector<std::string> kRemount{"mount", "-o", "remount,usrquota,grpquota", "/volume1"};
const std::vector<std::string> kCheck{"quotacheck", "-c", "-g", "-u", "-F", "vfsv0", "/volume1"};
const std::vector<std::string> kOn{"quotaon", "-F", "vfsv0", "/volume1"};
const std::vector<std::string> kOff{"quotaoff", "/volume1"};

TEST_F(Quota, SwitchesInSteps)
{
    tree_.Put("/proc/mounts", "/dev/md2 /volume1 ext4 rw 0 0\n");
    const std::vector<std::string> steps[] = {kRemount, kCheck, kOn};
    const int codes[] = {ERR_QUOTA_REMOUNT, ERR_QUOTA_CHECK, ERR_QUOTA_ON};
    for (size_t failing = 0; failing <= std::size(steps); ++failing) {
        test::Scenario scenario;
        for (size_t i = 0; i < std::size(steps) && i <= failing; ++i)
            scenario.Expect(steps[i]).Exits(i == failing ? 1 : 0);
        EXPECT_EQ(TAVOQuotaInit(1), failing < std::size(steps) ? -1 : 0) << failing;
        if (failing < std::size(steps)) {
            EXPECT_EQ(test::LastFault(), (test::Fault{codes[failing], "quota_init"}));
        }
    }
    {
        test::Scenario scenario;
        scenario.Expect(kOff);
        scenario.Expect(kOff).Exits(2);
        EXPECT_EQ(TAVOQuotaOff(1), 0);
        EXPECT_EQ(FaultOf(TAVOQuotaOff(1)).code, ERR_QUOTA_OFF);
    }
}

TEST_F(Quota, NothingRunsOnAVolumeThatIsNotMounted)
{
    test::Scenario scenario;
    tree_.Put("/proc/mounts", "/dev/md2 /volume10 ext4 rw 0 0\n/dev/volume1 /mnt/volume1 ext4 rw 0 0\n");
    for (const int volume : {1, 0, -1, 101}) {
        EXPECT_EQ(FaultOf(TAVOQuotaInit(volume)).code, ERR_BAD_PARAMETERS) << volume;
        EXPECT_EQ(FaultOf(TAVOQuotaOff(volume)).code, ERR_BAD_PARAMETERS);
    }
}

}  // namespace
