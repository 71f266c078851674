// Any sequence of hash operations does what it does to a plain model of the table: slots, values, counters, growth. The
// fuzzer takes the operations from its inputs, the tests from random bytes.
#ifndef FUZZ_HASH_MODEL_H
#define FUZZ_HASH_MODEL_H

#include "tavo_hash.h"

#include "input.h"

#include <string>
#include <vector>

namespace fuzz {

// The expected table; counts bytes as the appliance does.
class HashModel {
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

    explicit HashModel(int string_bytes) : string_size(string_bytes), string_free(string_bytes) {}

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
                TakeBytes(static_cast<int>(value.size()) + 1);
                at = Find(key);
            }
            slots[static_cast<size_t>(at)].value = value;
            return at;
        }
        TakeBytes(static_cast<int>(key.size() + value.size()) + 2);
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

    void Empty()
    {
        for (Slot &slot : slots) {
            if (slot.state == State::pair)
                slot.state = State::removed;
        }
        pairs = 0;
        string_free = string_size;
    }

    // A new table of so many slots and bytes, with the pairs in the order of their old slots.
    void Move(size_t count, int string_bytes)
    {
        std::vector<Slot> old(count);
        old.swap(slots);
        string_free = string_size = string_bytes;
        for (const Slot &slot : old) {
            if (slot.state != State::pair)
                continue;
            slots[static_cast<size_t>(FreeSlot(slot.key))] = slot;
            string_free -= static_cast<int>(slot.key.size() + slot.value.size()) + 2;
        }
    }

  private:
    size_t Home(const std::string &key) const
    {
        uint32_t sum = 0;
        for (size_t i = 0; i < key.size(); ++i)
            sum += static_cast<uint32_t>(static_cast<unsigned char>(key[i])) << (8 * (i % 4));
        return sum % slots.size();
    }

    void TakeBytes(int bytes)
    {
        const int count = static_cast<int>(slots.size());
        const bool more_slots = 4 * (count - pairs) < count;
        const bool more_text = string_free <= bytes;
        if (more_slots || more_text)
            Move(static_cast<size_t>(more_slots ? 4 * count - 5 : count),
                 string_size + (more_text ? (pairs ? string_size / pairs : bytes) * (count - pairs) + bytes : 0));
        string_free -= bytes;
    }
};

// A hash and its model.
class HashPair {
  public:
    explicit HashPair(Input &input) : input_(input) {}
    ~HashPair() { TLIBSzHashFree(hash_); }
    HashPair(const HashPair &) = delete;
    HashPair &operator=(const HashPair &) = delete;

    void Step()
    {
        const int operation = input_.Byte();
        const std::string key = "user" + std::to_string(Any(range_));
        const int at = model_.Find(key);
        const std::string known = at < 0 ? "" : model_.slots[static_cast<size_t>(at)].value;
        if (operation < 110) {
            const std::string value(input_.Byte() % 12, static_cast<char>('a' + input_.Byte() % 26));
            const int expected = model_.Set(key, value);
            Check(TLIBSzHashSetValue(&hash_, key.c_str(), value.c_str()) == expected, "set");
        } else if (operation < 175) {
            const char *removed = SzTLIBSzHashRemoveKey(hash_, key.c_str());
            Check(at < 0 ? !removed : removed && removed == known, "removed");
            if (at >= 0)
                model_.Remove(at);
        } else if (operation < 180 && at >= 0 && model_.string_size < 1 << 20) {
            char *own = SzTLIBSzHashGetValue(hash_, key.c_str());
            const int expected = model_.Set(known, known);
            Check(TLIBSzHashSetValue(&hash_, own, own) == expected, "set by its own text");
        } else if (operation < 182 && Any(8) == 0) {
            Resizes();
        } else {
            Check(TLIBIGetLookDict(hash_, key.c_str()) == at, "slot");
            const char *found = SzTLIBSzHashGetValue(hash_, key.c_str());
            Check(at < 0 ? !found : found && found == known, "value");
        }
        if (operation == 255) {
            const int string_bytes = Any(2) ? 0 : Any(2000);
            switch (Any(30)) {
            case 0:
            case 1:
                PslSzHashRemoveAll(hash_);
                model_.Empty();
                break;
            case 2:
                range_ = Any(2) ? 40 : 2000;
                TLIBSzHashFree(hash_);
                hash_ = PshTLIBSzHashAlloc(string_bytes);
                model_ = HashModel(string_bytes);
            }
        }
        CheckCounters();
        if (operation % 16 == 0)
            CheckSlots();
    }

    void CheckSlots() const
    {
        for (size_t i = 0; i < model_.slots.size(); ++i) {
            const HashModel::Slot &slot = model_.slots[i];
            const TLIBSZHASHSLOT &found = hash_->slots[i];
            Check((found.pszKey != nullptr) == (slot.state == HashModel::State::pair), "key of a slot");
            Check((found.pszValue != nullptr) == (slot.state != HashModel::State::unused), "value of a slot");
            if (slot.state == HashModel::State::pair)
                Check(found.pszKey == slot.key && found.pszValue == slot.value, "pair of a slot");
        }
    }

  private:
    int Any(int below) { return (input_.Byte() + (below > 256 ? 256 * input_.Byte() : 0)) % below; }

    void Resizes()
    {
        const int slots = 2 + Any(256), bytes = 256 * Any(256);
        TLIBSZHASH *resized = PshTLIBIReSizeHash(hash_, slots, bytes);
        if (!resized)
            return;
        hash_ = resized;
        model_.Move(static_cast<size_t>(slots), bytes);
    }

    void CheckCounters() const
    {
        Check(hash_->nPair == model_.pairs, "pairs");
        Check(hash_->nSlot == static_cast<int>(model_.slots.size()), "slots");
        Check(hash_->nStrSize == model_.string_size && hash_->nStrFree == model_.string_free, "bytes");
        Check(reinterpret_cast<char *>(hash_->slots + hash_->nSlot) + (hash_->nStrSize - hash_->nStrFree) ==
                  hash_->pszNextStr,
              "the place of the next text");
    }

    Input &input_;
    int range_ = 40;
    TLIBSZHASH *hash_ = PshTLIBSzHashAlloc(0);
    HashModel model_{0};
};

}  // namespace fuzz

#endif
