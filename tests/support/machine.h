// The virtual appliance for tests. Suites whose names begin with "Machine" run there with the real tools, on the
// machine's own disks and cards; elsewhere they are skipped.
#ifndef TESTS_SUPPORT_MACHINE_H
#define TESTS_SUPPORT_MACHINE_H

#include "support/test.h"

namespace test {

bool OnMachine();

class MachineTest : public testing::Test {
  protected:
    void SetUp() override
    {
        if (!OnMachine())
            GTEST_SKIP() << "only in the virtual appliance";
    }
};

struct CommandResult {
    int status;  // as a shell gives it
    std::string output;
};

// Runs a line of shell with its standard error joined to its output.
CommandResult Shell(const std::string &line);

// Returns the output of a line of shell that must succeed.
std::string Told(const std::string &line);

// Makes an event happen from outside and returns after it, see appliance-event: "pull 2", "plug 2 --blank", "cut eth0".
void Happen(const std::string &event);

// Waits, generously, for a condition.
bool Comes(const std::function<bool()> &condition);

}  // namespace test

#endif
