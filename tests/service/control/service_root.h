// The appliance root as the services' tests use it: two volumes, stand-in daemons, the log of the start-up scripts.
#ifndef TESTS_SERVICE_CONTROL_SERVICE_ROOT_H
#define TESTS_SERVICE_CONTROL_SERVICE_ROOT_H

#include "tavo_file.h"
#include "tavo_service.h"

#include "support/test.h"

#include <sys/mount.h>

namespace test {

inline constexpr const char *script_log = "/var/standin/rc.log";

// What start-up scripts wrote since the last call: when each begins, "S80samba.sh start", and when it ends.
inline std::vector<std::string> ScriptEvents()
{
    std::vector<std::string> events;
    std::ifstream log(script_log);
    for (std::string line; std::getline(log, line);)
        events.push_back(line);
    std::filesystem::remove(script_log);
    return events;
}

// Only the calls, in the order in which they began.
inline std::vector<std::string> ScriptCalls()
{
    std::vector<std::string> calls = ScriptEvents();
    std::erase_if(calls, [](const std::string &line) { return line.find(" = ") != std::string::npos; });
    return calls;
}

inline std::string Setting(const char *key)
{
    char value[16] = "";
    return TLIBFileGetKeyValue("/etc/tavoinfo.conf", key, value, sizeof value, 0) > 0 ? value : "(none)";
}

// Daemons start and end a moment after their scripts have ended.
inline bool IsUp(int service)
{
    return Eventually([&] { return TAVOServiceStatusGet(service) == 1; });
}

// Returns the process of a stand-in, whatever its pid file says; 0 when it does not run.
inline pid_t DaemonPid(const std::string &name)
{
    pid_t pid = 0;
    std::ifstream("/var/standin/" + name + ".pid") >> pid;
    return pid > 0 && ::kill(pid, 0) == 0 ? pid : 0;
}

inline bool Runs(const std::string &name)
{
    return Eventually([&] { return DaemonPid(name) != 0; });
}

inline bool HasEnded(const std::string &name)
{
    return Eventually([&] { return DaemonPid(name) == 0; });
}

inline std::string LinkTarget(const char *link)
{
    std::error_code none;
    return std::filesystem::read_symlink(link, none);
}

// Ends every stand-in, even a stubborn one, and removes its modes.
inline void ResetStandins()
{
    std::error_code none;
    for (const auto &entry : std::filesystem::directory_iterator("/var/standin", none)) {
        const std::string name = entry.path().stem();
        if (entry.path().extension() == ".pid") {
            if (const pid_t pid = DaemonPid(name))
                ::kill(pid, SIGKILL);
        }
    }
    for (const auto &entry : std::filesystem::directory_iterator("/var/standin", none))
        std::filesystem::remove(entry.path(), none);
}

// /volume1 is smaller than /volume2.
class Services : public testing::Test {
  protected:
    void SetUp() override
    {
        if (RootLacks("mount"))
            GTEST_SKIP() << "volumes cannot be mounted here";
        for (const char *volume : {"/volume1", "/volume2"}) {
            ::mkdir(volume, 0755);
            if (::mount("tmpfs", volume, "tmpfs", 0, std::strcmp(volume, "/volume1") ? "size=8m" : "size=4m") != 0)
                GTEST_SKIP() << volume << " cannot be mounted here: " << std::strerror(errno);
        }
    }

    void TearDown() override
    {
        for (const char *volume : {"/volume1", "/volume2"})
            ::umount2(volume, MNT_DETACH);
    }

    CapturedLog log_;
};

}  // namespace test

#endif
