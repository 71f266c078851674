// Arguments of the calls: made before the call, freed after it. What the call leaves in them is shown.
#ifndef TESTS_FAULT_EVERY_CALL_ARGUMENTS_H
#define TESTS_FAULT_EVERY_CALL_ARGUMENTS_H

#include "call.h"
#include "support/owned_container.h"
#include "support/test.h"

#include <type_traits>

namespace every_call {

// A text, and room for one.
template <size_t kSize>
struct Text {
    char text[kSize] = {};

    operator char *() { return text; }
    void ShowIn(Trial &run) const { run.Show(std::string_view(text)); }
};

template <class T>
struct Var {
    T value = {};

    operator T *() { return &value; }
    void ShowIn(Trial &run) const
    {
        if constexpr (std::is_integral_v<T>)
            run.Show(static_cast<long long>(value));
    }
};

template <class T, size_t kSize>
struct Array {
    T all[kSize] = {};

    operator T *() { return all; }
    void ShowIn(Trial &run) const { run.Show(static_cast<long long>(all[0])); }
};

// A cleared record, of which one member is shown.
template <auto kMember>
struct Record;
template <class T, class Member, Member T::*kMember>
struct Record<kMember> {
    T value = {};

    operator T *() { return &value; }
    void ShowIn(Trial &run) const { run.Show(value.*kMember); }
};

template <class T>
T ParameterOf(void (*)(T));
template <class T>
T ParameterOf(int (*)(T));

// What kFree frees: made for the call, or by it.
template <auto kFree, class T = decltype(ParameterOf(kFree))>
struct Made {
    T made = {};

    ~Made() { kFree(made); }
    operator T() const { return made; }
    operator T *() { return &made; }
    T Release() { return std::exchange(made, T{}); }
    void ShowIn(Trial &run) const
    {
        if constexpr (std::is_pointer_v<T> && requires { run.Show(made); })
            run.Show(made);
    }
};

// Words, which end with a null pointer.
struct Texts {
    const char *all[4];

    operator const char * const *() const { return all; }
};

using test::Owned;

inline Owned<TLIBSZLIST> ListOf(const std::vector<std::string> &items = {"b", "a", "c"}, int mode = 0)
{
    return test::ListOf(items, mode);
}

// With little room left.
inline Owned<TLIBSZHASH> HashOf(const test::PairMap &pairs = {{"key", "value"}})
{
    return Owned(test::MakeHash(pairs, 64));
}

}  // namespace every_call

#endif
