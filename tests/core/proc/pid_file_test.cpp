// Pid files, and signals to the processes that they name.
#include "tavo_proc.h"

#include "support/own_child.h"
#include "support/test.h"

#include <climits>

using test::Fault;
using test::LastFault;

namespace {

constexpr uid_t kSomebody = 1000;

std::string Number(long number)
{
    return std::to_string(number) + "\n";
}

TEST(PidFile, ParsesOneNumber)
{
    const std::string own = std::to_string(::getpid());
    const test::ScratchDir dir;
    const std::string path = dir / "x.pid";
    const auto reads = [&](const std::string &text, pid_t pid) {
        test::WriteFile(path, text);
        test::ForgetFault();
        EXPECT_EQ(TLIBReadPidFile(path.c_str()), pid) << text;
        EXPECT_EQ(TLIBErrGet(), ERR_SUCCESS) << text;
        EXPECT_EQ(TLIBProcSignalByPidFile(path.c_str(), 0), pid > 0 ? 0 : -1) << text;
        EXPECT_EQ(LastFault(), (pid > 0 ? Fault{} : Fault{ERR_OPEN_FAILED, "proc_signal_by_pid_file"})) << text;
        EXPECT_EQ(TLIBProcAliveByPidFile(path.c_str()), pid > 0) << text;
    };
    const auto own_pid_in = [&](std::string text) {
        const size_t at = text.find('%');
        return at == text.npos ? text : text.replace(at, 1, own);
    };
    for (const char *text : {"%\n", "%", "   % \r\n", "%\nwhatever follows\n", "1\n"})
        reads(own_pid_in(text), *text == '1' ? 1 : ::getpid());
    for (const char *text : {"", "\n%\n", "0\n", "-1\n", "+1\n", "-%\n", "4294967295\n", "4294967297\n", "4194305\n",
                             "18446744073709551617\n", "smbd\n", "%x\n", "% 1\n", "0x1\n"})
        reads(own_pid_in(text), 0);
    for (const std::string &text : {std::string(300, '9'), std::string(300, ' ') + own, own + std::string("\0\n", 2)})
        reads(text, 0);
}

TEST(PidFile, Refusals)
{
    const test::ScratchDir dir;
    const std::string path = dir / "x.pid";
    test::WriteFile(path, Number(::getpid()));
    ASSERT_EQ(::mkfifo((dir / "fifo").c_str(), 0666), 0);
    const std::string fifo = dir / "fifo", absent = dir / "absent";
    for (const std::string &none : {absent, fifo, dir.Path()}) {
        EXPECT_EQ(TLIBReadPidFile(none.c_str()), -1);
        EXPECT_EQ(LastFault(), (Fault{ERR_OPEN_FAILED, "read_pid_file"}));
        EXPECT_EQ(TLIBProcAliveByPidFile(none.c_str()), 0);
    }

    test::OwnChild gone([] {});
    const std::string dead = dir / "dead.pid";
    test::WriteFile(dead, Number(gone.Pid()));
    gone.Status();
    const auto fault = [](int code) {
        return Fault{code, "proc_signal_by_pid_file"};
    };
    const struct {
        const char *path;
        int signal;
        Fault fault;
    } signals[] = {{absent.c_str(), 0, fault(ERR_OPEN_FAILED)},
                   {fifo.c_str(), 0, fault(ERR_OPEN_FAILED)},
                   {dead.c_str(), 0, fault(ERR_SYS_UNKNOWN)},
                   {path.c_str(), 1000, fault(ERR_SYS_UNKNOWN)}};
    for (const auto &row : signals) {
        EXPECT_EQ(TLIBProcSignalByPidFile(row.path, row.signal), -1);
        EXPECT_EQ(LastFault(), row.fault);
    }
}

// Root signals any process, so a file that another user could have written counts for that user's processes only.
TEST(PidFile, ForeignFilesCountForTheirOwnersProcesses)
{
    SKIP_WITHOUT_PROC();
    test::OwnChild victim([] { ::pause(); });
    test::OwnChild theirs([] { test::BecomeAndWait(kSomebody); });
    test::OwnChild gone([] {});
    const pid_t dead = gone.Pid();
    gone.Status();
    const std::string proc = "/proc/" + std::to_string(theirs.Pid());
    struct stat st;
    ASSERT_TRUE(test::Eventually([&] { return ::stat(proc.c_str(), &st) == 0 && st.st_uid != 0; }));

    const test::ScratchDir dir;
    const std::string path = dir / "x.pid";
    const struct {
        pid_t pid;
        pid_t read;
        int code;
    } rows[] = {{victim.Pid(), 0, ERR_OPEN_FAILED},
                {1, 0, ERR_OPEN_FAILED},
                {dead, dead, ERR_SYS_UNKNOWN},
                {theirs.Pid(), theirs.Pid(), 0}};
    for (const auto &row : rows) {
        test::WriteFile(path, Number(row.pid));
        ASSERT_EQ(::chown(path.c_str(), kSomebody, 0), 0);
        test::ForgetFault();
        EXPECT_EQ(TLIBReadPidFile(path.c_str()), row.read);
        EXPECT_EQ(TLIBProcSignalByPidFile(path.c_str(), 0), row.code ? -1 : 0);
        EXPECT_EQ(TLIBErrGet(), row.code);
    }
    ASSERT_EQ(::chown(path.c_str(), 0, 0), 0);
    EXPECT_EQ(TLIBProcSignalByPidFile(path.c_str(), SIGTERM), 0);
    EXPECT_EQ(theirs.Status(), SIGTERM);

    test::WriteFile(path, Number(victim.Pid()));
    const std::string link = dir / "link";
    ASSERT_EQ(::symlink(path.c_str(), link.c_str()), 0);
    EXPECT_EQ(TLIBProcSignalByPidFile(link.c_str(), SIGTERM), -1);
    EXPECT_EQ(TLIBErrGet(), ERR_OPEN_FAILED);
    EXPECT_EQ(::waitpid(victim.Pid(), nullptr, WNOHANG), 0) << "the victim lives";
}

TEST(PidFile, IgnoresFilesThatOthersMayWrite)
{
    const test::ScratchDir dir;
    const std::string path = dir / "x.pid";
    test::WriteFile(path, Number(::getpid()));
    const struct {
        mode_t mode;
        bool believed;
    } rows[] = {{0644, true}, {0600, true}, {0444, true}, {0664, false}, {0646, false}, {0622, false}, {0666, false}};
    for (const auto &row : rows) {
        ASSERT_EQ(::chmod(path.c_str(), row.mode), 0);
        test::ForgetFault();
        EXPECT_EQ(TLIBReadPidFile(path.c_str()), row.believed ? ::getpid() : 0) << std::oct << row.mode;
        EXPECT_EQ(TLIBErrGet(), ERR_SUCCESS);
        EXPECT_EQ(TLIBProcSignalByPidFile(path.c_str(), 0), row.believed ? 0 : -1) << std::oct << row.mode;
        EXPECT_EQ(TLIBErrGet(), row.believed ? ERR_SUCCESS : ERR_OPEN_FAILED);
    }
    // Also under a careless umask, and over a file that an earlier release created under one.
    for (const mode_t mask : {0u, 0777u}) {
        const mode_t before = ::umask(mask);
        const int made = TAVOProcPidFileCreate((dir / "new.pid").c_str());
        ::umask(before);
        EXPECT_EQ(made, 0);
        EXPECT_EQ(TLIBReadPidFile((dir / "new.pid").c_str()), ::getpid());
        struct stat st;
        ASSERT_EQ(::stat((dir / "new.pid").c_str(), &st), 0);
        EXPECT_EQ(st.st_mode & 07777, 0644u);
        ::unlink((dir / "new.pid").c_str());
    }
    EXPECT_EQ(TAVOProcPidFileCreate(path.c_str()), 0);
    EXPECT_EQ(TLIBReadPidFile(path.c_str()), ::getpid());
}

TEST(PidFile, Create)
{
    const test::ScratchDir dir;
    const std::string path = dir / "x.pid";
    test::WriteFile(path, "an older and longer text\n", 0600);
    EXPECT_EQ(TAVOProcPidFileCreate(path.c_str()), 0);
    EXPECT_EQ(test::ReadFile(path), Number(::getpid()));
    EXPECT_EQ(TLIBReadPidFile(path.c_str()), ::getpid());
    const std::string link = dir / "link";
    ASSERT_EQ(::symlink(path.c_str(), link.c_str()), 0);
    EXPECT_EQ(TAVOProcPidFileCreate(link.c_str()), 0) << "the administrator's own link";

    const Fault cannot = {ERR_OPEN_FAILED, "proc_pid_file_create"};
    const std::string below_file = path + "/x";
    const struct {
        const char *path;
        Fault fault;
    } rows[] = {{nullptr, {ERR_BAD_PARAMETERS, "proc_pid_file_create"}},
                {below_file.c_str(), cannot},
                {dir.Path().c_str(), cannot},
                {"/dev/full", cannot}};
    for (const auto &row : rows) {
        EXPECT_EQ(TAVOProcPidFileCreate(row.path), -1);
        EXPECT_EQ(LastFault(), row.fault);
    }
}

TEST(ProcAlive, AsksAboutOneProcess)
{
    test::OwnChild theirs([] { test::BecomeAndWait(kSomebody); });
    test::OwnChild gone([] {});
    const pid_t dead = gone.Pid();
    gone.Status();
    test::ForgetFault();
    EXPECT_EQ(BlTLIBProcAlive(::getpid()), 1);
    EXPECT_EQ(BlTLIBProcAlive(theirs.Pid()), 1);
    for (const pid_t pid : {dead, 0, -1, -::getpgrp(), INT_MIN, INT_MAX})
        EXPECT_EQ(BlTLIBProcAlive(pid), 0) << pid;
    EXPECT_EQ(TLIBErrGet(), ERR_SUCCESS);
    const pid_t root = ::getpid();
    EXPECT_EQ(
        test::InChild([&] { return ::setresuid(kSomebody, kSomebody, kSomebody) == 0 ? BlTLIBProcAlive(root) : 9; }), 1)
        << "of another user, and not to be signalled";
}

TEST(SysRemove, FilesOnly)
{
    const test::ScratchDir dir;
    const std::string file = dir / "file", link = dir / "link", absent = dir / "absent", below = file + "/x";
    test::WriteFile(file, "x");
    ASSERT_EQ(::symlink(file.c_str(), link.c_str()), 0);
    EXPECT_EQ(TLIBSysRemove(link.c_str()), 0);
    EXPECT_EQ(dir.Names(), std::vector<std::string>{"file"});
    const struct {
        const char *path;
        int code;
    } rows[] = {{nullptr, ERR_BAD_PARAMETERS},
                {absent.c_str(), ERR_FILE_NOT_FOUND},
                {dir.Path().c_str(), ERR_SYS_UNKNOWN},
                {below.c_str(), ERR_SYS_UNKNOWN}};
    for (const auto &row : rows) {
        EXPECT_EQ(TLIBSysRemove(row.path), -1);
        EXPECT_EQ(LastFault(), (Fault{row.code, "sys_remove"}));
    }
    EXPECT_EQ(test::InChild([&] {
                  return ::chmod(dir.Path().c_str(), 0755) == 0 && ::setresuid(kSomebody, kSomebody, kSomebody) == 0 &&
                                 TLIBSysRemove(file.c_str()) == -1 && TLIBErrGet() == ERR_ACCESS_DENIED
                             ? 0
                             : 1;
              }),
              0);
    EXPECT_EQ(TLIBSysRemove(file.c_str()), 0);
    EXPECT_TRUE(dir.Names().empty());
}

}  // namespace
