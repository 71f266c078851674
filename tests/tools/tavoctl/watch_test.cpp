// tavoctl watch where the kernel is this machine's: mounts, links, addresses and services of a root of its own.
#include "run_tavoctl.h"
#include "support/machine.h"
#include "support/test.h"

#include <nlohmann/json.hpp>

namespace {

using nlohmann::json;

// Runs the watch with its output in a file until it is stopped.
class Watching {
  public:
    explicit Watching(const std::string &options = {})
    {
        std::filesystem::remove(place);
        pid_ = std::stoi(test::Told("tavoctl watch --json " + options + " >>" + place + " 2>&1 & echo $!"));
        ::usleep(500'000);
    }
    ~Watching() { test::Shell("kill " + std::to_string(pid_)); }

    bool Tells(const char *event, const std::string &object, const std::string &detail = "") const
    {
        return test::Eventually([&] {
            std::istringstream lines(test::ReadFile(place));
            for (std::string line; std::getline(lines, line);) {
                const json facts = json::parse(line, nullptr, false);
                if (facts.is_object() && facts.at("event") == event && facts.at("object") == object &&
                    facts.value("detail", json()).dump().find(detail) != std::string::npos)
                    return true;
            }
            return false;
        });
    }

    // What it and the programs that it starts have used of the processor, in the kernel's ticks.
    long Ticks() const
    {
        std::istringstream words(test::ReadFile("/proc/" + std::to_string(pid_) + "/stat"));
        std::string word;
        long ticks = 0;
        for (int field = 1; words >> word; ++field)
            ticks += field >= 14 && field <= 17 ? std::stol(word) : 0;
        return ticks;
    }

    bool EndsWhenAsked() const
    {
        test::Shell("kill " + std::to_string(pid_));
        return test::Eventually([&] { return !std::filesystem::exists("/proc/" + std::to_string(pid_)); });
    }

    static constexpr char place[] = "/tmp/watched";

  private:
    int pid_;
};

TEST(TavoctlWatch, ReportsMountsServicesLinksAndAddresses)
{
    if (test::RootLacks("mount") || test::RootLacks("net"))
        GTEST_SKIP() << "nothing may be mounted here";
    const Watching watching;
    test::Told("mkdir -p /volume7 && mount -t tmpfs room /volume7");
    EXPECT_TRUE(watching.Tells("volume-mounted", "/volume7", "room"));
    test::Told("umount /volume7");
    EXPECT_TRUE(watching.Tells("volume-unmounted", "/volume7"));

    test::Told("tavoctl service start crond");
    EXPECT_TRUE(watching.Tells("service-up", "crond", "pid "));
    test::Told("tavoctl service stop crond");
    EXPECT_TRUE(watching.Tells("service-down", "crond")) << test::ReadFile(Watching::place);
    // One that is killed.
    test::Told(": >/tmp/watched; tavoctl service start crond");
    EXPECT_TRUE(watching.Tells("service-up", "crond", "pid "));
    test::Told("kill -9 $(tavoctl service list --noheadings --output name,pid | awk '$1 == \"crond\" { print $2 }')");
    EXPECT_TRUE(watching.Tells("service-down", "crond")) << test::ReadFile(Watching::place);

    test::Told("ip link set lo up && ip addr add 10.9.8.7/24 dev lo");
    EXPECT_TRUE(watching.Tells("address-added", "lo", "10.9.8.7/24"));
    test::Told("ip addr del 10.9.8.7/24 dev lo");
    EXPECT_TRUE(watching.Tells("address-removed", "lo", "10.9.8.7/24"));

    // Files that come and go beside the pid files, its own among them, are nothing to look at.
    const long before = watching.Ticks();
    test::Told("for i in 1 2 3 4 5 6 7 8 9 10; do : >/tmp/nothing$i; rm /tmp/nothing$i; sleep 0.1; done");
    EXPECT_LE(watching.Ticks() - before, 5);
    EXPECT_TRUE(watching.EndsWhenAsked());
}

TEST(TavoctlWatch, RunsAProgramForEachEvent)
{
    if (test::RootLacks("mount"))
        GTEST_SKIP() << "nothing may be mounted here";
    test::WriteFile("/tmp/tell", "#!/bin/sh\necho \"$1,$2,$3\" >>/tmp/heard\n");
    test::Told("chmod 755 /tmp/tell");
    const Watching watching("--exec /tmp/tell");
    test::Told("mkdir -p /volume8 && mount -t tmpfs room /volume8");
    EXPECT_TRUE(watching.Tells("volume-mounted", "/volume8"));
    EXPECT_TRUE(test::Eventually([] {
        return std::filesystem::exists("/tmp/heard") &&
               test::ReadFile("/tmp/heard") == "volume-mounted,/volume8,room\n";
    }));
    test::Told("umount /volume8");
}

}  // namespace
