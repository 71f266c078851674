// The stores of a family as the text files give them, for programs without root's rights: they take no lock and open no
// store. The files are replaced by one rename each, so such a program sees the old or the new text.
#ifndef TAVO_ACCOUNT_DETAIL_TEXT_STORES_H
#define TAVO_ACCOUNT_DETAIL_TEXT_STORES_H

#include "account/detail/store_build.h"
#include "account/detail/store_view.h"
#include "core/detail/result.h"

#include <memory>
#include <span>
#include <string>
#include <vector>

namespace tavo {

class TextStores {
  public:
    explicit TextStores(const AccountKind &kind) : kind_(kind) {}

    // Reads the files of these stores, and the one that says which accounts there are. A store of secrets can be
    // requested; look-ups in it then fail with ERR_ACCESS_DENIED. 0, ERR_ACCESS_DENIED or ERR_READ_FAILED.
    Code Open(std::span<const size_t> stores);

    StoreView *View(size_t index) const { return views_[index].get(); }

  private:
    class Lines;

    // The entries of the accounts of this key alone: a look-up reads the files once and parses next to nothing.
    std::vector<StoreEntries> EntriesOf(std::string_view key) const;
    const StoreEntries &All(size_t index);

    const AccountKind &kind_;
    std::vector<std::string> texts_;
    std::vector<StoreEntries> all_;
    std::vector<std::unique_ptr<StoreView>> views_;
};

}  // namespace tavo

#endif
