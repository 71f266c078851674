// Quotas as the kernel enforces them, on a real file system.
#include "tavo_group.h"
#include "tavo_quota.h"
#include "tavo_user.h"

#include "account/user/user_fixture.h"
#include "support/machine.h"
#include "support/test.h"

#include <array>

#include <sys/quota.h>

namespace {

using test::FaultOf;
using test::Shell;
using testing::HasSubstr;

constexpr char device[] = "/dev/sda";
constexpr int64_t kib = 1024;

int UserId(const char *name)
{
    const test::User user = test::GetUser(name);
    return user ? user->nUid : -1;
}

struct Written {
    int64_t bytes = 0;
    int error = 0;
};

// As that user, until the kernel says no or `most` bytes are there.
Written WriteAs(int uid, const std::string &path, int64_t most)
{
    int ends[2];
    EXPECT_EQ(::pipe2(ends, O_CLOEXEC), 0);
    const pid_t pid = ::fork();
    if (pid == 0) {
        Written written;
        const std::array<char, 4096> block = {};
        if (::setgid(100) != 0 || ::setuid(static_cast<uid_t>(uid)) != 0)
            ::_exit(1);
        const int fd = ::open(path.c_str(), O_WRONLY | O_CREAT | O_APPEND | O_CLOEXEC, 0600);
        written.error = fd < 0 ? errno : 0;
        while (!written.error && written.bytes < most) {
            const ssize_t count = ::write(fd, block.data(), block.size());
            if (count < 0)
                written.error = errno;
            else
                written.bytes += count;
        }
        if (!written.error && ::fsync(fd) != 0)
            written.error = errno;
        ::_exit(::write(ends[1], &written, sizeof written) != sizeof written);
    }
    ::close(ends[1]);
    Written written;
    EXPECT_EQ(::read(ends[0], &written, sizeof written), static_cast<ssize_t>(sizeof written));
    ::close(ends[0]);
    ::waitpid(pid, nullptr, 0);
    return written;
}

class MachineQuota : public test::MachineTest {
  protected:
    void SetUp() override
    {
        test::MachineTest::SetUp();
        if (IsSkipped())
            return;
        ASSERT_EQ(Shell("mkfs.ext4 -q -F " + std::string(device)).status, 0);
        ::mkdir("/volume1", 0755);
        const test::CommandResult mounted = Shell("mount " + std::string(device) + " /volume1 && chmod 1777 /volume1");
        ASSERT_EQ(mounted.status, 0) << mounted.output;
        test::DeleteUsers({"anna", "berta"});
        ASSERT_EQ(test::AddUser({.name = "anna"}), 0);
        ASSERT_EQ(test::AddUser({.name = "berta"}), 0);
    }
    void TearDown() override
    {
        if (test::OnMachine())
            Shell("quotaoff /volume1; umount /volume1");
    }
};

TEST_F(MachineQuota, LimitsAreSetEnforcedReportedAndClearedWithTheUser)
{
    TAVOQUOTA quota = {};
    EXPECT_EQ(FaultOf(TAVOQuotaGet("anna", device, &quota)).code, ERR_QUOTA_NOT_ENABLED);
    EXPECT_EQ(TAVOQuotaFmtGet(device), -1);

    ASSERT_EQ(TAVOQuotaInit(1), 0) << std::hex << TLIBErrGet();
    EXPECT_EQ(TAVOQuotaFmtGet(device), QFMT_VFS_V0);
    const float limit = 1.5F;
    ASSERT_EQ(TAVOQuotaSet("Anna", device, &limit), 0) << std::hex << TLIBErrGet();

    // What the kernel has, without the library.
    const int anna = UserId("anna");
    dqblk block = {};
    ASSERT_EQ(::quotactl(QCMD(Q_GETQUOTA, USRQUOTA), device, anna, reinterpret_cast<caddr_t>(&block)), 0);
    EXPECT_EQ(block.dqb_bhardlimit, 1536u);
    EXPECT_EQ(block.dqb_bsoftlimit, 1536u);
    EXPECT_EQ(block.dqb_ihardlimit + block.dqb_isoftlimit, 0u);

    const Written written = WriteAs(anna, "/volume1/anna", 8192 * kib);
    EXPECT_EQ(written.error, EDQUOT) << ::strerror(written.error);
    EXPECT_LE(written.bytes, 1536 * kib);
    EXPECT_GT(written.bytes, 1400 * kib);
    const Written free = WriteAs(UserId("berta"), "/volume1/berta", 4096 * kib);
    EXPECT_EQ(free.error, 0) << ::strerror(free.error);

    struct stat state = {};
    ASSERT_EQ(::stat("/volume1/anna", &state), 0);
    ASSERT_EQ(TAVOQuotaGet("anna", device, &quota), 0);
    EXPECT_EQ(quota.rLimit, 1.5F);
    EXPECT_EQ(quota.cbUsed, static_cast<uint64_t>(state.st_blocks) * 512);
    ASSERT_EQ(TAVOQuotaGet("berta", device, &quota), 0);
    EXPECT_EQ(quota.rLimit, 0.0F);
    EXPECT_GE(quota.cbUsed, static_cast<uint64_t>(4096 * kib));

    // The system's own tools and tavoctl say the same.
    EXPECT_THAT(Shell("repquota -v /volume1").output, testing::ContainsRegex("anna +\\+?-- +[0-9]+ +1536 +1536|anna +"
                                                                             "[+-]- +[0-9]+ +1536 +1536"));
    EXPECT_THAT(Shell("tavoctl quota get anna 1 --json").output, HasSubstr("\"limit_kib\": 1536"));
    EXPECT_THAT(Shell("tavoctl quota report").output, testing::ContainsRegex("1 +berta +- +[0-9]+"));

    // More room, then none that is counted.
    const float more = 3;
    ASSERT_EQ(TAVOQuotaSet("anna", device, &more), 0);
    EXPECT_GT(WriteAs(anna, "/volume1/anna", 8192 * kib).bytes, 1400 * kib);
    EXPECT_EQ(Shell("tavoctl quota set berta 1 1G").status, 0);
    const int berta = UserId("berta");
    ASSERT_EQ(test::DeleteUser("berta"), 0);
    ASSERT_EQ(::quotactl(QCMD(Q_GETQUOTA, USRQUOTA), device, berta, reinterpret_cast<caddr_t>(&block)), 0);
    EXPECT_EQ(block.dqb_bhardlimit, 0u) << "the next account with this id starts without a limit";

    EXPECT_EQ(FaultOf(TAVOQuotaSet("anna", "/dev/none", &limit)).code, ERR_FILE_NOT_FOUND);

    ASSERT_EQ(TAVOQuotaOff(1), 0) << std::hex << TLIBErrGet();
    EXPECT_EQ(WriteAs(anna, "/volume1/anna", 4096 * kib).error, 0);
    EXPECT_EQ(FaultOf(TAVOQuotaGet("anna", device, &quota)).code, ERR_QUOTA_NOT_ENABLED);
    EXPECT_EQ(TAVOQuotaClean(nullptr, device), -1);
}

TEST_F(MachineQuota, LimitsOutliveSwitchingOffAndARemount)
{
    ASSERT_EQ(TAVOQuotaInit(1), 0) << std::hex << TLIBErrGet();
    const float limit = 2;
    ASSERT_EQ(TAVOQuotaSet("anna", device, &limit), 0);
    ASSERT_EQ(TAVOQuotaOff(1), 0);
    ASSERT_EQ(Shell("umount /volume1 && mount " + std::string(device) + " /volume1").status, 0);
    EXPECT_EQ(WriteAs(UserId("anna"), "/volume1/anna", 1024 * kib).error, 0);
    const test::CommandResult on = Shell("tavoctl quota on 1");
    ASSERT_EQ(on.status, 0) << on.output;
    TAVOQUOTA quota = {};
    ASSERT_EQ(TAVOQuotaGet("anna", device, &quota), 0);
    EXPECT_GE(quota.cbUsed, static_cast<uint64_t>(1024 * kib)) << "what was written meanwhile is counted";
}

TEST_F(MachineQuota, RefusesAVolumeThatIsBusy)
{
    const int busy = ::open("/volume1/busy", O_WRONLY | O_CREAT | O_CLOEXEC, 0600);
    ASSERT_GE(busy, 0);
    EXPECT_EQ(FaultOf(TAVOQuotaInit(1)).code, ERR_QUOTA_CHECK);
    ::close(busy);
    EXPECT_EQ(TAVOQuotaInit(1), 0) << std::hex << TLIBErrGet();
}

}  // namespace
