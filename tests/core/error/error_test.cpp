// The error state and the log file routines.
#include "tavo_error.h"

#include "support/test.h"
#include "support/text_lines.h"

namespace {

TEST(ErrorState, CodeAndSourceGoTogether)
{
    TLIBErrSetEx(ERR_BAD_PARAMETERS, "x", 7);
    EXPECT_EQ(test::LastFault(), (test::Fault{ERR_BAD_PARAMETERS, "x", 7}));
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

constexpr const char *kHeader =
#include "error_header.h"
    ;

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
    int in_header = 0;
    for (const std::string &line : test::Lines(kHeader)) {
        char name[64];
        int code = 0;
        // Codes that later releases added have no name.
        if (std::sscanf(line.c_str(), " %63[A-Z_] = %i", name, &code) == 2 && code / 0x100 < errNum &&
            *rgszErrMsg[code / 0x100]) {
            EXPECT_STREQ(rgszErrMsg[code / 0x100], name);
            ++in_header;
        }
    }
    EXPECT_EQ(in_header, named);
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

TEST(ErrorLogInitial, HasNoCode)
{
    test::ForgetFault();
    TLIBErrLogInitial(nullptr);
    TLIBErrLogInitial("/tmp");
    EXPECT_EQ(TLIBErrGet(), ERR_SUCCESS);
}

}  // namespace
