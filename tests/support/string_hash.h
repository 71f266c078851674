// A string hash that a test fills and compares.
#ifndef TESTS_SUPPORT_STRING_HASH_H
#define TESTS_SUPPORT_STRING_HASH_H

#include "tavo_hash.h"

#include <gtest/gtest.h>

#include <map>
#include <string>
#include <vector>

namespace test {

using Pairs = std::map<std::string, std::string>;

class StringHash {
  public:
    StringHash() = default;
    explicit StringHash(const Pairs &pairs)
    {
        for (const auto &[key, value] : pairs)
            EXPECT_GE(TLIBSzHashSetValue(&hash_, key.c_str(), value.c_str()), 0);
    }
    ~StringHash() { TLIBSzHashFree(hash_); }
    StringHash(const StringHash &) = delete;
    StringHash &operator=(const StringHash &) = delete;

    TLIBSZHASH *Get() const { return hash_; }
    TLIBSZHASH **Addr() { return &hash_; }

    Pairs All() const
    {
        Pairs pairs;
        for (int i = 0; i < hash_->nSlot; ++i) {
            if (hash_->slots[i].pszKey)
                pairs[hash_->slots[i].pszKey] = hash_->slots[i].pszValue;
        }
        return pairs;
    }

    // In the format of a settings file, in slot order.
    std::string Text() const
    {
        std::string text;
        for (int i = 0; i < hash_->nSlot; ++i) {
            if (hash_->slots[i].pszKey)
                text += hash_->slots[i].pszKey + std::string("=") + hash_->slots[i].pszValue + "\n";
        }
        return text;
    }

  private:
    TLIBSZHASH *hash_ = PshTLIBSzHashAlloc(512);
};

}  // namespace test

#endif
