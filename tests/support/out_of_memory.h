// A call at which memory runs out, at every single allocation.
#ifndef TESTS_SUPPORT_OUT_OF_MEMORY_H
#define TESTS_SUPPORT_OUT_OF_MEMORY_H

#include <functional>

namespace test {

// Each allocation of the call fails once. The call gives its result, -1 for failure, and frees what it got. It must fail
// in some round, with a code of memory, and succeed in the last; no round may leave anything allocated.
void FailEachAllocation(const char *what, int success, const std::function<int()> &call);

}  // namespace test

#endif
