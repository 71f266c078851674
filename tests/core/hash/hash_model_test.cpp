// Random operations on a hash and on a plain model of its table, compared after each: slots, values, counters, growth.
#include "tavo_hash.h"

#include "support/container_text.h"
#include "support/test.h"

#include <random>

namespace {

constexpr int kOperations = 400000;

class Model {
  public:
    enum class State { unused, pair, removed };
    struct Slot {
        State state = State::unused;
        std::string key = {};
        std::string value = {};
    };

    std::vector<Slot> slots = std::vector<Slot>(31);
    int pairs = 0;
    int string_size;
    int string_free;

    explicit Model(int string_bytes) : string_size(string_bytes), string_free(string_bytes) {}

    int Find(const std::string &key) const
    {
        const size_t home = Home(key);
        for (size_t i = 0; i < slots.size(); ++i) {
            const size_t at = (home + i) % slots.size();
            if (slots[at].state == State::unused)
                return -1;
            if (slots[at].state == State::pair && slots[at].key == key)
                return static_cast<int>(at);
        }
        return -1;
    }

    // Where a missing key goes: home when unused; the first removed pair after home; home when removed; the first
    // unused slot.
    int FreeSlot(const std::string &key) const
    {
        const size_t home = Home(key);
        if (slots[home].state == State::unused)
            return static_cast<int>(home);
        int unused = -1;
        for (size_t i = 1; i < slots.size() && unused < 0; ++i) {
            const size_t at = (home + i) % slots.size();
            if (slots[at].state == State::removed)
                return static_cast<int>(at);
            if (slots[at].state == State::unused)
                unused = static_cast<int>(at);
        }
        return slots[home].state == State::removed ? static_cast<int>(home) : unused;
    }

    int Set(const std::string &key, const std::string &value)
    {
        int at = Find(key);
        if (at >= 0) {
            if (value.size() > slots[static_cast<size_t>(at)].value.size()) {
                const int bytes = static_cast<int>(value.size()) + 1;
                MakeRoom(bytes);
                string_free -= bytes;
                at = Find(key);
            }
            slots[static_cast<size_t>(at)].value = value;
            return at;
        }
        const int bytes = static_cast<int>(key.size() + value.size()) + 2;
        MakeRoom(bytes);
        string_free -= bytes;
        ++pairs;
        at = FreeSlot(key);
        slots[static_cast<size_t>(at)] = {State::pair, key, value};
        return at;
    }

    void Remove(int at)
    {
        slots[static_cast<size_t>(at)].state = State::removed;
        --pairs;
    }

  private:
    size_t Home(const std::string &key) const
    {
        uint32_t sum = 0;
        for (size_t i = 0; i < key.size(); ++i)
            sum += static_cast<uint32_t>(static_cast<unsigned char>(key[i])) << (8 * (i % 4));
        return sum % slots.size();
    }

    void MakeRoom(int bytes)
    {
        const int count = static_cast<int>(slots.size());
        const bool more_slots = 4 * (count - pairs) < count;
        const bool more_text = string_free <= bytes;
        if (more_text)
            string_size += (pairs ? string_size / pairs : bytes) * (count - pairs) + bytes;
        if (!more_slots && !more_text)
            return;
        std::vector<Slot> old(static_cast<size_t>(more_slots ? 4 * count - 5 : count));
        old.swap(slots);
        string_free = string_size;
        for (const Slot &slot : old) {
            if (slot.state != State::pair)
                continue;
            slots[static_cast<size_t>(FreeSlot(slot.key))] = slot;
            string_free -= static_cast<int>(slot.key.size() + slot.value.size()) + 2;
        }
    }
};

class Pair {
  public:
    explicit Pair(unsigned seed) : random_(seed) {}

    void Step()
    {
        const int operation = Any(100);
        const std::string key = "user" + std::to_string(Any(range_));
        const std::string value(static_cast<size_t>(Any(12)), static_cast<char>('a' + Any(26)));
        if (operation < 45) {
            const int expected = model_.Set(key, value);
            ASSERT_EQ(
                test::Moving(hash_, [&](auto **addr) { return TLIBSzHashSetValue(addr, key.c_str(), value.c_str()); }),
                expected);
        } else if (operation < 70) {
            const int at = model_.Find(key);
            const char *removed = SzTLIBSzHashRemoveKey(hash_.get(), key.c_str());
            ASSERT_EQ(removed ? removed : "none", at < 0 ? "none" : model_.slots[static_cast<size_t>(at)].value);
            if (at >= 0)
                model_.Remove(at);
        } else {
            const int at = model_.Find(key);
            ASSERT_EQ(TLIBIGetLookDict(hash_.get(), key.c_str()), at);
            const char *found = SzTLIBSzHashGetValue(hash_.get(), key.c_str());
            ASSERT_EQ(found ? found : "none", at < 0 ? "none" : model_.slots[static_cast<size_t>(at)].value);
        }
        if (Any(3000) == 0)
            Empties();
        if (Any(5000) == 0)
            StartAnew();
    }

    void CheckCounters() const
    {
        ASSERT_EQ(hash_->nPair, model_.pairs);
        ASSERT_EQ(hash_->nSlot, static_cast<int>(model_.slots.size()));
        ASSERT_EQ(hash_->nStrSize, model_.string_size);
        ASSERT_EQ(hash_->nStrFree, model_.string_free);
        ASSERT_EQ(reinterpret_cast<char *>(hash_->slots + hash_->nSlot) + (hash_->nStrSize - hash_->nStrFree),
                  hash_->pszNextStr);
    }

    void CheckSlots() const
    {
        for (size_t i = 0; i < model_.slots.size(); ++i) {
            const Model::Slot &slot = model_.slots[i];
            ASSERT_EQ(hash_->slots[i].pszKey != nullptr, slot.state == Model::State::pair) << i;
            ASSERT_EQ(hash_->slots[i].pszValue != nullptr, slot.state != Model::State::unused) << i;
            if (slot.state == Model::State::pair) {
                ASSERT_EQ(hash_->slots[i].pszKey, slot.key);
                ASSERT_EQ(hash_->slots[i].pszValue, slot.value);
            }
        }
    }

  private:
    int Any(int below) { return std::uniform_int_distribution(0, below - 1)(random_); }

    void Empties()
    {
        PslSzHashRemoveAll(hash_.get());
        for (Model::Slot &slot : model_.slots) {
            if (slot.state == Model::State::pair)
                slot.state = Model::State::removed;
        }
        model_.pairs = 0;
        model_.string_free = model_.string_size;
    }

    void StartAnew()
    {
        const int string_bytes = Any(2) ? 0 : Any(2000);
        range_ = Any(2) ? 40 : 2000;
        hash_.reset(PshTLIBSzHashAlloc(string_bytes));
        model_ = Model(string_bytes);
    }

    std::mt19937 random_;
    int range_ = 40;
    test::Hash hash_{PshTLIBSzHashAlloc(0)};
    Model model_{0};
};

TEST(HashModel, AgreesAtEveryStep)
{
    Pair pair(20261);
    for (int step = 0; step < kOperations && !testing::Test::HasFatalFailure(); ++step) {
        SCOPED_TRACE(step);
        pair.Step();
        pair.CheckCounters();
        if (step % 16 == 0)
            pair.CheckSlots();
    }
}

}  // namespace
