// Wake-on-LAN of a real card: applied, put back and kept by the start script.
#include "tavo_net.h"

#include "machine_network.h"

#include <gmock/gmock.h>

using test::Told;
using test::WriteFile;
using testing::HasSubstr;

namespace {

constexpr const char *kCard = "eth2";

class MachineWake : public test::MachineNetwork {
  protected:
    void SetUp() override
    {
        MachineNetwork::SetUp();
        if (IsSkipped())
            return;
        Told("modprobe 8139cp && [ -d /sys/class/net/eth2 ]");
        Start("DEVICE=eth0\nBOOTPROTO=none\n", "DEVICE=eth1\nBOOTPROTO=none\n", "HOSTNAME=appliance\n");
        WriteFile("/etc/tavoinfo.conf", "support_wol=\"yes\"\nwol_enabled_options=\"g\"\n");
        EXPECT_EQ(TAVONetWolSet(kCard, 0), 0);
    }

    void TearDown() override
    {
        if (test::OnMachine())
            Told("/etc/rc.network stop; modprobe -r 8139cp");
        MachineNetwork::TearDown();
    }

    static std::string Wakes() { return Told("ethtool eth2 | sed -n 's/^[[:space:]]*Wake-on: //p'"); }
};

TEST_F(MachineWake, IsAppliedAndPutBack)
{
    EXPECT_EQ(Wakes(), "d\n");
    EXPECT_EQ(TAVONetWolGet(kCard), 0);
    WriteFile("/tmp/net.json", R"({"format_version": 1, "cards": [{"name": "eth2", "wake_on_lan": true}]})");
    EXPECT_THAT(Told("tavoctl net apply --json /tmp/net.json"), HasSubstr("\"changed\": true"));
    EXPECT_EQ(Wakes(), "g\n");
    EXPECT_EQ(TAVONetWolGet(kCard), 1);
    EXPECT_THAT(Told("tavoctl net apply --json /tmp/net.json"), HasSubstr("\"changed\": false"));

    // The card forgets; the start script tells it.
    Told("/etc/rc.network stop; ethtool -s eth2 wol d; /etc/rc.network start");
    EXPECT_EQ(Wakes(), "g\n");

    // A later step fails.
    WriteFile("/tmp/net.json", R"({"format_version": 1, "cards": [{"name": "eth2", "wake_on_lan": false,
        "address": "192.0.2.10/24", "routes": ["233.252.0.0/24 via 198.18.0.1"]}]})");
    EXPECT_EQ(test::Shell("tavoctl net apply --no-probe /tmp/net.json").status, 1);
    EXPECT_EQ(Wakes(), "g\n");
    EXPECT_EQ(TAVONetCheckpointTake(), 0);
    EXPECT_EQ(TAVONetWolSet(kCard, 0), 0);
    EXPECT_EQ(Wakes(), "d\n");
    EXPECT_EQ(TAVONetCheckpointPutBack(), 0);
    EXPECT_EQ(Wakes(), "g\n");
}

}  // namespace
