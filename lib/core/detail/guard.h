// Keeps exceptions inside: the boundary is C, and running out of memory is an answer there, not a crash.
#ifndef TAVO_CORE_DETAIL_GUARD_H
#define TAVO_CORE_DETAIL_GUARD_H

#include "core/detail/fault.h"

#include <new>
#include <stdexcept>
#include <type_traits>

namespace tavo {
namespace {

// Runs the body of an exported function. When memory runs out, records `code` and gives the failure value of the
// body's result type: -1 for integers, false for booleans, NULL for pointers.
template <class Body>
auto Guard(Body &&body, int code = ERR_OUT_OF_MEMORY, Line line = Line{__builtin_LINE()}) noexcept -> decltype(body())
{
    using Result = decltype(body());
    const auto out_of_memory = [&]() -> Result {
        if constexpr (std::is_void_v<Result>)
            FailZero(code, line);
        else if constexpr (std::is_pointer_v<Result>)
            return FailNull(code, line);
        else if constexpr (std::is_same_v<Result, bool>)
            return FailZero(code, line);
        else
            return static_cast<Result>(Fail(code, line));
    };
    try {
        return body();
    } catch (const std::bad_alloc &) {
        return out_of_memory();
    } catch (const std::length_error &) {  // a text that would be larger than the address space
        return out_of_memory();
    }
}

}  // namespace
}  // namespace tavo

using tavo::Guard;

#endif
