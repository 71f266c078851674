// Takes the place of the allocator in a test program.
#include "support/failing_malloc.h"

#include <cerrno>
#include <cstddef>
#include <cstring>
#include <new>
#include <utility>

#include <dlfcn.h>
#include <execinfo.h>

#ifdef TEST_WITH_ASAN
#define REAL(name) __interceptor_##name
#else
#define REAL(name) __libc_##name
#endif

extern "C" {
void *REAL(malloc)(size_t);
void *REAL(calloc)(size_t, size_t);
void *REAL(realloc)(void *, size_t);
void REAL(free)(void *);
}

namespace test {
namespace {

struct Armed {
    bool on = false;
    bool paused = false;
    int until_failure = 0;
    bool fired = false;
    int live = 0;
    bool keeps_stack = false;
    int frames = 0;
    void *stack[64] = {};
};

constinit thread_local Armed armed;

bool IsOn()
{
    return armed.on && !armed.paused;
}

// True for the allocation that is to fail.
bool Fails()
{
    if (!IsOn())
        return false;
    if (--armed.until_failure == 0) {
        armed.fired = true;
        if (armed.keeps_stack) {
            const bool on = armed.on;
            armed.on = false;
            armed.frames = ::backtrace(armed.stack, 64);
            armed.on = on;
        }
        errno = ENOMEM;
        return true;
    }
    return false;
}

void *Counted(void *block)
{
    armed.live += IsOn() && block;
    return block;
}

}  // namespace

bool EachAllocation::Next()
{
    if (!fired_)
        return false;
    ++round_;
    return true;
}

void EachAllocation::Arm()
{
    armed = {.on = true, .until_failure = round_};
}

void EachAllocation::Disarm()
{
    if (!armed.on)
        return;
    fired_ = armed.fired;
    left_allocated_ = StopCounting();
}

bool PauseFailing(bool paused) noexcept
{
    return std::exchange(armed.paused, paused);
}

void StartCounting()
{
    void *warm[4];
    ::backtrace(warm, 4);  // allocates the first time
    armed = {.on = true, .keeps_stack = true};
}

bool FailedInside(const char *object)
{
    for (int i = 0; i < armed.frames; ++i) {
        Dl_info info;
        if (::dladdr(armed.stack[i], &info) && info.dli_fname && std::strstr(info.dli_fname, object))
            return true;
    }
    return false;
}

void FailAllocation(int n)
{
    armed.until_failure = n;
}

void StopFailing()
{
    armed.until_failure = 0;
}

bool AllocationFailed()
{
    return armed.fired;
}

int StopCounting()
{
    armed.on = false;
#ifdef TEST_WITH_ASAN
    return 0;  // the sanitizer allocates, too, and checks for leaks itself at the end
#else
    return armed.live;
#endif
}

}  // namespace test

using test::armed;
using test::Counted;
using test::Fails;
using test::IsOn;

extern "C" {

void *malloc(size_t size)
{
    return Fails() ? nullptr : Counted(REAL(malloc)(size));
}

void *calloc(size_t count, size_t size)
{
    return Fails() ? nullptr : Counted(REAL(calloc)(count, size));
}

void *realloc(void *block, size_t size)
{
    if (Fails())
        return nullptr;
    return block ? REAL(realloc)(block, size) : Counted(REAL(realloc)(block, size));
}

void free(void *block)
{
    armed.live -= IsOn() && block;
    REAL(free)(block);
}
}

#ifdef TEST_WITH_ASAN
// The sanitizer has operators of its own, which do not call malloc; the library's and the test's must.
void *operator new(size_t size)
{
    void *block = malloc(size ? size : 1);
    if (!block)
        throw std::bad_alloc();
    return block;
}

void *operator new[](size_t size)
{
    return operator new(size);
}

void *operator new(size_t size, const std::nothrow_t &) noexcept
{
    return malloc(size ? size : 1);
}

void operator delete(void *block) noexcept
{
    free(block);
}

void operator delete[](void *block) noexcept
{
    free(block);
}

void operator delete(void *block, size_t) noexcept
{
    free(block);
}

void operator delete[](void *block, size_t) noexcept
{
    free(block);
}
#endif
