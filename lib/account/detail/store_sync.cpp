// Keeps the database from syncing store files to disk.
#include "account/detail/store_sync.h"

#include "core/detail/extras.h"

#include <atomic>

#include <unistd.h>

namespace tavo {
namespace {

// The thread whose syncs do nothing; 0 when there is none. Not a variable of each thread: every thread of every program
// that links the library would pay for it. Of two threads in here at once the first one's remaining syncs go to disk.
constinit std::atomic<pid_t> quiet_thread = 0;

int SyncUnlessStore(int fd)
{
    return quiet_thread == ::gettid() ? 0 : ::fdatasync(fd);
}

void SyncBy(int (*sync)(int)) noexcept
{
    if (const Extras *extras = LoadExtras())  // it is there: no store was ever opened without
        extras->sync_by(sync);
}

}  // namespace

NoStoreSync::NoStoreSync() noexcept
{
    const pid_t self = ::gettid();
    outermost_ = quiet_thread.exchange(self) != self;
    if (outermost_)
        SyncBy(SyncUnlessStore);
}

NoStoreSync::~NoStoreSync()
{
    pid_t self = ::gettid();
    if (outermost_ && quiet_thread.compare_exchange_strong(self, 0))
        SyncBy(nullptr);
}

}  // namespace tavo
