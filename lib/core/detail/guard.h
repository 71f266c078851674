// Keeps exceptions inside the library: its callers are C, where running out of memory is a result and not a crash.
#ifndef TAVO_CORE_DETAIL_GUARD_H
#define TAVO_CORE_DETAIL_GUARD_H

#include "core/detail/fault.h"

#include <type_traits>

namespace tavo {

// While this object exists, cancellation of the thread is deferred. Cancellation unwinds the stack by an exception that
// must not be caught, and that would end the whole program at the boundary.
class CancellationOff {
  public:
    CancellationOff() noexcept;
    ~CancellationOff();
    CancellationOff(const CancellationOff &) = delete;
    CancellationOff &operator=(const CancellationOff &) = delete;

  private:
    int before_;
};

// To be called in a handler. Returns `out_of_memory` for a failed allocation or a text larger than the address space.
// Everything else is logged and becomes ERR_UNKNOWN.
int CodeOfException(int out_of_memory, const Where &where) noexcept;

// Runs the body of an exported function. An exception is recorded as its code, and the failure value of the body's
// result type is returned: -1 for integers, false for booleans, NULL for pointers.
template <class Body>
auto Guard(Body &&body, int out_of_memory = ERR_OUT_OF_MEMORY, Where where = Where()) noexcept -> decltype(body())
{
    using Result = decltype(body());
    const CancellationOff cancellation_off;
    try {
        return body();
    } catch (...) {
        const int code = CodeOfException(out_of_memory, where);
        if constexpr (std::is_void_v<Result>)
            Fail(code, where);
        else if constexpr (std::is_pointer_v<Result>)
            return FailNull(code, where);
        else if constexpr (std::is_same_v<Result, bool>)
            return FailZero(code, where);
        else
            return static_cast<Result>(Fail(code, where));
    }
}

// The same for a function that records nothing: returns `failure` after an exception.
template <class Body>
auto GuardSilently(Body &&body, std::type_identity_t<decltype(body())> failure, Where where = Where()) noexcept
    -> decltype(body())
{
    const CancellationOff cancellation_off;
    try {
        return body();
    } catch (...) {
        CodeOfException(ERR_OUT_OF_MEMORY, where);
        return failure;
    }
}

}  // namespace tavo

using tavo::Guard;

#endif
