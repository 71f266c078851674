// The number of rounds of tests with random moments or damage.
#ifndef TESTS_SUPPORT_ROUNDS_H
#define TESTS_SUPPORT_ROUNDS_H

#include "support/appliance_root.h"

#include <cstdlib>

namespace test {

// The virtual appliance, whose processor is emulated, has time for a part only. So has a build with sanitizers, which
// needs only a few rounds for its finds.
inline bool TakesLong()
{
#ifdef __SANITIZE_ADDRESS__
    return true;
#else
    return RootForm() == "machine";
#endif
}

// Returns all of them when TAVO_LONG_TESTS is in the environment, otherwise an eighth, so that a full test run stays
// short.
inline int Rounds(int all)
{
    if (std::getenv("TAVO_LONG_TESTS"))
        return all;
    return all / (TakesLong() ? 32 : 8);
}

// The step from one of many moments to the next one tried, such as the system calls at which a process dies.
inline int Stride()
{
    return TakesLong() && !std::getenv("TAVO_LONG_TESTS") ? 11 : 1;
}

}  // namespace test

#endif
