// The functions that the database calls in place of the C library. It has two interfaces whose headers cannot be
// included together.
#include "extras/parts.h"

#include <algorithm>
#include <atomic>
#include <cerrno>
#include <cstdarg>
#include <cstdlib>
#include <iterator>
#include <utility>

#include <db.h>
#include <fcntl.h>
#include <pthread.h>
#include <unistd.h>

namespace tavo::extras {
namespace {

// An environment is what the database allocates first for an open, in two pieces. When it cannot have the second one
// its clean-up reads through the pointer to it, so both are set aside before.
constexpr size_t kPieceOfEnvironment = 8 << 10;
static_assert(sizeof(DB_ENV) <= kPieceOfEnvironment);

// The thread whose calls are replaced; 0 when there is none. The hooks are global in the program, and a lock would stay
// locked in a child of it; so of two threads at once, the second one's calls are not replaced. Asked some 20 times
// a look-up, so by pthread_self(), which is not a system call.
constinit std::atomic<pthread_t> owner = 0;

constinit void *spares[2] = {nullptr, nullptr};
constinit int opened[8] = {-1, -1, -1, -1, -1, -1, -1, -1};
constinit int close_error = 0;

// The environment of an open that has begun, until its messages have somewhere to go.
constinit DB_ENV *environment = nullptr;
constinit bool is_awaited = false;

// The library's caller learns of a failure from its code and the system log. Standard error belongs to the program.
void DropMessage(const DB_ENV *, const char *, const char *) noexcept
{
}

bool IsOwner() noexcept
{
    return owner == ::pthread_self();
}

void Exchange(int from, int to) noexcept
{
    if (int *const place = std::find(std::begin(opened), std::end(opened), from); place != std::end(opened))
        *place = to;
}

void *AllocateOrSpare(size_t size) noexcept
{
    if (!IsOwner())
        return std::malloc(size);
    if (environment)  // it has been set to zero since
        std::exchange(environment, nullptr)->db_errcall = DropMessage;
    void *block = std::malloc(size);
    if (!block && size <= kPieceOfEnvironment)
        for (void *&spare : spares)
            if (!block)
                std::swap(block, spare);
    if (std::exchange(is_awaited, false) && size == sizeof(DB_ENV))
        environment = static_cast<DB_ENV *>(block);
    return block;
}

int OpenNoted(const char *path, int flags, ...) noexcept
{
    va_list rest;
    va_start(rest, flags);
    const int mode = va_arg(rest, int);
    va_end(rest);
    const int fd = ::open(path, flags | O_CLOEXEC, mode);
    if (fd >= 0 && IsOwner())
        Exchange(-1, fd);
    return fd;
}

// The system has closed the file even when it reports an error. The database would close the number again, which may
// belong to another file by then, or crash on freed memory.
int CloseOnce(int fd) noexcept
{
    const bool mine = IsOwner();
    if (mine)
        Exchange(fd, -1);
    if (::close(fd) != 0 && errno != EINTR && mine)
        close_error = errno;
    return 0;
}

}  // namespace

void SyncBy(int (*sync)(int fd)) noexcept
{
    ::db_env_set_func_fsync(sync);
}

DatabaseCall::DatabaseCall() noexcept
{
    pthread_t none = 0;
    is_owner_ = owner.compare_exchange_strong(none, ::pthread_self());
    if (!is_owner_)
        return;
    std::fill(std::begin(opened), std::end(opened), -1);
    close_error = 0;
    environment = nullptr;
    is_awaited = false;
    ::db_env_set_func_malloc(AllocateOrSpare);
    ::db_env_set_func_open(OpenNoted);
    ::db_env_set_func_close(CloseOnce);
}

DatabaseCall::~DatabaseCall()
{
    if (!is_owner_)
        return;
    const int saved = errno;
    ::db_env_set_func_close(nullptr);
    ::db_env_set_func_open(nullptr);
    ::db_env_set_func_malloc(nullptr);
    for (void *&spare : spares)
        std::free(std::exchange(spare, nullptr));
    owner = 0;
    errno = saved;
}

bool DatabaseCall::Reserve() noexcept
{
    if (is_owner_)
        for (void *&spare : spares)
            if (!spare && !(spare = std::malloc(kPieceOfEnvironment)))
                return false;
    is_awaited = is_owner_;
    return true;
}

int DatabaseCall::CloseError() const noexcept
{
    return is_owner_ ? close_error : 0;
}

void DatabaseCall::CloseLeft() noexcept
{
    const int saved = errno;
    for (int &fd : opened)
        if (is_owner_ && fd >= 0)
            ::close(std::exchange(fd, -1));
    errno = saved;
}

}  // namespace tavo::extras
