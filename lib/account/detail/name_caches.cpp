// The daemons that answer the system's look-ups of users and groups from memory.
#include "account/detail/name_caches.h"

#include "tavo_proc.h"

#include "core/detail/keep_fault.h"
#include "core/detail/log.h"
#include "core/detail/owner.h"
#include "core/detail/run_command.h"

#include <new>

namespace tavo {
namespace {

constexpr struct {
    const char *pid_file;
    const char *command;
} kNameCaches[] = {
    {"/var/run/nscd/nscd.pid", "/usr/sbin/nscd -i passwd"},
    {"/var/run/nscd/nscd.pid", "/usr/sbin/nscd -i group"},
    {"/var/run/sssd.pid", "/usr/sbin/sss_cache -U -G"},
};

}  // namespace

void FlushNameCaches() noexcept
try {
    const KeepFault keep;
    const KeepErrno keep_errno;
    for (const auto &cache : kNameCaches) {
        if (TLIBProcAliveByPidFile(cache.pid_file) == 0)
            continue;
        if (const int status = RunCommandQuietly(cache.command); status != 0)
            LogError("%s:%d Failed to run [%s], status=%d", cache.command, status);
    }
} catch (const std::bad_alloc &) {
}

}  // namespace tavo
