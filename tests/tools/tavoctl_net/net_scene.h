// An appliance on a virtual cable for tests of tavoctl's network verbs: its files as an administrator wrote them, and what
// is compared before and after.
#ifndef TESTS_TOOLS_TAVOCTL_NET_NET_SCENE_H
#define TESTS_TOOLS_TAVOCTL_NET_NET_SCENE_H

#include "support/network_scene.h"
#include "tools/tavoctl/run_tavoctl.h"

#include <string>

namespace test {

inline constexpr const char *kScripts = "/etc/sysconfig/network-scripts/";
inline constexpr const char *kNetwork = "/etc/sysconfig/network";

// With a comment, and not in the order of the library.
inline constexpr const char *kOldFile =
    "# the rack\nIPADDR=192.0.2.10\nDEVICE=eth0\nNETMASK=255.255.255.0\nONBOOT=yes\n"
    "BOOTPROTO=static\n";
inline constexpr const char *kOldNetwork = "HOSTNAME=here\nGATEWAY=192.0.2.1\n";

inline void WriteOldFiles()
{
    WriteFile(kIfcfg, kOldFile);
    WriteFile(kNetwork, kOldNetwork);
}

// Returns the output of a shell command.
inline std::string Output(const std::string &command)
{
    const ScratchDir dir;
    ShellStatus("{ " + command + "; } >" + (dir / "out") + " 2>/dev/null");
    return ReadFile(dir / "out");
}

class NetScene : public NetworkScene {
  protected:
    void SetUp() override
    {
        if (RootLacks("foreign-exec"))
            GTEST_SKIP() << "runs tavoctl";
        NetworkScene::SetUp();
        if (IsSkipped())
            return;
        here_->Do([] { WriteOldFiles(); });
    }
};

}  // namespace test

#endif
