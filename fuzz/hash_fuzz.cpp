// Any sequence of hash operations does what it does to a map, and never leaves the counted bytes.
#include "tavo_hash.h"

#include "input.h"

#include <map>

using fuzz::Check;

namespace {

class Pair {
  public:
    ~Pair() { TLIBSzHashFree(hash_); }

    void Step(fuzz::Input &input)
    {
        const int operation = input.Byte() % 16;
        const std::string key = input.Text(operation < 8 ? 3 : 20);
        const std::string *known = Known(key);
        if (operation < 9) {
            const std::string value = input.Text(operation == 0 ? 200 : 10);
            Check(TLIBSzHashSetValue(&hash_, key.c_str(), value.c_str()) >= 0, "set");
            pairs_[key] = value;
        } else if (operation < 12) {
            const char *removed = SzTLIBSzHashRemoveKey(hash_, key.c_str());
            Check(known ? removed && *known == removed : !removed, "removed");
            pairs_.erase(key);
        } else if (operation == 12 && hash_->nStrSize < 1 << 20) {
            char *own = SzTLIBSzHashGetValue(hash_, key.c_str());
            if (own) {
                const std::string value = *known;
                Check(TLIBSzHashSetValue(&hash_, own, own) >= 0, "set by its own text");
                pairs_[value] = value;
            }
        } else if (operation == 13) {
            PslSzHashRemoveAll(hash_);
            pairs_.clear();
        } else if (operation == 14) {
            TLIBSZHASH *resized = PshTLIBIReSizeHash(hash_, 2 + input.Byte(), 256 * input.Byte());
            if (resized)
                hash_ = resized;
        }
        CheckKey(key);
    }

    void CheckAll() const
    {
        Check(hash_->nStrFree >= 0 && hash_->nPair == static_cast<int>(pairs_.size()), "counters");
        int present = 0;
        for (int slot = 0; slot < hash_->nSlot; ++slot)
            present += hash_->slots[slot].pszKey != nullptr;
        Check(present == hash_->nPair, "present");
        for (const auto &[key, value] : pairs_)
            CheckKey(key);
    }

  private:
    const std::string *Known(const std::string &key) const
    {
        const auto found = pairs_.find(key);
        return found == pairs_.end() ? nullptr : &found->second;
    }

    void CheckKey(const std::string &key) const
    {
        const std::string *known = Known(key);
        const char *value = SzTLIBSzHashGetValue(hash_, key.c_str());
        Check(known ? value && *known == value : !value, "value");
    }

    TLIBSZHASH *hash_ = PshTLIBSzHashAlloc(0);
    std::map<std::string, std::string> pairs_;
};

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const uint8_t *data, size_t size)
{
    fuzz::Input input(data, size);
    Pair pair;
    while (!input.Empty())
        pair.Step(input);
    pair.CheckAll();
    return 0;
}
