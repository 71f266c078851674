// Traps where a rewrite looks: links, FIFOs, devices, directories, other users' files.
#include "tavo_proc.h"

#include "support/test.h"
#include "writers.h"

#include <sys/file.h>

namespace {

using test::kScratch;

ino_t InodeOf(const std::string &path)
{
    struct stat st {};
    EXPECT_EQ(::lstat(path.c_str(), &st), 0) << path;
    return st.st_ino;
}

class Planted : public testing::Test {
  protected:
    Planted()
    {
        ::mkdir("/etc/skel", 0755);
        ::unlink(kScratch);
        test::WriteFile(victim_, "precious\n");
        test::WriteFile(file_, "a=1\nkey=1\n");
        ::alarm(20);  // nothing here may wait
    }
    ~Planted() override
    {
        ::alarm(0);
        ::unlink(kScratch);
        ::rmdir(kScratch);
    }

    // Whatever is at the scratch name, the key becomes a comment and the victim is unchanged.
    void Comment(const char *what)
    {
        test::WriteFile(file_, "a=1\nkey=1\n");
        EXPECT_EQ(TLIBFileComment(file_.c_str(), "key"), 1) << what;
        EXPECT_EQ(test::ReadFile(file_), "a=1\n;key=1\n") << what;
        EXPECT_EQ(test::ReadFile(victim_), "precious\n") << what;
        EXPECT_THAT(dir_.Names(), testing::ElementsAre("file", "victim")) << what;
    }

