// Drops the rights that the network part of the daemon must not have.
#include "network_part.h"

#include <cstdlib>

#include <grp.h>
#include <sys/prctl.h>
#include <sys/resource.h>
#include <unistd.h>

namespace findhostd {
namespace {

constexpr unsigned kNobody = 65534;

// A folder that is gone: nothing can be found in it, and nothing made.
bool EnterNowhere()
{
    char folder[] = "/tmp/.findhostd.XXXXXX";
    return ::mkdtemp(folder) && ::chdir(folder) == 0 && ::rmdir(folder) == 0 && ::chroot(".") == 0;
}

bool Limit(__rlimit_resource_t what, rlim_t most)
{
    const rlimit limit = {most, most};
    return ::setrlimit(what, &limit) == 0;
}

}  // namespace

bool DropPrivileges()
{
    if (!EnterNowhere() || ::setgroups(0, nullptr) != 0 || ::setresgid(kNobody, kNobody, kNobody) != 0 ||
        ::setresuid(kNobody, kNobody, kNobody) != 0)
        return false;
#ifndef __SANITIZE_ADDRESS__  // its shadow is larger than any limit
    if (!Limit(RLIMIT_DATA, 16 << 20))
        return false;
#endif
    return ::prctl(PR_SET_NO_NEW_PRIVS, 1, 0, 0, 0) == 0 && Limit(RLIMIT_FSIZE, 0) && Limit(RLIMIT_CORE, 0) &&
           Limit(RLIMIT_NPROC, 0) && ::setuid(0) != 0;
}

}  // namespace findhostd
