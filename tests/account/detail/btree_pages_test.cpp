// What is found in the pages of a store is what the database finds there, and damage is never mistaken for an answer.
#include "account/detail/btree_pages.h"

#include "account/detail/btree.h"
#include "support/rounds.h"
#include "support/scratch_dir.h"

#include <gtest/gtest.h>

#include <random>

#include <fcntl.h>

namespace {

using tavo::Btree;
using tavo::BtreePages;
using Found = BtreePages::Found;

std::string RandomText(std::mt19937 &random, size_t least, size_t most)
{
    std::string text(least + random() % (most - least + 1), '\0');
    for (char &byte : text)
        byte = static_cast<char>(random() % 3 == 0 ? random() : 'A' + random() % 4);
    return text;
}

std::unique_ptr<Btree> OpenStore(const std::string &path, int flags)
{
    std::unique_ptr<Btree> store;
    EXPECT_EQ(Btree::Open(path.c_str(), {flags, true, 0}, store), 0);
    return store;
}

// Short and long keys and values, of which some are longer than a page holds, and a third is deleted again.
std::vector<std::string> FillStore(const std::string &path, std::mt19937 &random, int entries)
{
    const auto store = OpenStore(path, O_RDWR | O_CREAT);
    std::vector<std::string> keys;
    for (int i = 0; i < entries; ++i) {
        keys.push_back(RandomText(random, 1, random() % 50 == 0 ? 3000 : 40));
        EXPECT_EQ(store->Set(keys.back(), RandomText(random, 0, random() % 20 == 0 ? 9000 : 200)), 0);
    }
    for (size_t i = 0; i < keys.size(); i += 3)
        store->Delete(keys[i]);
    EXPECT_EQ(store->Close(), 0);
    return keys;
}

TEST(BtreePages, FindWhatTheDatabaseFinds)
{
    std::mt19937 random(3);
    const test::ScratchDir dir;
    int found = 0;
    int missed = 0;
    int asked = 0;
    for (const int entries : {0, 1, 2, 20, 400, 6000}) {
        const std::string path = dir / std::to_string(entries);
        auto keys = FillStore(path, random, entries);
        for (int i = 0; i < entries + 10; ++i)
            keys.push_back(RandomText(random, 0, 6));
        const auto store = OpenStore(path, O_RDONLY);
        BtreePages pages;
        ASSERT_TRUE(pages.Open(path.c_str()));
        for (const std::string &key : keys) {
            std::string_view expected;
            const int code = store->Get(key, expected);
            std::string value;
            switch (pages.Find(key, value)) {
            case Found::kYes:
                ++found;
                ASSERT_EQ(code, 0);
                ASSERT_EQ(value, expected);
                break;
            case Found::kNo:
                ++missed;
                ASSERT_EQ(code, ERR_KEY_NOT_FOUND);
                break;
            default:
                ++asked;
            }
        }
    }
    EXPECT_GT(found, 3000);
    EXPECT_GT(missed, 3000);
    EXPECT_GT(asked, 10);
    EXPECT_LT(asked, found);
}

// A handle to find with gives the long values, too, and walks.
TEST(BtreePages, AHandleAsksTheDatabaseForTheRest)
{
    const test::ScratchDir dir;
    const std::string path = dir / "store";
    const std::string large(20000, 'x');
    {
        const auto store = OpenStore(path, O_RDWR | O_CREAT);
        ASSERT_EQ(store->Set("large", large), 0);
        ASSERT_EQ(store->Set("small", "1"), 0);
    }
    std::unique_ptr<Btree> store;
    ASSERT_EQ(Btree::OpenToFind(path.c_str(), store), 0);
    std::string_view key;
    std::string_view value;
    EXPECT_EQ(store->Get("small", value), 0);
    EXPECT_EQ(value, "1");
    EXPECT_FALSE(store->pDb);
    EXPECT_EQ(store->Get("large", value), 0);
    EXPECT_EQ(value, large);
    EXPECT_EQ(store->Get("none", value), ERR_KEY_NOT_FOUND);
    EXPECT_EQ(store->Set("small", "2"), ERR_DB_STORE);
    ASSERT_EQ(Btree::OpenToFind(path.c_str(), store), 0);
    EXPECT_EQ(store->Step(true, key, value), 0);
    EXPECT_EQ(key, "large");
    EXPECT_EQ(Btree::OpenToFind((dir / "none").c_str(), store), ERR_OPEN_FAILED);
    test::WriteFile(dir / "foreign", std::string(8192, 'x'));
    EXPECT_EQ(Btree::OpenToFind((dir / "foreign").c_str(), store), ERR_OPEN_FAILED);
}

// Any byte of it may be another one: there is an answer, and nothing is read where there is nothing.
TEST(BtreePages, DamageIsSurvived)
{
    std::mt19937 random(5);
    const test::ScratchDir dir;
    const auto keys = FillStore(dir / "whole", random, 300);
    const std::string whole = test::ReadFile(dir / "whole");
    for (int round = 0; round < test::Rounds(8000); ++round) {
        std::string damaged = whole;
        for (unsigned i = 0; i < 1 + random() % 20; ++i) {
            const size_t page = random() % (whole.size() / 4096) * 4096;
            damaged[page + random() % (random() % 2 ? 64 : 4096)] = static_cast<char>(random());
        }
        if (random() % 4 == 0)
            damaged.resize(random() % damaged.size());
        test::WriteFile(dir / "damaged", damaged);
        BtreePages pages;
        if (!pages.Open((dir / "damaged").c_str()))
            continue;
        std::string value;
        for (size_t i = 0; i < keys.size(); i += 7)
            ASSERT_TRUE(pages.Find(keys[i], value) != Found::kYes || value.size() < 65536);
    }
}

}  // namespace
