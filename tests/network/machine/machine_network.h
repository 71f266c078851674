// The machine's two cards, started from interface files of the test.
#ifndef TESTS_NETWORK_MACHINE_MACHINE_NETWORK_H
#define TESTS_NETWORK_MACHINE_MACHINE_NETWORK_H

#include "support/machine.h"
#include "support/test.h"

namespace test {

inline const std::string kScripts = "/etc/sysconfig/network-scripts/";

class MachineNetwork : public MachineTest {
  protected:
    static void Start(const char *eth0, const char *eth1, const char *settings)
    {
        std::filesystem::create_directories(kScripts);
        for (const auto &entry : std::filesystem::directory_iterator(kScripts))
            std::filesystem::remove(entry);
        WriteFile(kScripts + "ifcfg-eth0", eth0);
        WriteFile(kScripts + "ifcfg-eth1", eth1);
        WriteFile("/etc/sysconfig/network", settings);
        Told("/etc/rc.network start");
    }

    void TearDown() override
    {
        if (OnMachine())
            Told(
                "/etc/rc.network stop; killall findhostd 2>/dev/null; hostname appliance; /usr/lib/tavo-machine/reset");
    }
};

}  // namespace test

#endif
