// Waits for a condition, however loaded the machine is.
#ifndef TESTS_SUPPORT_EVENTUALLY_H
#define TESTS_SUPPORT_EVENTUALLY_H

#include <chrono>

#include <unistd.h>

namespace test {

// Asks until the condition holds, for two minutes at most; returns whether it held.
template <class Condition>
bool Eventually(Condition condition)
{
    const auto end = std::chrono::steady_clock::now() + std::chrono::minutes(2);
    while (!condition()) {
        if (std::chrono::steady_clock::now() > end)
            return false;
        ::usleep(10000);
    }
    return true;
}

}  // namespace test

#endif
