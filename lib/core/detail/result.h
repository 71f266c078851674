// How outcomes travel inside the library: a code, or a value or a code. Exported functions report the code.
#ifndef TAVO_CORE_DETAIL_RESULT_H
#define TAVO_CORE_DETAIL_RESULT_H

#include "tavo_error.h"

#include <optional>
#include <type_traits>
#include <utility>

namespace tavo {

// Zero is success: `if (const Code code = Step()) return Fail(code);`.
class [[nodiscard]] Code {
  public:
    constexpr Code(int code = ERR_SUCCESS) noexcept : code_(code) {}
    constexpr operator int() const noexcept { return code_; }

    // The code with another name outside: `from` becomes `to`.
    constexpr Code Renaming(int from, int to) const noexcept { return code_ == from ? to : code_; }

  private:
    int code_;
};

template <class Value>
class [[nodiscard]] Result {
    static_assert(!std::is_arithmetic_v<Value>, "a code and a number would be mixed up");

  public:
    Result(Value value) : value_(std::move(value)) {}
    Result(Code failure) noexcept : code_(failure) {}
    Result(decltype(ERR_SUCCESS) failure) noexcept : code_(failure) {}

    explicit operator bool() const noexcept { return value_.has_value(); }
    Value &operator*() { return *value_; }
    const Value &operator*() const { return *value_; }
    Value *operator->() { return &*value_; }
    const Value *operator->() const { return &*value_; }
    Code Failure() const noexcept { return code_; }  // zero when there is a value
    Result Renaming(int from, int to) && { return value_ ? std::move(*this) : Result(code_.Renaming(from, to)); }

  private:
    std::optional<Value> value_;
    Code code_;
};

}  // namespace tavo

#endif
