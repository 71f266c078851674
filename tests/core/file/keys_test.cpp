// Many keys of a settings file at once.
#include "tavo_file.h"

#include "core/file_story.h"
#include "support/owned_container.h"
#include "support/test.h"

#include <malloc.h>

using test::HashOf;
using test::Owned;
using test::PairMap;
using test::Pairs;

namespace {

class KeysTest : public test::FileStory {
  protected:
    void ShowPairs(const TLIBSZHASH *hash)
    {
        for (const auto &[key, value] : Pairs(hash))
            story_.Show(key, value);
    }
};

TEST_F(KeysTest, AreReadWithTheFirstOrTheLastValue)
{
    Before("a=1\n#a=0\nb = \"two words\"\nno sign\nempty=\na=3\n|=first slot\n=c=4\n\"d\"=5\n");
    Owned<TLIBSZHASH> last = HashOf({{"kept", "yes"}}), same = HashOf({}), first = HashOf({}), words = HashOf({});
    TELL(TLIBFileGetKeys(path_, nullptr, last, "="));
    ShowPairs(last);
    TELL(TLIBFileGetKeys(path_, test::ListOf({}), same, "="));
    TELL(TLIBFileGetKeys(path_, test::ListOf({"d", "a", "a", "absent", "empty"}), first, "="));
    ShowPairs(first);
    EDIT("nameserver 10.0.0.1\nnameserver\t10.0.0.2\nsearch  a.example b.example\n",
         TLIBFileGetKeys(path_, nullptr, words, " \t"));
    ShowPairs(words);
    TELL(TLIBFileGetKeys(missing_path_, nullptr, words, "="));
    EXPECT_EQ(Pairs(words).size(), 2u);
}

TEST_F(KeysTest, AreSetInOneRewrite)
{
    const PairMap pairs{{"a", "A"}, {"b", "B"}, {"|", "first slot"}, {"{", "last slot"}};
    Owned<TLIBSZHASH> hash = HashOf(pairs);
    EDIT("# head\nb=1\na=1\nother=x\nb=2\nlast=1", TLIBFileSetKeys(path_, hash, nullptr));
    TELL(TLIBFileSetKeys(missing_path_, hash, "%s: %s\n"));
    EXPECT_EQ(Pairs(hash), pairs) << "the caller's hash is not used up";
}

TEST_F(KeysTest, ManyAreSetInAnyOrder)
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
    EXPECT_EQ(TLIBFileSetKeys(path_, hash, nullptr), 1);
    EXPECT_EQ(test::ReadFile(file_), expected);
    ::mallopt(M_PERTURB, 0);
}

TEST_F(KeysTest, ThatCannotBeReadAgainAreRefused)
{
    EDIT("a=0\n", TLIBFileSetKeys(path_, HashOf({{"a", "1"}}), "%s\n"));
    TELL(TLIBFileSetKeys(path_, HashOf({{"a", "1\n"}}), nullptr));
    TELL(TLIBFileSetKeys(path_, HashOf({{"#a", "1"}}), nullptr));
}

}  // namespace
