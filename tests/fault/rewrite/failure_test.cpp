// Calls that fail and disks that are full: every writer reports its code and leaves the old text, and no other file.
#include "tavo_proc.h"

#include "interposed_calls.h"
#include "support/descriptors.h"
#include "support/failing_malloc.h"
#include "support/test.h"
#include "writers.h"

#include <sys/mount.h>

using test::Call;
using test::Fault;
using test::kOldText;
using test::LastFault;
using testing::ElementsAre;

namespace {

TEST(FailingCalls, ReturnTheirCodes)
{
    struct Row {
        Call call;
        int error, code;
    };
    constexpr Row rows[] = {
        {Call::fstat, EIO, ERR_STAT_FAILED},       {Call::fstat_written, EIO, ERR_WRITE_FAILED},
        {Call::write, EIO, ERR_WRITE_FAILED},      {Call::write, ENOSPC, ERR_WRITE_FAILED},
        {Call::fsync_file, EIO, ERR_WRITE_FAILED}, {Call::fchmod, EPERM, ERR_WRITE_FAILED},
        {Call::fchown, EPERM, ERR_WRITE_FAILED},   {Call::rename, EBUSY, ERR_RENAME_FAILED},
        {Call::read, EIO, ERR_WRITE_FAILED},
    };
    const int descriptors = test::OpenDescriptors();
    for (const std::string &parent : test::Parents()) {
        const test::Place dir(parent);
        const std::string file = dir / "file";
        for (const Row &row : rows) {
            for (const test::Writer &writer : test::kRewriters) {
                SCOPED_TRACE(writer.name + (" in " + parent));
                test::WriteFile(file, kOldText);
                ASSERT_EQ(::chown(file.c_str(), 0, 1), 0);
                test::ForgetFault();
                test::FailCalls(row.call, row.error);
                EXPECT_EQ(writer.write(file.c_str()), -1);
                test::FailCalls(Call::none, 0);
                const bool says_read = row.call == Call::read && writer.module == std::string("file_modify_section");
                EXPECT_EQ(LastFault(), (Fault{says_read ? ERR_READ_FAILED : row.code, writer.module}));
                EXPECT_EQ(test::ReadFile(file), kOldText);
                EXPECT_THAT(dir.Names(), ElementsAre("file"));
            }
        }
    }
    EXPECT_EQ(test::OpenDescriptors(), descriptors);
}

TEST(FailingCalls, OfReadersAreReported)
{
    const test::ScratchDir dir;
    const std::string file = dir / "file";
    const char *const path = file.c_str();
    test::WriteFile(file, kOldText);
    test::Room room;
    test::FailCalls(Call::read, EIO);
    for (const test::Reader &reader : test::kReaders) {
        EXPECT_EQ(reader.read(path, room.hash, room.list), -1) << reader.module;
        EXPECT_EQ(LastFault(), (Fault{ERR_READ_FAILED, reader.module}));
    }
    EXPECT_EQ(TLIBFileAppendKey(path, "added", "v", nullptr), -1);
    EXPECT_EQ(LastFault(), (Fault{ERR_READ_FAILED, "file_append_key"}));
    test::FailCalls(Call::none, 0);
    EXPECT_EQ(test::ReadFile(file), kOldText);
}

TEST(FailingCalls, OfAnAppendTakeItBack)
{
    const test::ScratchDir dir;
    const std::string file = dir / "file";
    for (const Call call : {Call::write, Call::fsync_file}) {
        for (const test::Writer &writer : test::kAppenders) {
            test::WriteFile(file, kOldText);
            test::FailCalls(call, EIO);
            EXPECT_LE(writer.write(file.c_str()), 0) << writer.name;
            test::FailCalls(Call::none, 0);
            EXPECT_EQ(LastFault(), (Fault{ERR_WRITE_FAILED, writer.module}));
            EXPECT_EQ(test::ReadFile(file), kOldText) << writer.name;
        }
    }
    test::FailCalls(Call::write, EIO);
    EXPECT_EQ(TLIBFileAppendKey(file.c_str(), "added", "v", nullptr), -1);
    EXPECT_EQ(LastFault(), (Fault{ERR_WRITE_FAILED, "file_append_key", 82}));
    EXPECT_EQ(TLIBFileAppendKey((dir / "made").c_str(), "added", "v", nullptr), -1);
    EXPECT_EQ(LastFault(), (Fault{ERR_WRITE_FAILED, "file_append_key", 66}));
    test::FailCalls(Call::rename, EBUSY);
    EXPECT_EQ(TLIBFileAppendKey((dir / "made").c_str(), "added", "v", nullptr), -1);
    EXPECT_EQ(LastFault(), (Fault{ERR_RENAME_FAILED, "file_append_key"}));
    test::FailCalls(Call::none, 0);
    EXPECT_THAT(dir.Names(), ElementsAre("file"));
}

TEST(FailingCalls, OfTheDirectoryAreOnlyLogged)
{
    const auto logs = [](const test::Writer &writer, const std::string &file) {
        const test::CapturedLog log;
        test::FailCalls(Call::fsync_directory, EIO);
        EXPECT_EQ(writer.write(file.c_str()), 1) << writer.name << ": the file is the new one already";
        test::FailCalls(Call::none, 0);
        EXPECT_THAT(log.Texts(),
                    ElementsAre(testing::MatchesRegex(writer.module + std::string(":[0-9]+ Failed to sync.*"))));
    };
    for (const std::string &parent : test::Parents()) {
        const test::Place dir(parent);
        for (const test::Writer &writer : test::kRewriters) {
            test::WriteFile(dir / writer.name, kOldText);
            logs(writer, dir / writer.name);
        }
        for (const test::Writer &writer : test::kAppenders)
            logs(writer, dir / writer.name);
    }
}

// On the file system of /etc/skel a comment begins in a scratch file there. Without its lock that file is not used, and the
// file is rewritten like any other.
TEST(Comment, ComesFromTheScratchFileThatItCouldLock)
{
    if (test::RootForm().empty())
        GTEST_SKIP() << "only in an appliance root";
    const test::Place dir("/etc");
    const std::string file = dir / "file";
    const std::string commented = std::string(kOldText).insert(kOldText.find("key"), ";");
    // The file of a process that died is removed first.
    constexpr int kStale = -1;
    for (const int error : {0, kStale, EIO, ENOLCK, ENOSYS}) {
        test::WriteFile(file, kOldText);
        if (error == kStale)
            test::WriteFile(test::kScratch, "half written");
        test::FailCalls(error > 0 ? Call::flock : Call::none, error);
        EXPECT_EQ(TLIBFileComment(file.c_str(), "key"), 1) << error;
        test::FailCalls(Call::none, 0);
        EXPECT_EQ(std::string(test::RenamedFrom()) == test::kScratch, error <= 0) << test::RenamedFrom();
        EXPECT_EQ(test::ReadFile(file), commented) << error;
        EXPECT_THAT(dir.Names(), ElementsAre("file")) << error;
    }
}

TEST(OutOfMemory, FailsEveryWriterAndReader)
{
    const auto no_memory = testing::AnyOf(ERR_OUT_OF_MEMORY, ERR_OPEN_FAILED, ERR_WRITE_FAILED);
    test::NewPairs();
    for (const std::string &parent : test::Parents()) {
        const test::Place dir(parent);
        const std::string file = dir / "file";
        const auto each = [&](const char *name, const auto &call) {
            SCOPED_TRACE(name);
            test::EachAllocation faults;
            while (faults.Next()) {
                test::WriteFile(file, kOldText);
                test::Room room;
                test::ForgetFault();
                faults.Arm();
                const int result = call(file.c_str(), room);
                faults.Disarm();
                // A stream of the C library works without a buffer, too.
                EXPECT_TRUE(faults.Fired() ? result <= 0 || std::string_view(name).ends_with("Section") : result > 0);
                if (result <= 0) {
                    EXPECT_EQ(result, name == std::string("AddSection") ? 0 : -1);
                    EXPECT_THAT(TLIBErrGet(), no_memory);
                    EXPECT_EQ(test::ReadFile(file), kOldText);
                }
                EXPECT_LE(faults.LeftAllocated(), 0);
                EXPECT_THAT(dir.Names(), ElementsAre("file"));
            }
            EXPECT_GT(faults.Count(), 0);
        };
        for (const test::Writer &writer : test::kRewriters)
            each(writer.name, [&](const char *path, auto &) { return writer.write(path); });
        for (const test::Writer &writer : test::kAppenders)
            each(writer.name, [&](const char *path, auto &) { return writer.write(path); });
        for (const test::Reader &reader : test::kReaders)
            each(reader.module, [&](const char *path, auto &room) { return reader.read(path, room.hash, room.list); });
    }
}

// Memory runs out: a published line, and published log lines, which every_call/ does not look at.
TEST(OutOfMemory, OpensNoTemporaryFile)
{
    const test::ScratchDir dir;
    test::EachAllocation faults;
    while (faults.Next()) {
        std::string name = dir / "temp.XXXXXX";
        faults.Arm();
        FILE *temp = TLIBFileTempFileOpen(name.data());
        faults.Disarm();
        EXPECT_EQ(temp == nullptr, faults.Fired());
        if (temp) {
            std::fclose(temp);
            continue;
        }
        EXPECT_EQ(test::LastFault(), (test::Fault{ERR_OPEN_FAILED, "file_tempfile_open", 49})) << "a published line";
        EXPECT_EQ(dir.Names().size(), 0u);
    }
    EXPECT_GT(faults.Count(), 0);
}

// Support staff know these lines.
TEST(OutOfMemory, IsLoggedByTheFunctionsOfManyKeys)
{
    const test::ScratchDir dir;
    const std::string file = dir / "file";
    test::PairMap many;
    for (int i = 0; i < 100; ++i)
        many["key number " + std::to_string(i)] = "v";
    const test::Owned<TLIBSZHASH> pairs = test::HashOf(many);
    test::Owned<TLIBSZLIST> wanted = test::ListOf({});
    ASSERT_EQ(TLIBSzHashEnumKey(pairs, wanted), 100);
    test::WriteFile(file, "key number 1=old\n");
    test::Owned<TLIBSZHASH> found = test::HashOf({});

    const auto logs = [](const char *text, const auto &call) {
        int logged = 0;
        test::EachAllocation faults;
        while (faults.Next()) {
            test::CapturedLog log;
            faults.Arm();
            const int result = call();
            faults.Disarm();
            const auto texts = log.Texts();
            if (std::any_of(texts.begin(), texts.end(),
                            [&](const auto &line) { return line.find(text) != line.npos; })) {
                ++logged;
                EXPECT_EQ(result, -1);
                EXPECT_EQ(TLIBErrGet(), ERR_OUT_OF_MEMORY);
            }
        }
        EXPECT_GT(logged, 0) << text;
    };
    logs(" PslTLIBSzListOr() failed!! tavoerr=[0x0200]",
         [&] { return TLIBFileGetKeys(file.c_str(), wanted, found, "="); });
    logs(" TLIBSzHashEnumKey() failed!", [&] { return TLIBFileSetKeys(file.c_str(), pairs, nullptr); });
}

// A file system of 64 KiB of its own.
class FullDisk : public testing::Test {
  protected:
    void SetUp() override
    {
        if (::mount("tmpfs", dir_.Path().c_str(), "tmpfs", 0, "size=64k") != 0)
            GTEST_SKIP() << "cannot mount here";
        mounted_ = true;
        test::WriteFile(file_, text_);
    }
    ~FullDisk() override
    {
        if (mounted_)
            ::umount2(dir_.Path().c_str(), MNT_DETACH);
    }

