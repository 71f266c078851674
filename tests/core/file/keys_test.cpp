// Many keys of a settings file at once.
#include "tavo_file.h"

#include "support/owned_container.h"
#include "support/test.h"

#include <malloc.h>

using test::HashOf;
using test::Owned;
using test::PairMap;
using test::Pairs;

namespace {

class KeysTest : public testing::Test {
  protected:
    KeysTest() { test::ForgetFault(); }

    const test::ScratchDir dir_;
    const std::string file_ = dir_ / "settings.conf";
    test::CapturedLog log_;
};

constexpr const char *kText = "a=1\n#a=0\nb = \"two words\"\nno sign\nempty=\na=3\n=c=4\n\"d\"=5\n";

TEST_F(KeysTest, WithoutWantedKeysTheLastLineCounts)
{
    test::WriteFile(file_, kText);
    Owned<TLIBSZHASH> hash = HashOf({{"kept", "yes"}});
    EXPECT_EQ(TLIBFileGetKeys(file_.c_str(), nullptr, hash, "="), 5);
    EXPECT_EQ(Pairs(hash), (PairMap{{"kept", "yes"}, {"a", "3"}, {"b", "two words"}, {"c", "4"}, {"d", "5"}}));
    Owned<TLIBSZHASH> same = HashOf({});
    EXPECT_EQ(TLIBFileGetKeys(file_.c_str(), test::ListOf({}), same, "="), 4);
}

TEST_F(KeysTest, OfWantedKeysTheFirstLineCounts)
{
    test::WriteFile(file_, kText);
    Owned<TLIBSZHASH> hash = HashOf({});
    EXPECT_EQ(TLIBFileGetKeys(file_.c_str(), test::ListOf({"d", "a", "a", "absent", "empty"}), hash, "="), 2);
    EXPECT_EQ(Pairs(hash), (PairMap{{"a", "1"}, {"d", "5"}}));
    EXPECT_EQ(TLIBErrGet(), ERR_SUCCESS);
}

TEST_F(KeysTest, SplitsAtOtherSeparators)
{
    test::WriteFile(file_, "nameserver 10.0.0.1\nnameserver\t10.0.0.2\nsearch  a.example b.example\n");
    Owned<TLIBSZHASH> hash = HashOf({});
    EXPECT_EQ(TLIBFileGetKeys(file_.c_str(), nullptr, hash, " \t"), 2);
    EXPECT_EQ(Pairs(hash), (PairMap{{"nameserver", "10.0.0.2"}, {"search", "a.example b.example"}}));
}

TEST_F(KeysTest, GetRefuses)
{
    Owned<TLIBSZHASH> hash = HashOf({});
    test::WriteFile(file_, kText);
    EXPECT_EQ(TLIBFileGetKeys((dir_ / "missing").c_str(), nullptr, hash, "="), -1);
    EXPECT_EQ(test::LastFault(), (test::Fault{ERR_OPEN_FAILED, "file_get_keys"}));
    EXPECT_EQ(Pairs(hash), PairMap{});
}

TEST_F(KeysTest, SetsEveryPairInOneRewrite)
{
    test::WriteFile(file_, "# head\nb=1\na=1\nother=x\nb=2\nlast=1");
    const PairMap pairs{{"a", "A"}, {"b", "B"}, {"new", "N"}};
    Owned<TLIBSZHASH> hash = HashOf(pairs);
    EXPECT_EQ(TLIBFileSetKeys(file_.c_str(), hash, nullptr), 1);
    EXPECT_EQ(test::ReadFile(file_), "# head\nb=B\na=A\nother=x\nlast=1\nnew=N\n");
    EXPECT_EQ(Pairs(hash), pairs) << "the caller's hash is not used up";
    EXPECT_EQ(TLIBFileSetKeys((dir_ / "made").c_str(), hash, "%s: %s\n"), 1);
    Owned<TLIBSZHASH> read = HashOf({});
    EXPECT_EQ(TLIBFileGetKeys((dir_ / "made").c_str(), nullptr, read, ":"), 3);
    EXPECT_EQ(Pairs(read), pairs);
    EXPECT_THAT(dir_.Names(), testing::ElementsAre("made", "settings.conf"));
}

TEST_F(KeysTest, SetsManyKeysOfAnyOrder)
{
    ::mallopt(M_PERTURB, 0x5A);  // new memory is not zero; the sanitizers fill it anyway
    PairMap pairs;
    std::string text, expected;
    for (int i = 0; i < 300; ++i) {
        const std::string key = "key" + std::to_string(i);
        pairs[key] = "new" + std::to_string(i);
        text += key + "=old\n";
        expected += key + "=" + pairs[key] + "\n";
    }
    test::WriteFile(file_, text);
    Owned<TLIBSZHASH> hash = HashOf(pairs);
    EXPECT_EQ(TLIBFileSetKeys(file_.c_str(), hash, nullptr), 1);
    EXPECT_EQ(test::ReadFile(file_), expected);
    ::mallopt(M_PERTURB, 0);
}

TEST_F(KeysTest, SetRefusesAndLogsTheLine)
{
    struct Row {
        PairMap pairs;
        const char *format;
        const char *logged;
    };
    const Row rows[] = {
        {{{"a", "1"}}, "%s\n", "TLIBILineKeyMoveHash2File() failed! szBuf=a, szFormat=%s\\x0A"},
        {{{"a", "1\n"}}, nullptr, "TLIBILineKeyMoveHash2File() failed! szBuf=a, szFormat=%s=%s\\x0A"},
        {{{"#a", "1"}}, nullptr, "TLIBILineKeyMoveHash2File() failed! szBuf=#a, szFormat=%s=%s\\x0A"},
    };
    test::WriteFile(file_, "a=0\n");
    for (const Row &row : rows) {
        log_.Clear();
        Owned<TLIBSZHASH> hash = HashOf(row.pairs);
        EXPECT_EQ(TLIBFileSetKeys(file_.c_str(), hash, row.format), -1);
        EXPECT_EQ(test::LastFault(), (test::Fault{ERR_BAD_PARAMETERS, "file_set_keys"}));
        ASSERT_EQ(log_.Texts().size(), 1u);
        EXPECT_THAT(log_.Texts()[0], testing::MatchesRegex("file_set_keys:[0-9]+ .*"));
        EXPECT_THAT(log_.Texts()[0], testing::EndsWith(row.logged));
    }
    EXPECT_EQ(test::ReadFile(file_), "a=0\n");
}

}  // namespace
