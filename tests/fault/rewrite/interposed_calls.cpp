// The calls that a rewrite is made of, in place of the C library's.
#include "interposed_calls.h"

#include <cerrno>
#include <csignal>
#include <cstdio>

#include <fcntl.h>
#include <sys/file.h>
#include <sys/stat.h>
#include <sys/syscall.h>
#include <unistd.h>

namespace test {
namespace {

int die_at;
int stop_at;
int calls_made;
Call failing = Call::none;
int failing_with;
char renamed_from[4096];

bool Reached()
{
    if (++calls_made == stop_at)
        ::raise(SIGSTOP);
    return calls_made == die_at;
}

// Ends the process, or returns whether the call is to fail.
bool Fails(Call call)
{
    if (Reached())
        ::_exit(kDied);
    errno = call == failing ? failing_with : errno;
    return call == failing;
}

bool IsDirectory(int fd)
{
    struct stat st;
    return ::fstatat(fd, "", &st, AT_EMPTY_PATH) == 0 && S_ISDIR(st.st_mode);
}

}  // namespace

void DieAtCall(int n)
{
    die_at = n;
    calls_made = 0;
}

void StopAtCall(int n)
{
    stop_at = n;
    calls_made = 0;
}

void FailCalls(Call call, int error)
{
    failing = call;
    failing_with = error;
}

const char *RenamedFrom()
{
    return renamed_from;
}

}  // namespace test

using test::Call;
using test::Fails;

extern "C" {

int fstat(int fd, struct stat *st) noexcept
{
    const int result = ::fstatat(fd, "", st, AT_EMPTY_PATH);
    const bool is_written = (::fcntl(fd, F_GETFL) & O_ACCMODE) != O_RDONLY && st->st_size > 0;
    if (test::failing != Call::fstat && !(test::failing == Call::fstat_written && is_written))
        return result;
    errno = test::failing_with;
    return -1;
}

ssize_t read(int fd, void *data, size_t size)
{
    if (test::failing == Call::read) {
        errno = test::failing_with;
        return -1;
    }
    return ::syscall(SYS_read, fd, data, size);
}

ssize_t write(int fd, const void *data, size_t size)
{
    if (test::Reached()) {
        [[maybe_unused]] const auto torn = ::syscall(SYS_write, fd, data, size / 2);
        ::_exit(test::kDied);
    }
    if (test::failing == Call::write) {
        errno = test::failing_with;
        return -1;
    }
    return ::syscall(SYS_write, fd, data, size);
}

int fsync(int fd)
{
    return Fails(test::IsDirectory(fd) ? Call::fsync_directory : Call::fsync_file)
               ? -1
               : static_cast<int>(::syscall(SYS_fsync, fd));
}

int fchmod(int fd, mode_t mode) noexcept
{
    return Fails(Call::fchmod) ? -1 : static_cast<int>(::syscall(SYS_fchmod, fd, mode));
}

int fchown(int fd, uid_t owner, gid_t group) noexcept
{
    return Fails(Call::fchown) ? -1 : ::fchownat(fd, "", owner, group, AT_EMPTY_PATH);
}

int flock(int fd, int operation) noexcept
{
    if (test::failing == Call::flock) {
        errno = test::failing_with;
        return -1;
    }
    return static_cast<int>(::syscall(SYS_flock, fd, operation));
}

int rename(const char *from, const char *to) noexcept
{
    std::snprintf(test::renamed_from, sizeof test::renamed_from, "%s", from);
    return Fails(Call::rename) ? -1 : ::renameat(AT_FDCWD, from, AT_FDCWD, to);
}
}
