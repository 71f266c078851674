// How often tests with random moments or damage go round.
#ifndef TESTS_SUPPORT_ROUNDS_H
#define TESTS_SUPPORT_ROUNDS_H

#include <cstdlib>

namespace test {

// All of them when TAVO_LONG_TESTS is in the environment; else an eighth, so that a run of everything stays short.
inline int Rounds(int all)
{
    return std::getenv("TAVO_LONG_TESTS") ? all : all / 8;
}

}  // namespace test

#endif
