// Memory runs out at any allocation: a published line, and published log lines, which every_call/ does not look at.
#include "tavo_file.h"

#include "support/failing_malloc.h"
#include "support/owned_container.h"
#include "support/test.h"

namespace {

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

}  // namespace
