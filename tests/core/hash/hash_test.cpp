// Hashes: results, refusals and states of each function. The fuzzer's model, with random operations, checks sets and removals.
#include "tavo_hash.h"

#include "fuzz/hash_model.h"
#include "support/container_text.h"
#include "support/owned_container.h"
#include "support/rounds.h"
#include "support/test.h"

#include <climits>
#include <random>

using test::Hash;
using test::MakeHash;
using test::Moving;
using test::PairMap;
using test::Pairs;

namespace {

int SetValue(Hash &hash, const std::string &key, const std::string &value)
{
    return Moving(hash, [&](auto **addr) { return TLIBSzHashSetValue(addr, key.c_str(), value.c_str()); });
}

PairMap Numbered(int count)
{
    PairMap pairs;
    for (int i = 0; i < count; ++i)
        pairs["key number " + std::to_string(i)] = std::to_string(i * i);
    return pairs;
}

TEST(HashModel, AgreesAfterEachOperation)
{
    std::vector<uint8_t> bytes(static_cast<size_t>(test::Rounds(2'000'000)));
    std::generate(bytes.begin(), bytes.end(), std::mt19937(20261));
    fuzz::Input input(bytes.data(), bytes.size());
    fuzz::HashPair pair(input);
    while (!input.Empty())
        pair.Step();
    pair.CheckSlots();
}

TEST(HashCode, SumsLittleEndianWords)
{
    const struct {
        const char *key;
        int slots;
        int code;
    } rows[] = {
        {"", 31, 0},
        {"a", 31, 'a' % 31},
        {"ab", 1000003, 0x6261 % 1000003},
        {"abcd", INT_MAX, 0x64636261},
        {"abcde", 119, static_cast<int>((0x64636261U + 0x65U) % 119)},
        {"abcdefg", 471, static_cast<int>((0x64636261U + 0x676665U) % 471)},
        {"\xff\xff\xff\xff\xff\xff\xff\xff", 1879,
         static_cast<int>(0xfffffffeU % 1879)},  // wraps around, stays unsigned
        {"abcdwxyz", 7511, TLIBIRadixHashCode("wxyzabcd", 7511)},
        {nullptr, 31, -1},
        {"a", 0, -1},
    };
    for (const auto &row : rows)
        EXPECT_EQ(TLIBIRadixHashCode(row.key, row.slots), row.code) << (row.key ? row.key : "NULL");
}

// One growing value makes the area grow thirtyfold each time. This has to end in a refusal, not in an overflow.
TEST(HashSetValue, RefusesBeforeTheCountersOverflow)
{
    Hash hash(PshTLIBSzHashAlloc(1 << 26));
    EXPECT_GE(SetValue(hash, "k", "v"), 0);
    const std::string large(1 << 26, 'x');
    test::ForgetFault();
    EXPECT_EQ(SetValue(hash, "k", large), -1);
    EXPECT_EQ(SetValue(hash, "other", large), -1);
    EXPECT_EQ(TLIBErrGet(), ERR_SUCCESS);
    EXPECT_EQ(Pairs(hash.get()), (PairMap{{"k", "v"}}));
    EXPECT_EQ(hash->nStrSize, 1 << 26);
}

// Keys that all begin at one slot: the writing look-up returns removed pairs after the home slot only.
TEST(HashLookDict, WritingPrefersARemovedPairAfterHome)
{
    Hash hash(PshTLIBSzHashAlloc(512));
    const auto key = [](int i) {
        return std::string(1, static_cast<char>(1 + 31 * i));
    };  // "\x01", " ", "?", ...
    EXPECT_EQ(TLIBISetLookDict(hash.get(), key(0).c_str()), 1);
    EXPECT_EQ(SetValue(hash, key(0), "0"), 1);
    EXPECT_EQ(TLIBISetLookDict(hash.get(), key(0).c_str()), 1);
    EXPECT_EQ(TLIBISetLookDict(hash.get(), key(1).c_str()), -1) << "an unused slot after home is not offered";
    EXPECT_EQ(SetValue(hash, key(1), "1"), 2);
    EXPECT_EQ(SetValue(hash, key(2), "2"), 3);
    EXPECT_EQ(TLIBIGetLookDict(hash.get(), key(2).c_str()), 3);
    EXPECT_EQ(TLIBIGetLookDict(hash.get(), key(3).c_str()), -1);

    EXPECT_STREQ(SzTLIBSzHashRemoveKey(hash.get(), key(1).c_str()), "1");
    EXPECT_EQ(TLIBISetLookDict(hash.get(), key(3).c_str()), 2);
    EXPECT_EQ(TLIBISetLookDict(hash.get(), key(2).c_str()), 3) << "the key itself comes before a removed pair";
    EXPECT_EQ(TLIBIGetLookDict(hash.get(), key(2).c_str()), 3) << "reading passes over a removed pair";
    EXPECT_EQ(SetValue(hash, key(3), "3"), 2);

    EXPECT_STREQ(SzTLIBSzHashRemoveKey(hash.get(), key(0).c_str()), "0");
    EXPECT_EQ(TLIBISetLookDict(hash.get(), key(4).c_str()), -1) << "a removed pair at home is not offered";
    EXPECT_EQ(SetValue(hash, key(4), "4"), 1) << "but setting a value takes it";
    EXPECT_EQ(Pairs(hash.get()), (PairMap{{key(2), "2"}, {key(3), "3"}, {key(4), "4"}}));
}

// The end of a value from the hash may be stored again.
TEST(HashSetValue, TakesTheEndOfItsOwnString)
{
    Hash hash = MakeHash({{"tail", "abcdef"}});
    char *tail = SzTLIBSzHashGetValue(hash.get(), "tail");
    EXPECT_GE(Moving(hash, [&](auto **addr) { return TLIBSzHashSetValue(addr, "tail", tail + 2); }), 0);
    EXPECT_STREQ(SzTLIBSzHashGetValue(hash.get(), "tail"), "cdef");
}

TEST(HashEnumKey, ListsInSlotOrder)
{
    const Hash hash = MakeHash({{"c", "3"}, {"a", "1"}, {"B", "2"}, {"", "0"}});
    test::List list = test::MakeList({});
    EXPECT_EQ(Moving(list, [&](auto **addr) { return TLIBSzHashEnumKey(hash.get(), addr); }), 4);
    EXPECT_THAT(test::Items(list.get()), testing::ElementsAre("", "B", "a", "c"));
    EXPECT_EQ(TLIBSzHashEnumKey(hash.get(), nullptr), 4);
    EXPECT_EQ(TLIBSzHashGetLength(hash.get()), 4);
}

// The steps that callers may combine themselves.
TEST(HashSteps, WorkAlone)
{
    const PairMap pairs = Numbered(20);
    Hash hash = MakeHash(pairs);
    SzTLIBSzHashRemoveKey(hash.get(), "key number 7");
    PairMap left = pairs;
    left.erase("key number 7");

    Hash copy(PshTLIBIHashAllocator(40, 1000));
    EXPECT_EQ(TLIBICopyHash(copy.get(), hash.get()), 0);
    EXPECT_EQ(Pairs(copy.get()), left);
    EXPECT_EQ(TLIBICopyHash(copy.get(), hash.get()), -1) << "the keys are there already";
    const Hash small(PshTLIBIHashAllocator(40, 30));
    EXPECT_EQ(TLIBICopyHash(small.get(), hash.get()), -1);
    EXPECT_EQ(TLIBICopyHash(Hash(PshTLIBIHashAllocator(4, 30)).get(), MakeHash({{"", "x"}}).get()), 0)
        << "a pair of the first slot";

    EXPECT_EQ(PshTLIBIReSizeHash(hash.get(), 18, 1000), nullptr);
    EXPECT_EQ(PshTLIBIReSizeHash(hash.get(), 40, 100), nullptr);
    EXPECT_EQ(PshTLIBIReSizeHash(hash.get(), -1, 1000), nullptr);
    EXPECT_EQ(Pairs(hash.get()), left);
    hash.reset(PshTLIBIReSizeHash(hash.release(), 19, 1000));
    ASSERT_TRUE(hash);
    EXPECT_EQ(Pairs(hash.get()), left);
    EXPECT_EQ(hash->nStrSize, 1000);

    // A table without a free slot grows when a key is set.
    EXPECT_GE(SetValue(hash, "one more", "x"), 0);
    left["one more"] = "x";
    EXPECT_EQ(hash->nSlot, 4 * 19 - 5);
    EXPECT_EQ(Pairs(hash.get()), left);

    EXPECT_EQ(PshTLIBICheckSpace(hash.get(), 10), hash.get());
    int slot = -1;
    TLIBSZHASH *block = hash.release();
    EXPECT_EQ(PshTLIBIInsertNewPair(block, &slot, "one more", "y"), nullptr);
    EXPECT_EQ(PshTLIBIInsertNewPair(block, &slot, "and another", "z"), block);
    EXPECT_STREQ(block->slots[slot].pszValue, "z");
    EXPECT_EQ(TLIBIInsertPair(block, slot, "k", "v"), -1) << "the slot is taken";
    const int other = slot;
    slot = TLIBIGetLookDict(block, "one more");
    EXPECT_EQ(PshTLIBIUpdateValue(block, &slot, "one more", ""), block);
    EXPECT_STREQ(block->slots[slot].pszValue, "");
    slot = other;
    EXPECT_EQ(PshTLIBIUpdateValue(block, &slot, "one more", "x"), nullptr) << "the slot of another key";
    block = PshTLIBICheckSpace(block, 100000);
    hash.reset(block);
    EXPECT_GT(hash->nStrFree, 100000);
    EXPECT_STREQ(SzTLIBSzHashGetValue(hash.get(), "and another"), "z");
}

TEST(Hash, TinyTables)
{
    Hash none(PshTLIBIHashAllocator(0, 0));
    EXPECT_EQ(SetValue(none, "k", "v"), -1);
    EXPECT_EQ(SzTLIBSzHashGetValue(none.get(), "k"), nullptr);
    Hash one(PshTLIBIHashAllocator(1, 100));
    EXPECT_EQ(SetValue(one, "k", "v"), 0);
    EXPECT_EQ(SetValue(one, "l", "v"), -1) << "4 * 1 - 5 is not a number of slots";
    EXPECT_EQ(Pairs(one.get()), (PairMap{{"k", "v"}}));
    Hash two(PshTLIBIHashAllocator(2, 0));
    for (const char *key : {"a", "b", "c", "d", "e", "f"})
        EXPECT_GE(SetValue(two, key, key), 0);
    EXPECT_EQ(TLIBSzHashPairNum(two.get()), 6);
}

TEST(Hash, RefusesWithOrWithoutACode)
{
    const Hash hash = MakeHash({{"k", "v"}});
    TLIBSZHASH *addr = hash.get();
    TLIBSZLIST *no_list = nullptr;
    test::ForgetFault();
    EXPECT_EQ(SzTLIBSzHashGetValue(addr, "missing"), nullptr);
    EXPECT_EQ(TLIBIInsertPair(addr, addr->nSlot, "x", "y"), -1);
    PslSzHashRemoveAll(nullptr);
    TLIBSzHashFree(nullptr);
    TLIBIHashDump(nullptr);
    EXPECT_EQ(TLIBErrGet(), ERR_SUCCESS) << "none of these records a code";

    EXPECT_EQ(TLIBSzHashEnumKey(addr, &no_list), -1);
    EXPECT_EQ(test::LastFault(), (test::Fault{ERR_BAD_PARAMETERS, "list_insert", 131}));
    EXPECT_EQ(Pairs(hash.get()), (PairMap{{"k", "v"}}));
}

TEST(HashDump, ShowsPairsAndRemovedOnes)
{
    const Hash hash = MakeHash({{"a", "1"}, {"b", "2"}});
    SzTLIBSzHashRemoveKey(hash.get(), "b");
    testing::internal::CaptureStdout();
    TLIBIHashDump(hash.get());
    const std::string text = testing::internal::GetCapturedStdout();
    EXPECT_THAT(text, testing::HasSubstr("address \nslots[0] empty\n"));
    EXPECT_THAT(text, testing::HasSubstr("slots[4] a=1\nslots[5] removed\nslots[6] empty\n"));
    EXPECT_THAT(text, testing::HasSubstr("nStrSize =512 \t nStrFree =504 \t nSlot =31 \t nPair =1 \t"));
}

}  // namespace
