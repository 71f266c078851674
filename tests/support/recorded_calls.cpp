// Takes the place of ioctl, sleep and the sync functions in a test program.
#undef _FORTIFY_SOURCE

#include "support/recorded_calls.h"

#include <cerrno>
#include <cstdarg>

#include <dlfcn.h>
#include <sys/ioctl.h>
#include <unistd.h>

namespace test {
namespace {

RecordedCalls *current = nullptr;

#if defined(__TIMESIZE) && __TIMESIZE == 32
constexpr const char *kIoctl = "__ioctl_time64";
#else
constexpr const char *kIoctl = "ioctl";
#endif

template <class Function>
Function *Real(const char *name)
{
    return reinterpret_cast<Function *>(::dlsym(RTLD_NEXT, name));
}

}  // namespace

RecordedCalls::RecordedCalls(Request on_ioctl) : on_ioctl_(std::move(on_ioctl))
{
    calls_.reserve(1024);  // recording allocates nothing: a test may count or refuse the library's allocations
    current = this;
}

RecordedCalls::~RecordedCalls()
{
    current = nullptr;
}

int RecordedCalls::Ioctl(int fd, unsigned long request, void *argument)
{
    if (on_ioctl_)
        return on_ioctl_(fd, request, argument);
    errno = ENOTTY;
    return -1;
}

}  // namespace test

using test::current;
using test::Real;

extern "C" {

int ioctl(int fd, unsigned long request, ...)
{
    va_list args;
    va_start(args, request);
    void *const argument = va_arg(args, void *);
    va_end(args);
    if (current)
        return current->Ioctl(fd, request, argument);
    return Real<int(int, unsigned long, ...)>(test::kIoctl)(fd, request, argument);
}

unsigned sleep(unsigned seconds)
{
    if (!current)
        return Real<unsigned(unsigned)>("sleep")(seconds);
    current->Note("sleep " + std::to_string(seconds));
    return 0;
}

void sync()
{
    if (current)
        current->Note("sync");
}

int fsync(int fd)
{
    if (!current)
        return Real<int(int)>("fsync")(fd);
    current->Note("fsync");
    return 0;
}

int fdatasync(int fd)
{
    if (!current)
        return Real<int(int)>("fdatasync")(fd);
    current->Note("fdatasync");
    return 0;
}
}
