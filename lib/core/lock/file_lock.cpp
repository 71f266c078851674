// Takes locks: all of a request or none.
#include "tavo_lock.h"

#include "core/detail/fault.h"
#include "core/detail/lock_holder.h"
#include "core/detail/log.h"
#include "core/detail/open_file.h"

#include <ctime>

#include <sys/file.h>

namespace {

using tavo::Fd;
using tavo::File;

constexpr unsigned kModeBits = 0xF;
constexpr long kRetryNanoseconds = 50'000'000;
constexpr int kTicksPerSecond = 100;
constexpr int kTicksPerRetry = 5;

enum class Take { taken, not_opened, not_allowed, busy };

// Hopeless: waiting cannot help, because this process itself holds a shared lock that would have to become exclusive,
// or because it may not open the file.
enum class Attempt { complete, incomplete, hopeless };

// One attempt at a request.
struct Taken {
    unsigned locks = 0;                    // given back unless the attempt completes
    const TLIBLOCKFILE *missed = nullptr;  // the first lock that could not be taken
    int error = 0;                         // why its file could not be opened
};

bool IsMode(unsigned mode)
{
    const unsigned kind = mode & ~static_cast<unsigned>(TAVO_LOCK_NONBLOCKING);
    return kind == TAVO_LOCK_SHARED || kind == TAVO_LOCK_EXCLUSIVE;
}

bool IsExclusive(unsigned mode)
{
    return (mode & TAVO_LOCK_EXCLUSIVE) != 0;
}

bool StillNamed(int fd, const char *path)
{
    struct stat held, named;
    return ::fstat(fd, &held) == 0 && ::lstat(path, &named) == 0 && held.st_dev == named.st_dev &&
           held.st_ino == named.st_ino;
}

bool Flock(int fd, unsigned mode)
{
    int result;
    do
        result = ::flock(fd, static_cast<int>(mode));
    while (result != 0 && errno == EINTR);  // a child's death says nothing about the lock
    return result == 0;
}

Take TakeFile(TLIBLOCKFILE &entry, unsigned mode)
{
    // A cleaner of /tmp may replace the file between open and flock; then the lock excludes no other process.
    for (int tries = 0; tries < 10; ++tries) {
        Fd fd = tavo::OpenRegular(entry.szPath, O_RDONLY | O_NOFOLLOW);
        if (!fd && errno == EACCES)
            return Take::not_allowed;
        if (!fd && (errno != ENOENT || ErrTLIBILockCheckDir() != 0))
            return Take::not_opened;
        if (!fd)
            continue;
        if (!Flock(fd.Get(), mode))
            return Take::busy;
        if (!StillNamed(fd.Get(), entry.szPath))
            continue;
        File stream(::fdopen(fd.Get(), "re"));
        if (!stream)
            return Take::not_opened;
        fd.Release();
        entry.pfLock = stream.Release();
        entry.nRef = 1;
        entry.nMode = static_cast<int>(mode);
        return Take::taken;
    }
    return Take::not_opened;
}

Attempt TakeAll(unsigned wanted, unsigned mode, Taken &taken)
{
    for (TLIBLOCKFILE *entry = rgslckList; entry->fLockBit != 0; ++entry) {
        if ((entry->fLockBit & wanted) == 0)
            continue;
        if (!entry->pfLock) {
            const Take take = TakeFile(*entry, mode);
            if (take != Take::taken && !taken.missed) {
                taken.missed = entry;
                taken.error = take == Take::busy ? 0 : errno;
            }
            if (take == Take::busy)
                return Attempt::incomplete;
            if (take == Take::not_allowed)
                return Attempt::hopeless;
            if (take == Take::not_opened)
                continue;
        } else if (IsExclusive(mode) && !IsExclusive(static_cast<unsigned>(entry->nMode))) {
            taken.missed = entry;
            return Attempt::hopeless;
        } else {
            ++entry->nRef;
        }
        taken.locks |= entry->fLockBit;
    }
    return taken.locks == wanted ? Attempt::complete : Attempt::incomplete;
}

// Without this line an administrator cannot find out which of a dozen programs blocks the others.
void LogMissed(const Taken &taken)
{
    if (!taken.missed)
        return;
    const char *const path = taken.missed->szPath;
    if (taken.missed->pfLock) {
        LogError("%s:%d Gave up on %s: this process holds it shared, which does not become exclusive", path);
    } else if (taken.error != 0) {
        LogError("%s:%d Gave up on %s: it cannot be opened, errno=%d", path, taken.error);
    } else {
        const tavo::LockHolder holder = tavo::FindLockHolder(path);
        LogError("%s:%d Gave up on %s: process %d (%s) holds it", path, holder.pid, holder.name);
    }
}

void SleepThroughSignals(long nanoseconds)
{
    struct timespec left = {0, nanoseconds};
    while (::nanosleep(&left, &left) != 0 && errno == EINTR) {
    }
}

}  // namespace

extern "C" int ErrTLIBFileLock(unsigned int request, int timeout)
{
    if (ErrTLIBILockCheckDir() != 0)
        return -1;
    const unsigned mode = request & kModeBits;
    const unsigned wanted = request & ~kModeBits;
    if (!IsMode(mode))
        return Fail(ERR_LOCK_FAILED, Line{87});
    for (long long ticks = static_cast<long long>(timeout) * kTicksPerSecond;; ticks -= kTicksPerRetry) {
        Taken taken;
        const Attempt attempt = TakeAll(wanted, mode, taken);
        if (attempt == Attempt::complete)
            return 0;
        ErrTLIBFileUnlock(taken.locks);
        if (attempt == Attempt::hopeless || ticks <= 0) {
            LogMissed(taken);
            return Fail(ERR_LOCK_FAILED, Line{87});
        }
        SleepThroughSignals(kRetryNanoseconds);
    }
}
