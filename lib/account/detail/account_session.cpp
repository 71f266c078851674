// One locked use of the stores of an account family.
#include "account/detail/account_session.h"

#include "account/detail/family_dump.h"
#include "account/detail/store_seal.h"
#include "core/detail/extras.h"
#include "core/detail/keep_fault.h"
#include "core/detail/owner.h"

#include <numeric>
#include <utility>

#include <fcntl.h>
#include <sys/stat.h>

namespace tavo {
namespace {

constexpr int kLockSeconds = 5;

}  // namespace

AccountSession::~AccountSession()
{
    KeepErrno keep;
    const KeepFault keep_fault;  // of closing the stores, too
    stores_.clear();
    Unlock();
}

Code AccountSession::OpenToRead(std::span<const size_t> stores)
{
    if (!is_root_)
        return text_stores_.Open(stores);
    if (!LoadExtras())
        return ERR_OPEN_FAILED;
    if (const Code code = Lock(kind_.lock, TAVO_LOCK_SHARED))
        return code;
    if (SealHolds(kind_.family) && Open(stores) == 0 && IsCurrent())
        return 0;
    stores_.clear();
    Unlock();
    if (const Code code = Lock(kind_.lock, TAVO_LOCK_EXCLUSIVE))
        return code;
    const Code code = OpenSettled(stores);
    system_.Release();
    return code;
}

Code AccountSession::OpenToChange(unsigned locks)
{
    const Code code = LockToChange(locks);
    return code != 0 ? code : OpenAll();
}

Code AccountSession::LockToChange(unsigned locks)
{
    if (!is_root_)
        return ERR_ACCESS_DENIED;
    if (!LoadExtras())
        return ERR_OPEN_FAILED;
    if (const Code code = Lock(locks, TAVO_LOCK_EXCLUSIVE))
        return code;
    return system_.Take(kLockSeconds) ? ERR_SUCCESS : ERR_LOCK_FAILED;
}

Code AccountSession::OpenAll()
{
    std::vector<size_t> all(kind_.family.stores.size());
    std::iota(all.begin(), all.end(), size_t{0});
    return OpenSettled(all);
}

// Under the system's lock, so that programs that take it do not change the text files meanwhile.
Code AccountSession::OpenSettled(std::span<const size_t> stores)
{
    if (!system_.Take(kLockSeconds))
        return ERR_LOCK_FAILED;
    texts_ = StampTexts(kind_.family);
    if (SealHolds(kind_.family) && Open(stores) == 0 && IsCurrent())
        return 0;
    stores_.clear();
    if (const Code code = BuildStores(kind_, texts_))
        return code;
    return Open(stores);
}

Code AccountSession::Merge()
{
    std::string now = StampTexts(kind_.family);
    if (now == texts_)
        return 0;
    StoreContent content;
    if (!ReadContent(kind_, content))
        return ERR_READ_FAILED;
    for (size_t i = 0; i < stores_.size(); ++i)
        if (const Code code = stores_[i]->TakeOver(content.stores[i], ContentsOf(kind_, i)))
            return code;
    texts_ = std::move(now);
    return 0;
}

bool AccountSession::IsMerged() const
{
    return StampTexts(kind_.family) == texts_;
}

void AccountSession::BeginChange()
{
    BreakSeal(kind_.family);
}

Code AccountSession::Seal(Texts texts)
{
    Code code = 0;
    for (const std::unique_ptr<Btree> &store : stores_)
        if (store)
            if (const Code failed = store->Close())
                code = failed;
    stores_.clear();
    if (code == 0)
        WriteSeal(kind_.family, texts == Texts::written ? StampTexts(kind_.family) : texts_);
    return code;
}

Code AccountSession::SealWritten()
{
    std::vector<TAVOBDB *> stores;
    for (const std::unique_ptr<Btree> &store : stores_)
        stores.push_back(store.get());
    RecordSyncTimes(kind_.family, stores);
    return Seal(Texts::written);
}

bool AccountSession::Unlock()
{
    const KeepFault keep;  // the caller decides whether that is a failure
    system_.Release();
    return locks_ == 0 || ErrTLIBFileUnlock(std::exchange(locks_, 0)) == 0;
}

Code AccountSession::Lock(unsigned locks, unsigned mode)
{
    if (ErrTLIBFileLock(locks | mode | TAVO_LOCK_NONBLOCKING, kLockSeconds) != 0)
        return ERR_LOCK_FAILED;
    locks_ = locks;
    return 0;
}

Code AccountSession::Open(std::span<const size_t> stores)
{
    stores_.clear();
    stores_.resize(kind_.family.stores.size());
    for (const size_t index : stores) {
        const char *path = kind_.family.stores[index].path;
        if (const Code code = Btree::Open(path, {O_RDWR, true, 0}, stores_[index]))
            return CodeOfStores(code);
    }
    return 0;
}

// The stores' own record of the files that they were built from: a program may have taken it away to ask for a rebuild.
bool AccountSession::IsCurrent() const
{
    for (size_t i = 0; i < stores_.size(); ++i) {
        struct stat st = {};
        int32_t synced = 0;
        if (!stores_[i])
            continue;
        if (::lstat(kind_.family.stores[i].text, &st) != 0)
            st.st_mtime = 0;  // the time of a file that does not exist
        if (stores_[i]->GetNumber(kSyncTimeKey, synced) != 0 || synced != static_cast<int32_t>(st.st_mtime))
            return false;
    }
    return true;
}

}  // namespace tavo
