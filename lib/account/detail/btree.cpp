// Reads, changes, walks and closes one open store.
#include "account/detail/btree.h"

#include "account/detail/account_name.h"
#include "account/detail/store_seal.h"
#include "account/detail/store_sync.h"
#include "core/detail/extras.h"
#include "core/detail/owner.h"

#include <cstring>
#include <vector>

#include <db_185.h>

namespace tavo {
namespace {

DB *Handle(const TAVOBDB *store)
{
    return static_cast<DB *>(store->pDb);
}

DBT Item(std::string_view bytes)
{
    return {const_cast<char *>(bytes.data()), bytes.size()};
}

std::string_view Bytes(const DBT &item)
{
    return {static_cast<const char *>(item.data), item.size};
}

// The code of a failed call, by errno; `other` where the system's reason has no code of its own.
Code CodeOf(int reason, int other)
{
    switch (reason) {
    case EIO:
        return ERR_DISK_IO_FAILED;
    case EINTR:
        return ERR_DB_INTERRUPTED;
    case ENOSPC:
    case EDQUOT:
        return other == ERR_DB_CURSOR ? other : ERR_NOT_ENOUGH_SPACE;
    case ENOMEM:
        return ERR_OUT_OF_MEMORY;
    default:
        return other;
    }
}

unsigned SequenceFlag(int32_t cursor_type)
{
    switch (cursor_type) {
    case TAVO_BDB_CURSOR_KEY:
        return R_CURSOR;
    case TAVO_BDB_CURSOR_FIRST:
        return R_FIRST;
    case TAVO_BDB_CURSOR_LAST:
        return R_LAST;
    case TAVO_BDB_CURSOR_PREV:
        return R_PREV;
    default:
        return R_NEXT;
    }
}

}  // namespace

Btree::~Btree()
{
    KeepErrno keep;
    (void)CloseFile();
}

Result<std::string_view> Btree::Get(std::string_view key) const
{
    const DBT wanted = Item(key);
    DBT found = {};
    const int result = Handle(this)->get(Handle(this), &wanted, &found, 0);
    if (result != 0)
        return result > 0 ? Code(ERR_KEY_NOT_FOUND) : CodeOf(errno, ERR_DB_CURSOR);
    return Bytes(found);
}

Code Btree::Set(std::string_view key, std::string_view value)
{
    if (!NoteChange())
        return ERR_DB_STORE;
    if (const Code code = Put(key, value))
        return code;
    touched_.emplace(key);
    if (const auto gone = deleted_.find(key); gone != deleted_.end())
        deleted_.erase(gone);
    return 0;
}

Code Btree::Damaged(int code)
{
    damaged_ = true;
    return CodeOf(errno, code);
}

Code Btree::Put(std::string_view key, std::string_view value)
{
    DBT name = Item(key);
    const DBT content = Item(value);
    // Files of the first appliances had duplicate reserved keys; storing over one of them kept the other.
    if (key.starts_with('#') && Handle(this)->del(Handle(this), &name, 0) < 0)
        return Damaged(ERR_DB_STORE);
    if (Handle(this)->put(Handle(this), &name, &content, 0) != 0)
        return Damaged(ERR_DB_STORE);
    return 0;
}

Code Btree::TakeOver(const std::map<std::string, std::string, std::less<>> &entries, StoreContents contents)
{
    if (!NoteChange())
        return ERR_DB_STORE;
    std::vector<std::string> gone;
    std::string_view key;
    std::string_view value;
    Code code;
    for (Entry which = Entry::first; (code = Walk(which, key, value)) == 0; which = Entry::next)
        if (!entries.contains(key) && !touched_.contains(key) && !IsDomainEntry(key, value, contents))
            gone.emplace_back(key);
    if (code != ERR_DB_END)
        return code;
    for (const std::string &each : gone) {
        const DBT name = Item(each);
        if (Handle(this)->del(Handle(this), &name, 0) < 0)
            return Damaged(ERR_DB_DELETE);
    }
    for (const auto &[each, text] : entries) {
        if (touched_.contains(each))
            continue;
        const Result<std::string_view> stored = Get(each);
        code = stored.Failure().Renaming(ERR_KEY_NOT_FOUND, ERR_SUCCESS);
        if (code == 0 && (!stored || *stored != text))
            code = Put(each, text);
        if (code != 0)
            return code;
    }
    return 0;
}

Code Btree::Delete(std::string_view key)
{
    if (!NoteChange())
        return ERR_DB_DELETE;
    const DBT name = Item(key);
    const int result = Handle(this)->del(Handle(this), &name, 0);
    if (result != 0)
        return result > 0 ? ERR_KEY_NOT_FOUND : Damaged(ERR_DB_DELETE);
    deleted_.emplace(key);
    touched_.emplace(key);
    return 0;
}

Code Btree::Step(bool skip_reserved, std::string_view &key, std::string_view &value)
{
    for (;;) {
        const unsigned flag = SequenceFlag(nCursorType);
        DBT name = Item(key);
        DBT found = {};
        const int result = Handle(this)->seq(Handle(this), &name, &found, flag);
        if (result != 0)
            return result > 0 ? ERR_DB_END : CodeOf(errno, ERR_DB_CURSOR);
        if (!skip_reserved || flag == R_CURSOR || !Bytes(name).starts_with('#')) {
            key = Bytes(name);
            value = Bytes(found);
            return 0;
        }
        if (flag == R_FIRST)
            nCursorType = TAVO_BDB_CURSOR_NEXT;
        else if (flag == R_LAST)
            nCursorType = TAVO_BDB_CURSOR_PREV;
    }
}

Code Btree::Walk(Entry which, std::string_view &key, std::string_view &value)
{
    nCursorType = which == Entry::first ? TAVO_BDB_CURSOR_FIRST : TAVO_BDB_CURSOR_NEXT;
    return Step(true, key, value);
}

Code Btree::GetNumber(std::string_view key, int32_t &value) const
{
    const Result<std::string_view> bytes = Get(key);
    if (!bytes)
        return bytes.Failure();
    if (bytes->size() != sizeof value)
        return ERR_DB_CURSOR;
    std::memcpy(&value, bytes->data(), sizeof value);
    return 0;
}

Code Btree::SetNumber(std::string_view key, int32_t value)
{
    return Set(key, {reinterpret_cast<const char *>(&value), sizeof value});
}

Code Btree::Flush()
{
    const NoStoreSync no_sync;
    return Handle(this)->sync(Handle(this), 0) == 0 ? Code() : Damaged(ERR_DB_STORE);
}

Code Btree::Close()
{
    if (const Code code = CloseFile())
        return code;
    if (std::exchange(sealed_, false) && !damaged_)
        WriteSeal(*FamilyOfStore(path_.c_str()), texts_);
    return 0;
}

Code Btree::CloseFile() noexcept
{
    if (!pDb)
        return 0;
    const NoStoreSync no_sync;
    if (LoadExtras()->close_btree(std::exchange(pDb, nullptr)) == 0)
        return 0;
    return errno == ENOMEM ? ERR_OUT_OF_MEMORY : ERR_DB_CLOSE;
}

// A change through a caller's own handle keeps the stores sealed. (The account families remove and rewrite the seal
// themselves.)
bool Btree::NoteChange()
{
    if (read_only_) {
        errno = EPERM;  // the database would print that to standard error
        return false;
    }
    if (std::exchange(changed_, true))
        return true;
    const StoreFamily *family = FamilyOfStore(path_.c_str());
    if (family)
        texts_ = StampTexts(*family);
    sealed_ = family && SealHolds(*family);
    if (sealed_ && !damaged_)
        BreakSeal(*family);
    return true;
}

}  // namespace tavo
