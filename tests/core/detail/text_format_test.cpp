// Log lines: formats with typed arguments. No argument can break out of its line.
#include "core/detail/log.h"
#include "support/test.h"

namespace {

std::string Logged(const char *format, std::initializer_list<tavo::TextArg> args)
{
    test::CapturedLog log;
    tavo::WriteLog(LOG_ERR, format, args);
    return log.Lines().size() == 1 ? log.Lines()[0].text : "not one line";
}

TEST(FormatText, WritesLikePrintf)
{
    EXPECT_EQ(Logged("%s:%d errno=0x%X.\n", {"list_alloc", 42, 0x0D00}), "list_alloc:42 errno=0xD00.\n");
    EXPECT_EQ(Logged("tavoerr=[0x%04X]", {0x200}), "tavoerr=[0x0200]");
    EXPECT_EQ(Logged("%X %u %lld %5d|%05d", {-1, -1, -5000000000LL, 42, -42}),
              "FFFFFFFF 4294967295 -5000000000    42|-0042");
    EXPECT_EQ(Logged("%c 100%% %d", {'x', "text"}), "x 100% text") << "the argument's type decides";
    EXPECT_EQ(Logged("%s %s %q %", {nullptr}), "(null) %s %q %") << "what cannot be filled stays as it is";
}

TEST(WriteLog, KeepsArgumentsInTheirLine)
{
    EXPECT_EQ(Logged("name=%s\n", {"a\nb\x1b[0m\x7f"}), "name=a\\x0Ab\\x1B[0m\\x7F\n");
    EXPECT_EQ(Logged("%s", {"\xC2\x85|\xC3\xA9|\xC2\xA0"}), "\\xC2\\x85|\xC3\xA9|\xC2\xA0") << "C1 out, letters stay";
    EXPECT_EQ(Logged("%s", {std::string(5000, 'x')}).size(), 1023u);
    errno = EBADF;
    Logged("%s", {"x"});
    EXPECT_EQ(errno, EBADF);
}

TEST(LogError, BeginsWithModuleAndLine)
{
    // This file is not part of the library.
    test::CapturedLog log;
    LogError({"%s:%d Parameter error", 37});
    LogDebug("%s:%d here");
    ASSERT_EQ(log.Lines().size(), 2u);
    EXPECT_EQ(log.Lines()[0], (test::LoggedLine{LOG_ERR, "unknown:37 Parameter error"}));
    EXPECT_EQ(log.Lines()[1], (test::LoggedLine{LOG_DEBUG, "unknown:" + std::to_string(__LINE__ - 3) + " here"}));
}

}  // namespace
