// Fills the stack with known data: a function that reads a variable before it has set it finds this.
#ifndef TESTS_SUPPORT_STALE_STACK_H
#define TESTS_SUPPORT_STALE_STACK_H

#include <algorithm>
#include <cstdint>
#include <cstring>

namespace test {

// Fills the stack below the caller's frame with the word.
[[gnu::noinline]] inline void FillStack(uint32_t word)
{
    uint32_t words[16384];
    std::fill(std::begin(words), std::end(words), word);
    asm volatile("" : : "r"(words) : "memory");
}

// The same with a text of up to three characters.
inline void FillStack(const char *text)
{
    uint32_t word = 0;
    std::memcpy(&word, text, std::min<size_t>(std::strlen(text), 3));
    FillStack(word);
}

}  // namespace test

#endif