    const test::ScratchDir dir_;
    const std::string victim_ = dir_ / "victim", file_ = dir_ / "file";
};

TEST_F(Planted, ForeignThingsAtTheScratchNameStay)
{
    const auto stays = [&](const char *what) {
        const ino_t before = InodeOf(kScratch);
        Comment(what);
        EXPECT_EQ(InodeOf(kScratch), before) << what;
    };
    ASSERT_EQ(::symlink(victim_.c_str(), kScratch), 0);
    stays("a link");
    ASSERT_EQ(::unlink(kScratch), 0);
    ASSERT_EQ(::mkfifo(kScratch, 0666), 0);
    stays("a FIFO");
    ASSERT_EQ(::unlink(kScratch), 0);
    ASSERT_EQ(::mkdir(kScratch, 0777), 0);
    stays("a directory");
    ASSERT_EQ(::rmdir(kScratch), 0);
    test::WriteFile(kScratch, "foreign");
    if (::chown(kScratch, 1234, 1234) == 0)
        stays("another user's file");
    EXPECT_EQ(test::ReadFile(kScratch), "foreign");
}

TEST_F(Planted, TheScratchFileOfALivingProcessStays)
{
    test::WriteFile(kScratch, "half written");
    const int fd = ::open(kScratch, O_RDONLY | O_CLOEXEC);
    ASSERT_EQ(::flock(fd, LOCK_EX), 0);
    Comment("a living process");
    EXPECT_EQ(test::ReadFile(kScratch), "half written");
    ::close(fd);
    Comment("a dead process");
    EXPECT_NE(::access(kScratch, F_OK), 0) << "nothing is left where new homes are copied from";
}

// In /tmp a link, a second name of a file or a FIFO may be another user's trap; anywhere else a link is the administrator's
// own.
TEST_F(Planted, TrapsInAPublicDirectoryAreNotOpened)
{
    const std::string open_dir = dir_ / "open", link = dir_ / "link";
    ASSERT_EQ(::mkdir(open_dir.c_str(), 0755), 0);
    ASSERT_EQ(::chmod(open_dir.c_str(), 01777), 0);
    test::WriteFile(victim_, test::kOldText);
    test::WriteFile(file_, test::kOldText);
    const auto in = [&](const char *name) {
        return open_dir + "/" + name;
    };
    ASSERT_EQ(::symlink(victim_.c_str(), in("trap").c_str()), 0);
    ASSERT_EQ(::symlink((dir_ / "nologin").c_str(), in("dangling").c_str()), 0);
    ASSERT_EQ(::link(victim_.c_str(), in("hard").c_str()), 0);
    ASSERT_EQ(::mkfifo(in("fifo").c_str(), 0666), 0);
    test::WriteFile(in("theirs"), test::kOldText);
    ASSERT_EQ(::chown(in("theirs").c_str(), 1000, 0), 0);
    ASSERT_EQ(::symlink(file_.c_str(), link.c_str()), 0);
    const struct {
        int (*open)(const char *);
        test::Fault fault;
    } openers[] = {
        {[](const char *path) { return TLIBErrLogSet(path, "x"); }, {ERR_OPEN_FAILED, "error_log_set", 38}},
        {[](const char *path) { return TLIBErrLogInitial(path), -1; }, {}},
        {TAVOProcPidFileCreate, {ERR_OPEN_FAILED, "proc_pid_file_create"}},
    };
    for (const char *name : {"trap", "dangling", "hard", "fifo", "theirs"}) {
        const std::string path = in(name);
        for (const auto &opener : openers) {
            test::ForgetFault();
            EXPECT_EQ(opener.open(path.c_str()), -1) << path;
            EXPECT_EQ(test::LastFault(), opener.fault) << path;
        }
        for (const test::Writer &writer : test::kAppenders) {
            EXPECT_LE(writer.write(path.c_str()), 0) << writer.name << " " << path;
            EXPECT_EQ(test::LastFault(), (test::Fault{ERR_OPEN_FAILED, writer.module})) << path;
        }
    }
    for (const char *name : {"trap", "dangling"}) {
        for (const test::Writer &writer : test::kRewriters) {
            EXPECT_LE(writer.write(in(name).c_str()), 0) << writer.name << " " << name;
            EXPECT_EQ(test::LastFault(), (test::Fault{ERR_OPEN_FAILED, writer.module})) << name;
        }
        EXPECT_EQ(TLIBFileTouch(in(name).c_str()), -1) << name;
    }
    EXPECT_EQ(test::ReadFile(victim_), test::kOldText);
    EXPECT_EQ(test::ReadFile(in("theirs")), test::kOldText);
    for (int i = 0; i < 2; ++i)
        EXPECT_EQ(TAVOProcPidFileCreate(in("mine").c_str()), 0);
    EXPECT_EQ(TLIBReadPidFile(in("mine").c_str()), ::getpid());

    EXPECT_EQ(TLIBErrLogSet(link.c_str(), "x"), 0);
    std::string text = test::kOldText + "x\n";
    for (const test::Writer &writer : test::kAppenders) {
        EXPECT_EQ(writer.write(link.c_str()), 1) << writer.name;
        EXPECT_TRUE(test::ReadFile(file_).starts_with(text)) << writer.name;
        EXPECT_GT(test::ReadFile(file_).size(), text.size()) << writer.name;
        text = test::ReadFile(file_);
    }
    EXPECT_THAT(dir_.Names(), testing::ElementsAre("file", "link", "open", "victim"));
}

TEST_F(Planted, RefusesSpecialFilesAtOnce)
{
    const std::string fifo = dir_ / "fifo";
    ASSERT_EQ(::mkfifo(fifo.c_str(), 0666), 0);
    test::Room room;
    for (const std::string &path : {fifo, dir_.Path(), std::string("/dev/zero"), std::string("/dev/full")}) {
        const char *at = path.c_str();
        const bool directory = path == dir_.Path();
        for (const test::Writer &writer : test::kRewriters) {
            EXPECT_EQ(writer.write(at), -1) << writer.name << " " << path;
            EXPECT_EQ(test::LastFault(), (test::Fault{ERR_OPEN_FAILED, writer.module})) << path;
        }
        for (const test::Writer &writer : test::kAppenders) {
            EXPECT_LE(writer.write(at), 0) << writer.name << " " << path;
            const bool key = writer.module == std::string("file_append_key");
            const int code = directory && key ? ERR_BAD_PARAMETERS : ERR_OPEN_FAILED;
            EXPECT_EQ(test::LastFault(), (test::Fault{code, writer.module})) << path;
        }
        for (const test::Reader &reader : test::kReaders)
            EXPECT_EQ(reader.read(at, room.hash, room.list), -1) << reader.module << " " << path;
        for (const int result : {TLIBFileGetKeyValue(at, "key", nullptr, 0, 0), TLIBFileMatchLineNo(at, "key"),
                                 TLIBFileGetLine(at, 1, nullptr, 0), TLIBFileTouch(at)})
            EXPECT_EQ(result, -1) << path;
    }
    EXPECT_THAT(dir_.Names(), testing::ElementsAre("fifo", "file", "victim"));
}

}  // namespace
