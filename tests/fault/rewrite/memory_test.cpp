// Memory runs out at any allocation: the code reports it, nothing has changed, nothing is left allocated.
#include "support/appliance_root.h"
#include "support/captured_log.h"
#include "support/descriptors.h"
#include "support/failing_malloc.h"
#include "support/fault_state.h"
#include "support/scratch_dir.h"
#include "tavo_lock.h"
#include "writers.h"

#include <gmock/gmock.h>

#include <algorithm>
#include <functional>

#include <unistd.h>

using test::kOldText;
using testing::ElementsAre;

namespace {

// Codes for it: a stream that finds no memory reports a failed write.
const auto kNoMemory = testing::AnyOf(ERR_OUT_OF_MEMORY, ERR_WRITE_FAILED, ERR_OPEN_FAILED);

TEST(OutOfMemory, LeavesTheOldText)
{
    const test::ScratchDir dir;
    const std::string file = dir / "file";
    test::NewPairs();  // made before anything fails
    const int descriptors = test::OpenDescriptors();
    const auto check = [&](const test::Writer &writer) {
        test::WriteFile(file, kOldText);
        EXPECT_EQ(writer.write(file.c_str()), 1) << writer.name;
        const std::string new_text = test::ReadFile(file);
        test::EachAllocation faults;
        while (faults.Next()) {
            test::WriteFile(file, kOldText);
            test::ForgetFault();
            faults.Arm();
            const int result = writer.write(file.c_str());
            faults.Disarm();
            EXPECT_EQ(faults.LeftAllocated(), 0) << writer.name;
            EXPECT_EQ(test::OpenDescriptors(), descriptors) << writer.name;
            if (!faults.Fired()) {
                EXPECT_EQ(result, 1) << writer.name;
                continue;
            }
            if (result == 1) {  // it succeeded without, like a stream that only wanted to shrink its text
                EXPECT_EQ(test::ReadFile(file), new_text) << writer.name << " allocation " << faults.Count();
                continue;
            }
            EXPECT_LE(result, 0) << writer.name << " allocation " << faults.Count();
            EXPECT_THAT(TLIBErrGet(), kNoMemory) << writer.name << " allocation " << faults.Count();
            EXPECT_EQ(test::ReadFile(file), kOldText) << writer.name;
            EXPECT_THAT(dir.Names(), ElementsAre("file")) << writer.name;
        }
        EXPECT_GT(faults.Count(), 0) << writer.name;
    };
    for (const test::Writer &writer : test::kRewriters)
        check(writer);
    for (const test::Writer &writer : test::kAppenders)
        check(writer);
}

TEST(OutOfMemory, FailsEveryReader)
{
    const test::ScratchDir dir;
    const std::string file = dir / "file";
    const char *path = file.c_str();
    const std::string value(1000, 'v');
    std::string text = "[net]\n";
    for (int i = 0; i < 40; ++i)
        text += "key" + std::to_string(i) + "=" + value + "\n[" + std::to_string(i) + "]\n";
    test::WriteFile(file, text + "[big]\nx=" + value + "\n");

    const auto check = [](const char *name, auto &&call) {
        const int descriptors = test::OpenDescriptors();
        test::EachAllocation faults;
        while (faults.Next()) {
            test::StringHash hash;
            TLIBSZLIST *list = PslTLIBSzListAlloc(0);
            test::ForgetFault();
            faults.Arm();
            const int result = call(hash.Addr(), &list);
            faults.Disarm();
            if (faults.Fired()) {
                EXPECT_LE(result, 0) << name;
                EXPECT_THAT(TLIBErrGet(), kNoMemory) << name;
            } else {
                EXPECT_GT(result, 0) << name;
            }
            TLIBSzListFree(list);
        }
        EXPECT_EQ(test::OpenDescriptors(), descriptors) << name;
        EXPECT_GT(faults.Count(), 0) << name;
    };
    check("GetKeyValue", [&](auto, auto) { return TLIBFileGetKeyValue(path, "key7", nullptr, 0, 0); });
    check("CheckKeyValue", [&](auto, auto) { return BlTAVOFileCheckKeyValue(path, "key7", value.c_str()); });
    check("GetLine", [&](auto, auto) { return TLIBFileGetLine(path, 2, nullptr, 0); });
    check("GetLineByKey", [&](auto, auto) { return TLIBFileGetLineByKey(path, "key7", nullptr, 0); });
    check("MatchLineNo", [&](auto, auto) { return TLIBFileMatchLineNo(path, "key7"); });
    check("GetKeys", [&](TLIBSZHASH **hash, auto) { return TLIBFileGetKeys(path, nullptr, hash, "="); });
    check("ReadLines", [&](auto, TLIBSZLIST **list) { return TLIBFileReadLines(path, list); });
    check("GetSection", [&](TLIBSZHASH **hash, auto) { return TLIBFileGetSection(path, "big", hash); });
    check("EnumSection", [&](auto, TLIBSZLIST **list) { return TLIBFileEnumSection(path, list); });
}

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

// Other functions of these families that allocate. Each returns 1 when it is done.
TEST(OutOfMemory, FailsTheRest)
{
    const test::ScratchDir dir;
    const std::string file = dir / "a file whose name is longer than what a string keeps within itself";
    const char *path = file.c_str();
    std::string name;
    FILE *stream = std::fopen((dir / "stream").c_str(), "we");
    std::setvbuf(stream, nullptr, _IONBF, 0);
    const test::StringHash &pairs = test::NewPairs();
    struct Row {
        const char *name;
        std::function<int()> call;
        test::Fault fault;
    };
    std::vector<Row> rows = {
        {"ErrLogSet",
         [&] { return TLIBErrLogSet(path, "a message that is longer than what a string keeps within itself") + 1; },
         {ERR_OUT_OF_MEMORY, "error_log_set"}},
        {"Touch", [&] { return TLIBFileTouch(path) + 1; }, {ERR_OUT_OF_MEMORY, "file_touch"}},
        {"TempFileOpen",
         [&] {
             FILE *temp = TLIBFileTempFileOpen(name.data());
             return temp ? (std::fclose(temp), ::unlink(name.c_str()), 1) : 0;
         },
         {ERR_OPEN_FAILED, "file_tempfile_open", 49}},
        {"CheckFormat",
         [&] { return TLIBIFileCheckFormat("%s                              =                      %s\n") + 1; },
         {ERR_OUT_OF_MEMORY, "file_check_format"}},
        {"Hash2File",
         [&] { return ErrTLIBIFileHash2File(stream, "section", pairs.Get(), nullptr) + 1; },
         {ERR_OUT_OF_MEMORY, "file_hash_2_file"}},
    };
    for (const Row &row : rows) {
        const int descriptors = test::OpenDescriptors();
        test::EachAllocation faults;
        while (faults.Next()) {
            ::unlink(path);
            name = dir / "temp.XXXXXX";
            ASSERT_EQ(::ftruncate(::fileno(stream), 0), 0);
            test::ForgetFault();
            faults.Arm();
            const int result = row.call();
            faults.Disarm();
            EXPECT_EQ(faults.LeftAllocated(), 0) << row.name;
            EXPECT_EQ(result, faults.Fired() ? 0 : 1) << row.name;
            EXPECT_EQ(test::LastFault(), faults.Fired() ? row.fault : test::Fault{}) << row.name;
            if (faults.Fired()) {
                EXPECT_THAT(dir.Names(), ElementsAre("stream")) << row.name;
                EXPECT_EQ(test::ReadFile(dir / "stream"), "") << row.name;
            }
        }
        EXPECT_EQ(test::OpenDescriptors(), descriptors) << row.name;
        EXPECT_GT(faults.Count(), 0) << row.name;
    }
    std::fclose(stream);

    // This one returns nothing, and a file that was not emptied is unchanged.
    test::EachAllocation faults;
    while (faults.Next()) {
        test::WriteFile(file, "text");
        test::ForgetFault();
        faults.Arm();
        TLIBErrLogInitial(path);
        faults.Disarm();
        EXPECT_EQ(test::ReadFile(file), faults.Fired() ? "text" : "");
        EXPECT_EQ(TLIBErrGet(), ERR_SUCCESS);
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
