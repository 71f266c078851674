// Programs that change the network die at random moments: afterwards it is as it was or as it was asked for.
#include "tavo_net.h"

#include "machine_network.h"
#include "network/network_change.h"
#include "network/network_state.h"
#include "support/rounds.h"

#include <gtest/gtest.h>

#include <algorithm>
#include <chrono>
#include <csignal>
#include <cstdlib>
#include <filesystem>
#include <iostream>
#include <iterator>
#include <random>
#include <vector>

#include <sys/wait.h>
#include <unistd.h>

using test::NetworkChange;
using test::NetworkState;

namespace {

constexpr const char *kClient = "/sbin/dhcpcd";

class MachineDeath : public test::MachineNetwork {
  protected:
    void SetUp() override
    {
        MachineNetwork::SetUp();
        if (IsSkipped())
            return;
        Start("DEVICE=eth0\nBOOTPROTO=static\nIPADDR=192.0.2.20\nNETMASK=255.255.255.0\n",
              "# second\nDEVICE=eth1\nBOOTPROTO=none\n", "GATEWAY=192.0.2.99\nHOSTNAME=here\n");
        std::filesystem::create_directories("/etc/dhcpc");
        std::filesystem::rename(kClient, "/sbin/dhcpcd.real");
        test::WriteFile(kClient, test::kQuickClient, 0755);
        EXPECT_EQ(TAVOLnxSetHostname("here"), 0);
        EXPECT_EQ(test::SetAddress("192.0.2.20"), 0);
        EXPECT_EQ(test::SetServer("192.0.2.53"), 0);
        EXPECT_EQ(TAVONetSetMTUValue("eth0", 1500), 0);
    }

    void TearDown() override
    {
        if (test::OnMachine())
            std::filesystem::rename("/sbin/dhcpcd.real", kClient);
        MachineNetwork::TearDown();
    }

    // The change is made once to see its states and how long it takes, and then dies `deaths` times.
    void Try(const NetworkChange &change, int deaths)
    {
        SCOPED_TRACE(change.name);
        if (change.needs == NetworkChange::ipv6) {
            EXPECT_EQ(TAVONetIPv6Set("eth0", 0), 0);  // without addresses that no file has
            test::EnsureIPv6();
        }
        change.back();
        const std::string before = NetworkState();
        const auto begin = std::chrono::steady_clock::now();
        EXPECT_EQ(change.make(), 0);
        const auto took = std::chrono::steady_clock::now() - begin;
        const std::string asked = NetworkState();
        EXPECT_NE(asked, before);
        for (int i = 0; i < deaths && !HasFailure(); ++i) {
            change.back();
            EXPECT_EQ(NetworkState(), before);
            Die(change, std::chrono::duration_cast<std::chrono::microseconds>(took));
            // A command that is being started holds the lock of the dead program for a moment.
            EXPECT_TRUE(test::Comes([] { return TAVONetHostsRefresh() == 0; }));
            const std::string found = NetworkState();
            EXPECT_TRUE(found == before || found == asked) << found << "\nbefore:\n" << before << "\nasked:\n" << asked;
            EXPECT_TRUE(test::HasDefaultRoute());
            EXPECT_FALSE(std::filesystem::exists("/etc/network.undo"));
            undone_ += found == before;
        }
        change.back();
        if (change.needs == NetworkChange::client)
            test::BackToStatic();
    }

    void Die(const NetworkChange &change, std::chrono::microseconds took)
    {
        const pid_t child = ::fork();
        if (child == 0) {
            change.make();
            ::_exit(0);
        }
        ::usleep(static_cast<useconds_t>(random_() % static_cast<unsigned long>(took.count())));
        ::kill(child, SIGKILL);
        int status = 0;
        ::waitpid(child, &status, 0);
        died_ += WIFSIGNALED(status);
    }

    std::mt19937 random_{11};
    int died_ = 0;
    int undone_ = 0;
};

TEST_F(MachineDeath, AtAnyMomentLeavesTheNetworkAsItWasOrAsAsked)
{
    std::vector<const NetworkChange *> changes;
    for (const NetworkChange &change : test::kNetworkChanges)
        changes.push_back(&change);
    std::shuffle(changes.begin(), changes.end(), random_);
    const int count = static_cast<int>(changes.size());
    const int deaths = std::max(4, test::Rounds(50));
    for (int i = 0; i < std::min(count, deaths) && !HasFailure(); ++i)
        Try(*changes[static_cast<size_t>(i)], deaths / count + (i < deaths % count));
    EXPECT_GE(died_, deaths / 4);
    std::cout << died_ << " of " << deaths << " died, " << undone_ << " left the network as before\n";
}

}  // namespace
