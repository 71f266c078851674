// Taking and releasing a lock, against the bare system calls without checks, counts and records.
#include "tavo_lock.h"

#include "compare.h"

#include <fcntl.h>
#include <sys/file.h>
#include <unistd.h>

namespace {

uint64_t Bare(int files)
{
    int fds[2];
    uint64_t held = 0;
    for (int i = 0; i < files; ++i) {
        fds[i] = ::open(rgslckList[i].szPath, O_RDONLY | O_CLOEXEC);
        held += ::flock(fds[i], LOCK_EX | LOCK_NB) == 0;
    }
    for (int i = 0; i < files; ++i)
        ::close(fds[i]);
    return held;
}

uint64_t Tavo(unsigned bits, uint64_t files)
{
    const uint64_t held = ErrTLIBFileLock(bits | TAVO_LOCK_EXCLUSIVE | TAVO_LOCK_NONBLOCKING, 0) == 0 ? files : 0;
    ErrTLIBFileUnlock(bits);
    return held;
}

}  // namespace

int main(int argc, char **argv)
{
    ErrTLIBILockCheckDir();
    bench::Compare("lock_unlock", 1,
                   {{"tavo",
                     [] {
                         return Tavo(TAVO_LOCK_TAVOINFO, 1);
                     }},
                    {"open+flock", [] {
                         return Bare(1);
                     }}});
    bench::Compare("lock_unlock", 2,
                   {{"tavo",
                     [] {
                         return Tavo(TAVO_LOCK_TAVOINFO | TAVO_LOCK_USER, 2);
                     }},
                    {"open+flock", [] {
                         return Bare(2);
                     }}});
    return bench::Run(argc, argv);
}
