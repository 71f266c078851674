// The virtual appliance as tests see it. Suites whose names begin with "Machine" run there with the real tools, on the
// machine's own disks and cards; elsewhere they are skipped.
#ifndef TESTS_SUPPORT_MACHINE_H
#define TESTS_SUPPORT_MACHINE_H

#include <gtest/gtest.h>

#include <functional>
#include <string>

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

// Runs a line of shell, standard error among the output.
CommandResult Shell(const std::string &line);

// The output of a line of shell that must succeed.
std::string Told(const std::string &line);

// Something that happens from outside and has happened then, see appliance-event: "pull 2", "plug 2 --blank", "cut eth0".
void Happen(const std::string &event);

// Waits, generously, for what must come.
bool Comes(const std::function<bool()> &condition);

}  // namespace test

#endif
