// Memory runs out at any allocation, where the table of calls in every_call/ does not look: new files, the lock of the
// system settings, and published log lines.
#include "tavo_lock.h"

#include "support/appliance_root.h"
#include "support/captured_log.h"
#include "support/failing_malloc.h"
#include "support/fault_state.h"
#include "support/scratch_dir.h"
#include "writers.h"

#include <gmock/gmock.h>

#include <algorithm>

#include <unistd.h>

using test::kOldText;

namespace {

// Codes for it: a stream that finds no memory reports a failed write.
const auto kNoMemory = testing::AnyOf(ERR_OUT_OF_MEMORY, ERR_WRITE_FAILED, ERR_OPEN_FAILED);

TEST(OutOfMemory, MakesNoFile)
{
    const test::ScratchDir dir;
    test::NewPairs();
    const std::string made = dir / "a name that is longer than what a string keeps within itself";
    const auto check = [&](const test::Writer &writer) {
        test::EachAllocation faults;
        while (faults.Next()) {
            ::unlink(made.c_str());
            test::ForgetFault();
            faults.Arm();
            const int result = writer.write(made.c_str());
            faults.Disarm();
            EXPECT_EQ(faults.LeftAllocated(), 0) << writer.name;
            EXPECT_TRUE(result == 1 || faults.Fired()) << writer.name;
            EXPECT_EQ(dir.Names().size(), result == 1 ? 1u : 0u) << writer.name << " allocation " << faults.Count();
            if (result != 1) {
                EXPECT_THAT(TLIBErrGet(), kNoMemory) << writer.name;
            }
        }
        EXPECT_GT(faults.Count(), 0) << writer.name;
    };
    for (const test::Writer &writer : {test::kRewriters[0], test::kRewriters[2]})
        check(writer);
    for (const test::Writer &writer : test::kAppenders)
        check(writer);
}

TEST(OutOfMemory, LeavesALogThatIsNotEmptied)
{
    const test::ScratchDir dir;
    const std::string file = dir / "a file whose name is longer than what a string keeps within itself";
    test::EachAllocation faults;
    while (faults.Next()) {
        test::WriteFile(file, "text");
        test::ForgetFault();
        faults.Arm();
        TLIBErrLogInitial(file.c_str());
        faults.Disarm();
        EXPECT_EQ(test::ReadFile(file), faults.Fired() ? "text" : "");
        EXPECT_EQ(TLIBErrGet(), ERR_SUCCESS);
    }
    EXPECT_GT(faults.Count(), 0);
}

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

TEST(OutOfMemory, OfTheSystemSettingsReleasesTheirLock)
{
    if (test::RootForm().empty())
        GTEST_SKIP() << "only in an appliance root";
    int failures = 0;
    test::EachAllocation faults;
    while (faults.Next()) {
        test::WriteFile("/etc/tavoinfo.conf", "runsamba=no\n");
        faults.Arm();
        const int result = TAVOINFOSetKeyValue("runsamba", "a value that is longer than what a string keeps");
        faults.Disarm();
        EXPECT_EQ(faults.LeftAllocated(), 0);
        EXPECT_EQ(rgslckList[0].pfLock, nullptr);
        EXPECT_TRUE(result == 1 || faults.Fired());
        if (result == 1)  // the lock is tried again, until there is memory for its stream
            continue;
        ++failures;
        EXPECT_EQ(result, -1);
        EXPECT_THAT(TLIBErrGet(), kNoMemory);
        EXPECT_EQ(test::ReadFile("/etc/tavoinfo.conf"), "runsamba=no\n");
    }
    EXPECT_GT(failures, 3);
}

// Support staff know these lines.
TEST(OutOfMemory, IsLoggedByTheFunctionsOfManyKeys)
{
    const test::ScratchDir dir;
    const std::string file = dir / "file";
    test::Pairs many;
    for (int i = 0; i < 100; ++i)
        many["key number " + std::to_string(i)] = "v";
    const test::StringHash pairs(many);
    TLIBSZLIST *wanted = PslTLIBSzListAlloc(0);
    ASSERT_EQ(TLIBSzHashEnumKey(pairs.Get(), &wanted), 100);
    test::WriteFile(file, "key number 1=old\n");

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
    logs(" PslTLIBSzListOr() failed!! tavoerr=[0x0200]", [&] {
        test::StringHash hash;
        return TLIBFileGetKeys(file.c_str(), wanted, hash.Addr(), "=");
    });
    logs(" TLIBSzHashEnumKey() failed!", [&] { return TLIBFileSetKeys(file.c_str(), pairs.Get(), nullptr); });
    TLIBSzListFree(wanted);
}

}  // namespace
