// The library's containers with an owner.
#ifndef TAVOCTL_CONTAINERS_H
#define TAVOCTL_CONTAINERS_H

#include "tavo_hash.h"
#include "tavo_list.h"

#include <string>
#include <utility>
#include <vector>

namespace tavoctl {

// Deletes by a function of a library: std::unique_ptr<RAIDINFO, By<RAIDInfoFree>>.
template <auto release>
struct By {
    void operator()(auto *held) const { release(held); }
};

// A list that functions fill through Address(), since it may move.
class StringList {
  public:
    StringList();
    explicit StringList(const std::vector<std::string> &items);
    ~StringList() { TLIBSzListFree(list_); }
    StringList(const StringList &) = delete;
    StringList &operator=(const StringList &) = delete;

    TLIBSZLIST **Address() { return &list_; }
    const TLIBSZLIST *Get() const { return list_; }
    void Push(const std::string &item);
    std::vector<std::string> Items() const;

  private:
    TLIBSZLIST *list_;
};

class StringHash {
  public:
    StringHash();
    ~StringHash() { TLIBSzHashFree(hash_); }
    StringHash(const StringHash &) = delete;
    StringHash &operator=(const StringHash &) = delete;

    TLIBSZHASH **Address() { return &hash_; }
    const TLIBSZHASH *Get() const { return hash_; }
    void Set(const std::string &key, const std::string &value);
    const char *Find(const std::string &key) const { return SzTLIBSzHashGetValue(hash_, key.c_str()); }
    // Sorted by key: the order of the slots says nothing to people.
    std::vector<std::pair<std::string, std::string>> Pairs() const;

  private:
    TLIBSZHASH *hash_;
};

}  // namespace tavoctl

#endif
