// One open store: a btree file of Berkeley DB. Callers know its handle as TAVOBDB. Failures are returned as error
// codes, with the system's errno; nothing here sets the error state or logs.
#ifndef TAVO_ACCOUNT_DETAIL_BTREE_H
#define TAVO_ACCOUNT_DETAIL_BTREE_H

#include "tavo_bdb.h"

#include "account/detail/account_name.h"
#include "account/detail/store_view.h"
#include "core/detail/result.h"

#include <map>
#include <memory>
#include <set>
#include <string>
#include <string_view>

#include <sys/types.h>

namespace tavo {

class Btree : public TAVOBDB, public StoreView {
  public:
    // `mode` is given to a file that is created, and to any file when we are root; 0 leaves an existing file's alone.
    // The stores of the families have modes of their own, and what is not root's alone is not a store there.
    struct Options {
        int flags = 0;
        bool info = true;
        mode_t mode = 0;
    };

    // 0 and a handle, or an error code. A file that is not a store is gone after ERR_DB_OPEN.
    static Code Open(const char *path, const Options &options, std::unique_ptr<Btree> &out);

    // Creates a new store in a private folder. The file's mode is 0600.
    static Code Create(const char *path, std::unique_ptr<Btree> &out);

    // The store of a caller's handle: every TAVOBDB comes from Open.
    static Btree *Of(TAVOBDB *handle) { return static_cast<Btree *>(handle); }
    static const Btree *Of(const TAVOBDB *handle) { return static_cast<const Btree *>(handle); }

    ~Btree() override;  // without Close: something has failed, and a changed store is not sealed

    // The view stays valid until the next call on this handle. Absent: ERR_KEY_NOT_FOUND.
    Result<std::string_view> Get(std::string_view key) const override;
    Code Set(std::string_view key, std::string_view value);
    Code Delete(std::string_view key);

    // One step as nCursorType says; past the end: ERR_DB_END. `key` is read for TAVO_BDB_CURSOR_KEY.
    Code Step(bool skip_reserved, std::string_view &key, std::string_view &value);
    Code Walk(Entry which, std::string_view &key, std::string_view &value) override;

    // A 32-bit value of a reserved key. ERR_DB_CURSOR when it is there but not four bytes long.
    Code GetNumber(std::string_view key, int32_t &value) const;
    Code SetNumber(std::string_view key, int32_t value);

    // Takes over what the text files say by now, except for the keys that were stored or deleted through this handle,
    // and for domain accounts, which the text files do not have.
    Code TakeOver(const std::map<std::string, std::string, std::less<>> &entries, StoreContents contents);

    Code Flush();  // hands all pages to the file
    Code Close();  // Flush and release; ERR_DB_CLOSE or ERR_OUT_OF_MEMORY

    // The keys that were deleted through this handle and not stored again.
    const std::set<std::string, std::less<>> &Deleted() const { return deleted_; }

  private:
    Btree(const char *path, bool read_only) : TAVOBDB{nullptr, TAVO_BDB_CURSOR_NEXT}, path_(path), read_only_(read_only)
    {
    }
    bool NoteChange();  // false when nothing may be changed
    Code Put(std::string_view key, std::string_view value);
    Code Damaged(int code);

    Code CloseFile() noexcept;

    std::string path_;
    std::set<std::string, std::less<>> deleted_;
    std::set<std::string, std::less<>> touched_;
    bool read_only_;
    bool changed_ = false;
    bool damaged_ = false;  // by a change that failed, perhaps halfway
    bool sealed_ = false;   // before our first change, the seal beside the store held for this file
    std::string texts_;     // the state of the text files at that time
};

// The stored bytes of the reserved keys.
inline constexpr std::string_view kSyncTimeKey{TAVO_BDB_KEY_SYNC_TIME, TAVO_BDB_KEY_SYNC_TIME_LEN};
inline constexpr std::string_view kDeprecatedKey{TAVO_BDB_KEY_DEPRECATED, TAVO_BDB_KEY_DEPRECATED_LEN};
inline constexpr std::string_view kExpireKey{TAVO_BDB_KEY_EXPIRE, TAVO_BDB_KEY_EXPIRE_LEN};
inline constexpr std::string_view kCurrentUidKey{TAVO_BDB_KEY_UID, TAVO_BDB_KEY_UID_LEN};
inline constexpr std::string_view kCurrentGidKey{TAVO_BDB_KEY_GID, TAVO_BDB_KEY_GID_LEN};

static_assert(sizeof(TAVO_BDB_KEY_SYNC_TIME) == TAVO_BDB_KEY_SYNC_TIME_LEN + 1);
static_assert(sizeof(TAVO_BDB_KEY_DEPRECATED) == TAVO_BDB_KEY_DEPRECATED_LEN);
static_assert(sizeof(TAVO_BDB_KEY_EXPIRE) == TAVO_BDB_KEY_EXPIRE_LEN + 1);
static_assert(sizeof(TAVO_BDB_KEY_UID) == TAVO_BDB_KEY_UID_LEN + 1);
static_assert(sizeof(TAVO_BDB_KEY_GID) == TAVO_BDB_KEY_GID_LEN + 1);

}  // namespace tavo

#endif
