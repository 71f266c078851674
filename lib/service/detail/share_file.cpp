// The record of shared folders, /usr/tavo/etc/share.conf: one section per share, with its path.
#include "service/detail/share_file.h"

#include "tavo_file.h"
#include "tavo_hash.h"
#include "tavo_section.h"

#include "core/detail/appliance_paths.h"
#include "core/detail/keep_fault.h"
#include "core/detail/list_owner.h"
#include "core/detail/lock_hold.h"

#include <cerrno>

#include <unistd.h>

namespace tavo {
namespace {

// Samba's lock, because its configuration is made from the shares.
constexpr unsigned kSharesLock = TAVO_LOCK_SMB | TAVO_LOCK_EXCLUSIVE | TAVO_LOCK_NONBLOCKING;
constexpr int kLockSeconds = 5;
constexpr int kHashBytes = 512;

Code ReadShare(const char *name, HashOwner &share)
{
    share.Reset(PshTLIBSzHashAlloc(kHashBytes));
    if (!share)
        return ERR_OUT_OF_MEMORY;
    const KeepFault keep;  // the caller reports the code
    if (TLIBFileGetSection(kShareFile, name, share.Addr()) >= 0)
        return 0;
    const int code = TLIBErrGet();
    return ::access(kShareFile, F_OK) != 0 && errno == ENOENT ? 0 : code;  // nothing has been recorded yet
}

}  // namespace

Result<std::string> SharePath(const char *name)
{
    HashOwner share;
    if (const Code code = ReadShare(name, share))
        return code;
    const char *value = SzTLIBSzHashGetValue(share.Get(), "path");
    return std::string(value ? value : "");
}

Code RecordShare(const char *name, const std::string &path)
{
    const LockHold lock(kSharesLock, kLockSeconds);
    HashOwner share;
    if (!lock)
        return TLIBErrGet();
    if (TLIBFileTouch(kShareFile) != 0)
        return TLIBErrGet();
    if (const Code code = ReadShare(name, share))
        return code;
    if (TLIBSzHashSetValue(share.Addr(), "path", path.c_str()) < 0)
        return ERR_OUT_OF_MEMORY;
    // A share that is not recorded yet is not a failure, so the caller must not see that code.
    const KeepFault keep;
    const int found = ErrTLIBFileSetSection(kShareFile, name, nullptr, share.Get(), 1, nullptr);
    if (found < 0 || (found == 0 && ErrTLIBFileAddSection(kShareFile, name, share.Get(), nullptr) < 0))
        return TLIBErrGet();
    return 0;
}

Code ForgetShare(const char *name)
{
    const LockHold lock(kSharesLock, kLockSeconds);
    if (!lock)
        return TLIBErrGet();
    Result<std::string> path = SharePath(name);
    if (!path || path->empty())
        return path.Failure();
    return ErrTLIBFileRemoveSection(kShareFile, name) < 0 ? TLIBErrGet() : 0;
}

}  // namespace tavo
