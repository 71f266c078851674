// Keeps the database from syncing store files to disk.
#ifndef TAVO_ACCOUNT_DETAIL_STORE_SYNC_H
#define TAVO_ACCOUNT_DETAIL_STORE_SYNC_H

namespace tavo {

// The database syncs a store three times when it closes it. The stores are a cache under /tmp that is rebuilt after
// every start of the machine, so syncing them is wasted work. While this object exists, the calling thread's syncs
// inside the database do nothing; other threads' syncs work as usual.
class NoStoreSync {
  public:
    NoStoreSync() noexcept;
    ~NoStoreSync();
    NoStoreSync(const NoStoreSync &) = delete;
    NoStoreSync &operator=(const NoStoreSync &) = delete;

  private:
    bool outermost_;
};

}  // namespace tavo

#endif
