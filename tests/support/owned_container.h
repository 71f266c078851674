// Lists and hashes as arguments of calls that may move them.
#ifndef TESTS_SUPPORT_OWNED_CONTAINER_H
#define TESTS_SUPPORT_OWNED_CONTAINER_H

#include "tavo_hash.h"
#include "tavo_list.h"

#include "support/container_text.h"
#include "support/test.h"

namespace test {

using PairMap = std::map<std::string, std::string>;

inline Hash MakeHash(const PairMap &pairs, int string_bytes = 512)
{
    Hash hash(PshTLIBSzHashAlloc(string_bytes));
    for (const auto &pair : pairs) {
        const char *key = pair.first.c_str(), *value = pair.second.c_str();
        EXPECT_GE(Moving(hash, [&](auto **addr) { return TLIBSzHashSetValue(addr, key, value); }), 0);
    }
    return hash;
}

// Becomes the container, or its address.
template <class T>
struct Owned {
    T *block;

    explicit Owned(std::unique_ptr<T, FreeContainer> container) : block(container.release()) {}
    ~Owned() { FreeContainer()(block); }
    Owned(const Owned &) = delete;
    Owned &operator=(const Owned &) = delete;

    operator T *() const { return block; }
    operator T **() { return &block; }
};

inline Owned<TLIBSZLIST> ListOf(const std::vector<std::string> &items, int mode = 0)
{
    return Owned(MakeList(items, mode));
}

inline Owned<TLIBSZHASH> HashOf(const PairMap &pairs)
{
    return Owned(MakeHash(pairs));
}

}  // namespace test

#endif
