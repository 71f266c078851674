// One locked use of the stores of an account family: take the locks, bring the stores up to date, open them, and, after
// a change, seal them again. Failures are returned as codes.
#ifndef TAVO_ACCOUNT_DETAIL_ACCOUNT_SESSION_H
#define TAVO_ACCOUNT_DETAIL_ACCOUNT_SESSION_H

#include "tavo_lock.h"

#include "account/detail/btree.h"
#include "account/detail/store_build.h"
#include "account/detail/system_lock.h"
#include "account/detail/text_stores.h"
#include "core/detail/result.h"

#include <memory>
#include <span>
#include <string>
#include <vector>

#include <unistd.h>

namespace tavo {

// What a change needs that may touch everything that knows accounts.
inline constexpr unsigned kAccountLocks = TAVO_LOCK_USER | TAVO_LOCK_GROUP | TAVO_LOCK_SMB;

class AccountSession {
  public:
    explicit AccountSession(const AccountKind &kind) : kind_(kind), is_root_(::geteuid() == 0) {}
    ~AccountSession();
    AccountSession(const AccountSession &) = delete;
    AccountSession &operator=(const AccountSession &) = delete;

    // Opens the stores of the family that `stores` lists, under the family's lock, shared. To rebuild them
    // it takes the lock exclusively, and keeps it. A program that is not root reads the text files instead, without any
    // lock. Returns 0, ERR_LOCK_FAILED, ERR_OPEN_FAILED, or a code of BuildStores or TextStores::Open.
    Code OpenToRead(std::span<const size_t> stores);

    // Takes `locks` and the system's lock exclusively and opens all stores. ERR_ACCESS_DENIED to all but root.
    Code OpenToChange(unsigned locks);
    Code LockToChange(unsigned locks);  // the two halves of it
    Code OpenAll();

    // To look things up in a store, and to change it.
    StoreView *View(size_t index) const { return is_root_ ? Store(index) : text_stores_.View(index); }
    Btree *Store(size_t index) const { return stores_[index].get(); }

    // Call it before the first change of a store: if the process dies between here and Seal, the stores are rebuilt.
    void BeginChange();

    // For accounts that this change does not touch the text files have precedence: takes over edits by other programs
    // since the stores were opened. Returns 0, ERR_READ_FAILED or a code of the stores.
    Code Merge();
    bool IsMerged() const;  // no text file has changed since

    // The text files at the end of a change: written from the stores, or, when nothing changed, the old ones.
    enum class Texts { written, as_before };

    // Closes the stores and seals them: they and the text files agree. ERR_DB_CLOSE when a store could not be written;
    // then it stays unsealed.
    Code Seal(Texts texts);

    // The same with the times of the files that were written from the stores.
    Code SealWritten();

    // Releases the locks; returns false when that failed. The destructor does the same.
    bool Unlock();

  private:
    Code Lock(unsigned locks, unsigned mode);
    Code Open(std::span<const size_t> stores);
    Code OpenSettled(std::span<const size_t> stores);
    bool IsCurrent() const;

    const AccountKind &kind_;
    const bool is_root_;
    TextStores text_stores_{kind_};
    unsigned locks_ = 0;
    SystemLock system_;
    std::vector<std::unique_ptr<Btree>> stores_;
    std::string texts_;  // the state of the text files from which the stores were built
};

}  // namespace tavo

#endif
