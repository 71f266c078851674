// The error state and the log file routines.
#include "tavo_error.h"

#include "support/captured_log.h"
#include "support/fault_state.h"
#include "support/scratch_dir.h"

#include <gtest/gtest.h>

#include <cerrno>
#include <string>

using test::Fault;
using test::LastFault;

namespace {

TEST(ErrorState, CodeAndSourceGoTogether)
{
    TLIBErrSetEx(ERR_BAD_PARAMETERS, "x", 7);
    EXPECT_EQ(LastFault(), (Fault{ERR_BAD_PARAMETERS, "x", 7}));
    EXPECT_EQ(tavoerrno, 0x0D00);

    TLIBErrSet(ERR_OPEN_FAILED);
    EXPECT_EQ(TLIBErrGet(), 0x0900);
    EXPECT_EQ(TAVOErrorGetFile(), nullptr);
    EXPECT_EQ(TAVOErrorGetLine(), 0);

    TAVOVolISetErr(0x1234);
    EXPECT_EQ(TAVOVolGetErr(), 0x1234);
    EXPECT_EQ(volerr, 0x1234);
    EXPECT_EQ(TLIBErrGet(), 0x0900) << "the volume module's cell is another one";
}

TEST(ErrorTable, NamesAreAtTheirCodes)
{
    EXPECT_EQ(errNum, 145);
    EXPECT_EQ(codeNum, 96);
    int named = 0;
    for (int i = 0; i < errNum; ++i) {
        ASSERT_NE(rgszErrMsg[i], nullptr) << i;
        named += rgszErrMsg[i][0] != 0;
    }
    EXPECT_EQ(named, 85);
    // Every name of the header, and a few codes by their number.
    // clang-format off
    const struct {
        int code;
        const char *name;
    } rows[] = {
#define NAMED(code) {code, #code}
        NAMED(ERR_SUCCESS), NAMED(ERR_NOT_ENOUGH_MEMORY), NAMED(ERR_OUT_OF_MEMORY), NAMED(ERR_ACCESS_DENIED),
        NAMED(ERR_LOCK_FAILED), NAMED(ERR_UNLOCK_FAILED), NAMED(ERR_PATH_NOT_FOUND), NAMED(ERR_FILE_NOT_FOUND),
        NAMED(ERR_FILE_EXISTS), NAMED(ERR_OPEN_FAILED), NAMED(ERR_READ_FAILED), NAMED(ERR_WRITE_FAILED),
        NAMED(ERR_CREATE_FAILED), NAMED(ERR_BAD_PARAMETERS), NAMED(ERR_INVALID_SERVERNAME),
        NAMED(ERR_INVALID_DOMAINNAME), NAMED(ERR_INVALID_NETNAME), NAMED(ERR_SERVER_UNREACHABLE),
        NAMED(ERR_INVALID_SHARENAME), NAMED(ERR_SHARE_EXISTS), NAMED(ERR_NO_SUCH_SHARE), NAMED(ERR_TOO_MANY_SHARES),
        NAMED(ERR_INVALID_GROUPNAME), NAMED(ERR_GROUP_EXISTS), NAMED(ERR_NO_SUCH_GROUP), NAMED(ERR_TOO_MANY_GROUPS),
        NAMED(ERR_INVALID_USERNAME), NAMED(ERR_INVALID_PASSWORDNAME), NAMED(ERR_USER_EXISTS), NAMED(ERR_NO_SUCH_USER),
        NAMED(ERR_WRONG_PASSWORD), NAMED(ERR_TOO_MANY_USERS), NAMED(ERR_KEY_NOT_FOUND), NAMED(ERR_KEY_EXISTS),
        NAMED(ERR_SECTION_NOT_FOUND), NAMED(ERR_SECTION_EXISTS), NAMED(ERR_NOT_ENOUGH_QUOTA),
        NAMED(ERR_NOT_ENOUGH_VOLUME_SPACE), NAMED(ERR_SEEK_FAILED), NAMED(ERR_STAT_FAILED), NAMED(ERR_RENAME_FAILED),
        NAMED(ERR_NOT_ENOUGH_SPACE), NAMED(ERR_OP_FAILURE), NAMED(ERR_DEV_UNCONFIG), NAMED(ERR_DEV_UNMOUNTED),
        NAMED(ERR_OP_UNREGISTERED), NAMED(ERR_TIMER_EXPIRED), NAMED(ERR_READ_GEO), NAMED(ERR_USAGE),
        NAMED(ERR_UPDATE_OFFSET), NAMED(ERR_CHECKSUM), NAMED(ERR_OPEN_RAWDEVICE), NAMED(ERR_OPEN_OPTFILE),
        NAMED(ERR_READ_RAWDEVICE), NAMED(ERR_WRITE_RAWDEVICE), NAMED(ERR_BADPATCH), NAMED(ERR_FORMAT_ERROR),
        NAMED(ERR_NO_VOLUME_ID), NAMED(ERR_NO_DISK_ID), NAMED(ERR_NOT_ENOUGH_SD), NAMED(ERR_SD_SIZE_NOT_ALIGN),
        NAMED(ERR_DEVICE_BUSY), NAMED(ERR_INVALID_SD), NAMED(ERR_FORMAT_FAIL), NAMED(ERR_CANNOT_REBUILD_DISK),
        NAMED(ERR_BROKEN_RAID_CONF), NAMED(ERR_DISK_TOO_SMALL), NAMED(ERR_CANNOT_GET_MNTINFO),
        NAMED(ERR_BROKEN_DISK_INFO), NAMED(ERR_DISK_IO_FAILED), NAMED(ERR_BAD_DISKSECTOR),
        NAMED(ERR_UDPD_INVALID_HANDLE), NAMED(ERR_UDPD_RUNNING_HANDLE), NAMED(ERR_UDPD_INVALID_EVENT),
        NAMED(ERR_UDPD_INVALID_PARAMETER), NAMED(ERR_UDPD_EXIT_ABNORMAL), NAMED(ERR_UDPD_NOT_ENOUGH_SPACE),
        NAMED(ERR_UDPD_TIMEOUT), NAMED(ERR_UDPD_INIT_FAIL), NAMED(ERR_UDPD_SEND_FAIL), NAMED(ERR_UDPD_RECV_FAIL),
        NAMED(ERR_UNKNOWN), NAMED(ERR_SYS_UNKNOWN), NAMED(ERR_VOLUME_SIZE_TOO_LARGE), NAMED(ERR_YP_BIND),
#undef NAMED
        {0x0000, "ERR_SUCCESS"}, {0x0D00, "ERR_BAD_PARAMETERS"}, {0x2000, "ERR_KEY_NOT_FOUND"},
        {0x2F00, ""}, {0x3900, ""}, {0x6D00, "ERR_BAD_DISKSECTOR"}, {0x8300, ""}, {0x9000, "ERR_YP_BIND"},
    };
    // clang-format on
    for (const auto &row : rows)
        EXPECT_STREQ(rgszErrMsg[row.code / 0x100], row.name) << std::hex << row.code;
}

TEST(ErrorPrint, LooksAtErrno)
{
    const struct {
        int code;
        const char *printed;
    } rows[] = {
        {0x9000, "ERR_YP_BIND\n"}, {0x3900, "\n"}, {0x9100, ""}, {0x0901, ""}, {-0x100, ""}, {ENOENT, ""},
    };
    for (const auto &row : rows) {
        testing::internal::CaptureStdout();
        errno = row.code;
        TLIBErrPrint();
        EXPECT_EQ(testing::internal::GetCapturedStdout(), row.printed) << row.code;
    }
}

TEST(ErrorLogSet, AppendsOneLineAndKeepsTheRest)
{
    const test::ScratchDir dir;
    const std::string log = dir / "log";
    test::WriteFile(log, "earlier\n");
    EXPECT_EQ(TLIBErrLogSet(log.c_str(), "100%% of %s, 5% left, %n%"), 0);
    EXPECT_EQ(test::ReadFile(log), "earlier\n100% of %s, 5% left, %n%\n");

    EXPECT_EQ(TLIBErrLogSet((dir / "new").c_str(), ""), 0);
    EXPECT_EQ(test::ReadFile(dir / "new"), "\n");

    TLIBErrLogInitial(log.c_str());
    EXPECT_EQ(test::ReadFile(log), "");
}

TEST(ErrorLogSet, Refuses)
{
    const test::ScratchDir dir;
    const std::string log = dir / "log";
    const struct {
        const char *path;
        const char *message;
        Fault fault;
    } rows[] = {
        {nullptr, "x", {ERR_BAD_PARAMETERS, "error_log_set", 33}},
        {log.c_str(), nullptr, {ERR_BAD_PARAMETERS, "error_log_set", 33}},
        {dir.Path().c_str(), "x", {ERR_OPEN_FAILED, "error_log_set", 38}},
        {"/dev/full", "x", {ERR_WRITE_FAILED, "error_log_set", 52}},
    };
    for (const auto &row : rows) {
        test::ForgetFault();
        EXPECT_EQ(TLIBErrLogSet(row.path, row.message), -1);
        EXPECT_EQ(LastFault(), row.fault);
    }
    EXPECT_TRUE(dir.Names().empty());

    test::ForgetFault();
    TLIBErrLogInitial(nullptr);
    TLIBErrLogInitial(dir.Path().c_str());
    EXPECT_EQ(TLIBErrGet(), ERR_SUCCESS);
}

}  // namespace
