// Arguments of the calls: made before the call, freed after it. What the call leaves in them is shown.
#ifndef TESTS_FAULT_EVERY_CALL_ARGUMENTS_H
#define TESTS_FAULT_EVERY_CALL_ARGUMENTS_H

#include "call.h"
#include "support/container_text.h"

#include <map>
#include <string>
#include <string_view>
#include <type_traits>
#include <vector>

namespace every_call {

// A text, and room for one.
template <size_t kSize>
struct Text {
    char text[kSize] = "";

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

// A pointer that the call sets to something that kFree frees.
template <auto kFree, class T = decltype(ParameterOf(kFree))>
struct Made {
    T made = nullptr;

    ~Made() { kFree(made); }
    operator T *() { return &made; }
};

// Words, which end with a null pointer.
struct Texts {
    const char *all[4];

    operator const char * const *() const { return all; }
};

// A container, which the call may move.
template <class T>
struct Owned {
    T *block;

    explicit Owned(T *container) : block(container) {}
    ~Owned() { test::FreeContainer()(block); }
    Owned(const Owned &) = delete;
    Owned &operator=(const Owned &) = delete;

    operator T *() { return block; }
    operator T **() { return &block; }
    void ShowIn(Trial &run) const { run.Show(block); }
};

inline Owned<TLIBSZLIST> ListOf(const std::vector<std::string> &items = {"b", "a", "c"}, int mode = 0)
{
    return Owned(test::MakeList(items, mode).release());
}

inline Owned<TLIBSZHASH> HashOf(const std::map<std::string, std::string> &pairs = {{"key", "value"}})
{
    TLIBSZHASH *hash = PshTLIBSzHashAlloc(64);
    for (const auto &[key, value] : pairs)
        TLIBSzHashSetValue(&hash, key.c_str(), value.c_str());
    return Owned(hash);
}

}  // namespace every_call

#endif
