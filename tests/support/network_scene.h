// An appliance with one card on a virtual cable, static, with a stored gateway and a name: where tests of the network run
// against a kernel.
#ifndef TESTS_SUPPORT_NETWORK_SCENE_H
#define TESTS_SUPPORT_NETWORK_SCENE_H

#include "support/scenario.h"
#include "support/test.h"
#include "support/virtual_cable.h"

namespace test {

inline constexpr const char *kIfcfg = "/etc/sysconfig/network-scripts/ifcfg-eth0";

class NetworkScene : public testing::Test {
  protected:
    void SetUp() override
    {
        if (const std::string missing = VirtualCable::Missing(); !missing.empty())
            GTEST_SKIP() << missing;
        cable_.emplace("cable");
        here_.emplace("here");
        cable_->Plug(*here_, "eth0");
        here_->Do([] {
            WriteFile("/etc/sysconfig/network", "GATEWAY=192.0.2.99\nHOSTNAME=here\n");
            WriteFile(kIfcfg, "DEVICE=eth0\nONBOOT=yes\nBOOTPROTO=static\n");
        });
    }

    std::optional<VirtualCable> cable_;
    std::optional<Node> here_;
};

// /sbin/dhcpcd is this script, and the tools that it and the library run are those of the root.
class ScriptedClient {
  public:
    explicit ScriptedClient(std::string_view script)
    {
        scenario_.InAnyOrder();
        for (const char *tool : {"ifconfig", "route", "ip"})
            Expect(tool, std::string("#!/bin/sh\nexec /bin/busybox ") + tool + " \"$@\"\n");
        Expect("dhcpcd", script);
    }

  private:
    // The library names the whole path, the start script does not.
    void Expect(const std::string &tool, std::string_view script)
    {
        for (const char *folder : {"/sbin/", ""})
            scenario_.ExpectAny(folder + tool).AnyTimes().Runs(script);
    }

    Scenario scenario_;
};

}  // namespace test

#endif