    // Leaves this many free pages.
    void Fill(int pages)
    {
        const long page = ::sysconf(_SC_PAGESIZE);
        const std::string ballast(static_cast<size_t>(page), 'b');
        const int fd = ::open(ballast_.c_str(), O_WRONLY | O_CREAT | O_TRUNC | O_CLOEXEC, 0600);
        off_t size = 0;
        while (::write(fd, ballast.data(), ballast.size()) == page)
            size += page;
        ASSERT_EQ(::ftruncate(fd, size - pages * page), 0);
        ::close(fd);
    }

    const test::ScratchDir dir_;
    const std::string file_ = dir_ / "file", ballast_ = dir_ / "ballast";
    // Whole pages, so that one more byte needs one more page.
    const std::string text_ =
        kOldText + std::string(static_cast<size_t>(::sysconf(_SC_PAGESIZE)) * 2 - kOldText.size() - 1, '#') + "\n";
    bool mounted_ = false;
};

TEST_F(FullDisk, FailsEveryAppenderAndCreator)
{
    Fill(0);
    const char *file = file_.c_str();
    for (const test::Writer &writer : test::kAppenders) {
        EXPECT_LE(writer.write(file), 0) << writer.name;
        EXPECT_EQ(LastFault(), (Fault{ERR_WRITE_FAILED, writer.module}));
        EXPECT_EQ(test::ReadFile(file_), text_) << writer.name;
    }
    EXPECT_EQ(TLIBErrLogSet(file, "message"), -1);
    EXPECT_EQ(LastFault(), (Fault{ERR_WRITE_FAILED, "error_log_set", 52}));
    EXPECT_EQ(test::ReadFile(file_), text_);

    const std::string made = dir_ / "made";
    const test::Writer creators[] = {test::kRewriters[0], test::kRewriters[2], test::kAppenders[0],
                                     test::kAppenders[1]};
    for (const test::Writer &writer : creators) {
        EXPECT_LE(writer.write(made.c_str()), 0) << writer.name;
        EXPECT_EQ(LastFault(), (Fault{ERR_WRITE_FAILED, writer.module}));
        EXPECT_THAT(dir_.Names(), ElementsAre("ballast", "file")) << writer.name;
    }
    EXPECT_EQ(TAVOProcPidFileCreate(made.c_str()), -1);
    EXPECT_EQ(LastFault(), (Fault{ERR_WRITE_FAILED, "proc_pid_file_create"}));
    EXPECT_EQ(TLIBReadPidFile(made.c_str()), 0) << "half a number would be another process";
}

TEST_F(FullDisk, TakesBackHalfAnAppend)
{
    const std::string value(static_cast<size_t>(::sysconf(_SC_PAGESIZE)) + 100, 'v');
    for (const int free_pages : {0, 1}) {
        Fill(free_pages);
        EXPECT_EQ(TLIBFileAppendKey(file_.c_str(), "added", value.c_str(), nullptr), -1);
        EXPECT_EQ(LastFault(), (Fault{ERR_WRITE_FAILED, "file_append_key", 82}));
        EXPECT_EQ(test::ReadFile(file_), text_);
        EXPECT_EQ(TLIBFileSetKeyValue((dir_ / "made").c_str(), "added", value.c_str(), nullptr), -1);
        EXPECT_EQ(LastFault(), (Fault{ERR_WRITE_FAILED, "file_set_key_value"}));
        EXPECT_THAT(dir_.Names(), ElementsAre("ballast", "file"));
    }
}

}  // namespace
