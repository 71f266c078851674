// The content of the stores of users or groups while it is made from the text files.
#ifndef TAVO_ACCOUNT_DETAIL_ACCOUNT_ENTRIES_H
#define TAVO_ACCOUNT_DETAIL_ACCOUNT_ENTRIES_H

#include "account/detail/id_index.h"
#include "account/detail/store_build.h"

namespace tavo {

class AccountEntries {
  public:
    AccountEntries(const AccountKind &kind, const IdRange &ids)
        : kind_(kind), ids_(ids), highest_(ids.first - 1), stores_(kind.family.stores.size())
    {
    }

    // The key that an account gets; empty when its name exists already.
    std::optional<std::string> KeyFor(std::string_view name) const;

    // Stores an account's line under its key, and the key under the id; of two accounts with one id the first is found
    // by it.
    void AddAccount(const std::string &key, const std::string &name, int32_t id, std::string_view line);

    // Stores a line of another file, "NAME:...". The first of an account wins; one without an account is dropped.
    void AddLine(size_t store, std::string_view line);

    // The id assigned last is the recorded one, otherwise the highest that an account has.
    void SetLastId(std::optional<int32_t> recorded);

    std::vector<StoreEntries> Take() { return std::move(stores_); }

  private:
    const AccountKind &kind_;
    const IdRange &ids_;
    int32_t highest_;
    std::vector<StoreEntries> stores_;
    std::map<std::string, std::string, std::less<>> keys_;  // by name, spelled as in the file of the accounts
};

}  // namespace tavo

#endif
