// Memory that runs out at any allocation: the code says so, nothing has changed, nothing is left allocated.
#include "support/failing_malloc.h"
#include "support/fault_state.h"
#include "support/scratch_dir.h"
#include "writers.h"

#include <gmock/gmock.h>

using test::kOldText;
using testing::ElementsAre;

namespace {

// Codes that mean it: a stream that finds no memory says that it could not be written.
const auto kNoMemory = testing::AnyOf(ERR_OUT_OF_MEMORY, ERR_WRITE_FAILED, ERR_OPEN_FAILED);

TEST(OutOfMemory, LeavesTheOldText)
{
    const test::ScratchDir dir;
    const std::string file = dir / "file";
    test::NewPairs();  // made before anything fails
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
            if (!faults.Fired()) {
                EXPECT_EQ(result, 1) << writer.name;
                continue;
            }
            if (result == 1) {  // it did without, as a stream does that only wanted to shrink its text
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

}  // namespace
