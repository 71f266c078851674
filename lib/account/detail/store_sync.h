// Keeps the database from syncing store files to disk.
#ifndef TAVO_ACCOUNT_DETAIL_STORE_SYNC_H
#define TAVO_ACCOUNT_DETAIL_STORE_SYNC_H

namespace tavo {

// The database syncs a store three times when it closes it. The stores are a cache under /tmp that is built anew after
// every start of the machine, so each of these waits for the disk would be for nothing. While one of these lives, the
// calling thread's syncs inside the database do nothing; other threads' go to disk as ever.
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
