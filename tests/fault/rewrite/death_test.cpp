// A process that dies in the middle of a rewrite: the file is the old one or the new one.
#include "interposed_calls.h"
#include "support/test.h"
#include "writers.h"

using test::kOldText;

namespace {

int StatusOf(pid_t child)
{
    int status = 0;
    EXPECT_EQ(::waitpid(child, &status, 0), child);
    return status;
}

// Runs the writer in a child that dies at its n-th call; true when the child reached its end.
bool Survives(const test::Writer &writer, const std::string &path, int n)
{
    const pid_t child = ::fork();
    if (child == 0) {
        test::DieAtCall(n);
        ::_exit(writer.write(path.c_str()) == 1 ? 0 : 1);
    }
    const int status = StatusOf(child);
    EXPECT_TRUE(WIFEXITED(status) && (WEXITSTATUS(status) == 0 || WEXITSTATUS(status) == test::kDied)) << writer.name;
    return status == 0;
}

std::string TextAfter(const test::Writer &writer, const std::string &path)
{
    test::WriteFile(path, kOldText, 0640);
    EXPECT_EQ(writer.write(path.c_str()), 1) << writer.name;
    return test::ReadFile(path);
}

void DiesAtEveryCall(const test::Writer &writer, const std::string &parent)
{
    SCOPED_TRACE(writer.name + (" in " + parent));
    const test::Place dir(parent);
    const std::string file = dir / "file";
    const std::string new_text = TextAfter(writer, file);
    ASSERT_NE(new_text, kOldText);
    int n = 0, seen_new = 0;
    for (bool survived = false; !survived && n < 100;) {
        test::WriteFile(file, kOldText, 0640);
        ASSERT_EQ(::chown(file.c_str(), 0, 1), 0);
        survived = Survives(writer, file, ++n);
        const std::string text = test::ReadFile(file);
        EXPECT_TRUE(text == new_text || (text == kOldText && !survived)) << "at call " << n;
        seen_new += text == new_text;
        struct stat st;
        ASSERT_EQ(::stat(file.c_str(), &st), 0);
        EXPECT_EQ(st.st_mode & 07777, 0640u) << "at call " << n;
        EXPECT_EQ(st.st_gid, 1u) << "at call " << n;
    }
    EXPECT_EQ(n, 7) << "write, fchown, fchmod, fsync, rename, fsync of the directory, the end; also of many keys";
    EXPECT_EQ(seen_new, 2) << "after the rename";
    // The next rewrite removes the files of dead processes.
    EXPECT_EQ(TextAfter(writer, file), new_text);
    EXPECT_THAT(dir.Names(), testing::ElementsAre("file"));
}

TEST(Death, AtEveryCallOfARewriteLeavesTheOldOrTheNewFile)
{
    for (const std::string &parent : test::Parents()) {
        for (const test::Writer &writer : test::kRewriters)
            DiesAtEveryCall(writer, parent);
    }
}

// Beside the settings file are temporary files of other, living rewrites, and files of users.
TEST(Death, OnlyDeadTemporaryFilesOfTheSameTargetAreRemoved)
{
    const test::ScratchDir dir;
    const std::string file = dir / "file", other = dir / "file.conf";
    const std::vector<std::string> kept = {"file",        "file.backup", "file.conf",
                                           "file.000001", "file.AbC123", "file.dpkg-old"};
    for (const std::string &name : kept)
        test::WriteFile(dir / name, kOldText);
    // Several of both targets, because a dead file of the other one must stay.
    for (const std::string &target : {file, other}) {
        for (int i = 0; i < 3; ++i)
            EXPECT_FALSE(Survives(test::kRewriters[0], target, 4));
    }
    EXPECT_EQ(dir.Names().size(), kept.size() + 2) << "each has removed the one before";
    EXPECT_EQ(test::kRewriters[0].write(file.c_str()), 1);
    EXPECT_EQ(dir.Names().size(), kept.size() + 1);
    EXPECT_EQ(test::kRewriters[0].write(other.c_str()), 1);
    EXPECT_THAT(dir.Names(), testing::UnorderedElementsAreArray(kept));

    // A rewrite still in progress: stopped at its write.
    const pid_t child = ::fork();
    if (child == 0) {
        test::StopAtCall(1);
        ::_exit(test::kRewriters[0].write(file.c_str()) == 1 ? 0 : 1);
    }
    int status = 0;
    ASSERT_EQ(::waitpid(child, &status, WUNTRACED), child);
    ASSERT_TRUE(WIFSTOPPED(status));
    EXPECT_EQ(test::kRewriters[0].write(file.c_str()), 1);
    EXPECT_EQ(dir.Names().size(), kept.size() + 1) << "the living one's file is still there";
    ::kill(child, SIGCONT);
    EXPECT_EQ(StatusOf(child), 0);
    EXPECT_THAT(dir.Names(), testing::UnorderedElementsAreArray(kept));
}

TEST(Death, AtEveryCallOfAnAppendLeavesTheOldLines)
{
    const test::ScratchDir dir;
    const std::string file = dir / "file";
    for (const test::Writer &writer : test::kAppenders) {
        for (int n = 1;; ++n) {
            ASSERT_LT(n, 100);
            test::WriteFile(file, kOldText);
            if (Survives(writer, file, n)) {
                EXPECT_EQ(n, 3) << writer.name << ": write, fsync, the end";
                break;
            }
            EXPECT_TRUE(test::ReadFile(file).starts_with(kOldText)) << writer.name << " at call " << n;
            // A torn line ends where the next one begins.
            EXPECT_EQ(TLIBFileAppendKey(file.c_str(), "next", "1", nullptr), 1) << writer.name;
            EXPECT_EQ(BlTAVOFileCheckKeyValue(file.c_str(), "next", "1"), 1) << writer.name;
            EXPECT_EQ(BlTAVOFileCheckKeyValue(file.c_str(), "key", "old"), 1) << writer.name;
        }
    }
}

}  // namespace
