// Network cards of a test's own: /sys/class/net, the kernel's routes, and the addresses that a socket tells of.
#ifndef TESTS_NETWORK_NET_CARDS_H
#define TESTS_NETWORK_NET_CARDS_H

#include "support/device_tree.h"
#include "support/recorded_calls.h"
#include "support/test.h"

#include <arpa/inet.h>
#include <net/if.h>
#include <sys/ioctl.h>

namespace test {

inline const std::string kScripts = "/etc/sysconfig/network-scripts/";

class Cards : public testing::Test {
  protected:
    Cards() : calls_([this](int, unsigned long request, void *argument) { return Answer(request, argument); })
    {
        std::filesystem::remove_all(kScripts);
        std::filesystem::create_directories(kScripts);
        std::filesystem::create_directories("/etc/dhcpc");
        WriteFile("/etc/sysconfig/network", "GATEWAY=192.0.2.1\nHOSTNAME=tavo\n");
        SetRoutes("");
    }

    // An empty address: the card has none; "unreadable": the kernel does not say.
    void AddCard(const std::string &name, const std::string &address = "", const std::string &mask = "255.255.255.0")
    {
        const std::string folder = "/sys/class/net/" + name;
        tree_.Put(folder + "/type", "1\n");
        tree_.Put(folder + "/address", "02:00:00:00:00:0a\n");
        tree_.Put(folder + "/mtu", "9000\n");
        tree_.Put(folder + "/carrier", "1\n");
        if (!address.empty())
            addresses_[name] = {address, mask};
    }

    void SetRoutes(const std::string &rows)
    {
        tree_.Put("/proc/net/route",
                  "Iface\tDestination\tGateway \tFlags\tRefCnt\tUse\tMetric\tMask\t\tMTU\tWindow\tIRTT\n" + rows);
    }

    std::vector<std::string> Sleeps() const
    {
        std::vector<std::string> sleeps;
        for (const std::string &call : calls_.Calls()) {
            if (call.starts_with("sleep"))
                sleeps.push_back(call);
        }
        return sleeps;
    }

    int Answer(unsigned long request, void *argument)
    {
        ifreq ask;
        if (request != SIOCGIFADDR && request != SIOCGIFNETMASK) {
            errno = ENOTTY;
            return -1;
        }
        std::memcpy(&ask, argument, sizeof ask);
        const auto found = addresses_.find(ask.ifr_name);
        if (found == addresses_.end()) {
            errno = EADDRNOTAVAIL;
            return -1;
        }
        if (found->second.first == "unreadable") {
            errno = EIO;
            return -1;
        }
        sockaddr_in answer = {};
        answer.sin_family = AF_INET;
        ::inet_aton((request == SIOCGIFADDR ? found->second.first : found->second.second).c_str(), &answer.sin_addr);
        std::memcpy(&ask.ifr_addr, &answer, sizeof answer);
        std::memcpy(argument, &ask, sizeof ask);
        return 0;
    }

    DeviceTree tree_;
    RecordedCalls calls_;
    CapturedLog log_;
    std::map<std::string, std::pair<std::string, std::string>> addresses_;
};

}  // namespace test

#endif
