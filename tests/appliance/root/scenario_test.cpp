// The scripted tools as test programs use them: scripted_tools.sh has the cases.
#include "support/scenario.h"

#include "support/test.h"

namespace {

TEST(Scenario, PlaysTheScriptAndReportsWhatWentOtherwise)
{
    for (const bool any_order : {false, true}) {
        test::Scenario scenario;
        scenario.Expect({"/sbin/dhcpcd", "it's", ""}).Runs("#!/bin/sh\necho \"$1\" >/tmp/lease\n").DiesOf(SIGKILL);
        scenario.Expect({"/sbin/vgs", "a b"}).Times(2).Exits(3);
        scenario.ExpectAny("/sbin/route").AnyTimes();
        if (any_order)
            scenario.InAnyOrder();
        EXPECT_EQ(WEXITSTATUS(std::system("/sbin/route add; /sbin/vgs 'a b'")), any_order ? 3 : 97);
        EXPECT_EQ(WEXITSTATUS(std::system("/sbin/dhcpcd \"it's\" ''; exit $?")), 128 + SIGKILL);
        EXPECT_EQ(WEXITSTATUS(std::system("grep -qx \"it's\" /tmp/lease && /sbin/vgs 'a b'")), 3);
        EXPECT_EQ(test::Scenario::Calls().back(), "/sbin/vgs $'a b'");
        EXPECT_EQ(scenario.Finish() == "", any_order);

        scenario.Expect({"/sbin/pvs", "a", "b"});
        EXPECT_EQ(WEXITSTATUS(std::system("/sbin/pvs 'a b'")), 97);
        EXPECT_EQ(scenario.Finish(), "not expected: /sbin/pvs $'a b'\nnot called: /sbin/pvs a b\n");
    }
}

}  // namespace
