// How often tests with random moments or damage go round.
#ifndef TESTS_SUPPORT_ROUNDS_H
#define TESTS_SUPPORT_ROUNDS_H

#include "support/appliance_root.h"

#include <cstdlib>

namespace test {

// The virtual appliance, whose processor is emulated, has time for a part only; so has a build with sanitizers, which finds
// in a few rounds what it is there to find.
inline bool TakesLong()
{
#ifdef __SANITIZE_ADDRESS__
    return true;
#else
    return RootForm() == "machine";
#endif
}

// All of them when TAVO_LONG_TESTS is in the environment; else an eighth, so that a run of everything stays short.
inline int Rounds(int all)
{
    if (std::getenv("TAVO_LONG_TESTS"))
        return all;
    return all / (TakesLong() ? 32 : 8);
}

// From one of many moments to the next that is tried, such as the system calls at which something dies.
inline int Stride()
{
    return TakesLong() && !std::getenv("TAVO_LONG_TESTS") ? 11 : 1;
}

}  // namespace test

#endif
