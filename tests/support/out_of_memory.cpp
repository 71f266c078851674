// Fails every allocation of a call.
#include "support/out_of_memory.h"

#include "support/failing_malloc.h"
#include "support/fault_state.h"

namespace test {

void FailEachAllocation(const char *what, int success, const std::function<int()> &call)
{
    SCOPED_TRACE(what);
    EachAllocation faults;
    bool refused = false;
    bool done = false;
    while (faults.Next()) {
        ForgetFault();
        faults.Arm();
        const int result = call();
        faults.Disarm();
        if (result == -1) {
            EXPECT_TRUE(faults.Fired());
            EXPECT_THAT(TLIBErrGet(), testing::AnyOf(ERR_OUT_OF_MEMORY, ERR_NOT_ENOUGH_MEMORY));
            refused = true;
        } else if (!faults.Fired()) {
            EXPECT_EQ(result, success);
            done = true;
        }
        EXPECT_EQ(faults.LeftAllocated(), 0);
    }
    EXPECT_TRUE(refused);
    EXPECT_TRUE(done);
}

}  // namespace test
