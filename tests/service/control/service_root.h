// The appliance root as the services' tests use it: two volumes, stand-in daemons, the log of the start-up scripts.
#ifndef TESTS_SERVICE_CONTROL_SERVICE_ROOT_H
#define TESTS_SERVICE_CONTROL_SERVICE_ROOT_H

#include "tavo_file.h"
#include "tavo_service.h"

#include "support/story.h"
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

// Lines of the settings that were not there the last time.
inline Story::Source ChangedSettings()
{
    return [before = std::vector<std::string>()]() mutable {
        std::vector<std::string> now, changed;
        std::ifstream file("/etc/tavoinfo.conf");
        for (std::string line; std::getline(file, line); now.push_back(line)) {
            if (std::find(before.begin(), before.end(), line) == before.end())
                changed.push_back("setting " + line);
        }
        before = now;
        return changed;
    };
}

// What is switched: each call with its scripts, settings, links, records of shares, and folders on the volumes.
class Switched : public testing::Test {
  protected:
    CapturedLog log_;
    Story story_{TEST_GOLDEN,
                 {ScriptCalls, LogOf(log_), ChangedSettings()},
                 {"/usr/tavo/etc/share.conf", "/var/services", "/volume1", "/volume2", "/volume2/@database"}};
};

// /volume1 is smaller than /volume2.
class Services : public Switched {
  protected:
    void SetUp() override
    {
        if (RootLacks("mount"))
            GTEST_SKIP() << "volumes cannot be mounted here";
        for (const char *volume : {"/volume1", "/volume2"}) {
            if (!Mount(volume))
                GTEST_SKIP() << volume << " cannot be mounted here: " << std::strerror(errno);
        }
    }

    void TearDown() override
    {
        for (const char *volume : {"/volume1", "/volume2"})
            ::umount2(volume, MNT_DETACH);
    }

    static bool Mount(const std::string &volume)
    {
        ::mkdir(volume.c_str(), 0755);
        return ::mount("tmpfs", volume.c_str(), "tmpfs", 0, volume == "/volume1" ? "size=4m" : "size=8m") == 0;
    }

    // What the call returns, and the text that it writes.
    static std::string Answer(auto call, auto argument)
    {
        char text[52] = "";
        const int result = call(argument, text, sizeof text);
        return std::to_string(result) + " " + text;
    }

    static std::string Folder(int id)
    {
        TAVOSERVICESHARE share = {};
        std::ostringstream text;
        text << TAVOServiceSettingGet(id, &share) << " " << share.szShareName << " at " << share.szVolume << " of "
             << share.szVolumePath << ", on a volume " << share.fOnVolume << ", special " << share.fSpecialVolume
             << ", supported " << share.fSupported << ", constants " << share.nId << share.nNaming << share.nAttributeA
             << share.nAttributeB << share.nReserved;
        return text.str();
    }
};

}  // namespace test

#endif
