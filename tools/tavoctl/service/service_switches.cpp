// tavoctl service: switching services, and where they keep their data.
#include "frame/failure.h"
#include "frame/program.h"
#include "frame/progress.h"
#include "frame/table.h"
#include "service/service.h"
#include "service/service_state.h"

#include "tavo_service.h"

#include <algorithm>
#include <array>
#include <climits>

#include <sys/stat.h>
#include <unistd.h>

namespace tavoctl {
namespace {

std::vector<int32_t> FoldersOf(int id)
{
    std::vector<int32_t> folders;
    for (const int32_t *folder = TAVOServiceShareIDGet(id); *folder != TAVO_SERVICE_SHARE_END; ++folder)
        folders.push_back(*folder);
    return folders;
}

std::vector<int> FindServices(const std::vector<std::string> &names)
{
    std::vector<int> ids;
    for (const std::string &name : names)
        ids.push_back(FindService(name));
    return ids;
}

// A start-up script ends before its daemon is up, and says nothing of one that dies a moment later.
void AwaitRunning(int id, int seconds)
{
    const std::string name = TAVOServiceNameGet(id);
    Progress progress("waiting for " + name);
    constexpr int looks_a_second = 10;
    for (int look = 0; look <= seconds * looks_a_second; ++look) {
        const ServiceState state = StateOf(id);
        if (!state.running || *state.running)
            return;
        progress.Show(std::to_string(seconds - look / looks_a_second) + " s left");
        ::usleep(1'000'000 / looks_a_second);
    }
    throw Failure{.attempted = "bring " + name + " up",
                  .reason = "it is not running after " + std::to_string(seconds) + " s",
                  .hint = "look at the system log",
                  .status = exit_failed};
}

// One verb an action; the actions differ in their number and in what there is to say.
template <class Action>
class ServiceSwitch : public Verb {
  public:
    static constexpr VerbInfo info = Action::info;

    void Declare(Arguments &arguments) override
    {
        arguments.Texts("SERVICE", names_, "the name of the service", 1, ServiceNames);
        if (Action::starts)
            arguments.Number("--wait", "SECONDS", wait_, "until it runs, at most that long; else it is a failure", 1);
    }

    int Run(const Call &call) override
    {
        const std::vector<int> ids = FindServices(names_);
        if (call.dry_run)
            return ShowFolders(call, ids);
        for (const int id : ids) {
            const std::string what = std::string(info.name) + " " + TAVOServiceNameGet(id);
            TLIBErrSet(ERR_SUCCESS);
            if (TAVOServiceActionSet(id, Action::code) != 0)
                throw LibraryFailure(what);
            if (wait_ > 0)
                AwaitRunning(id, wait_);
        }
        return exit_done;
    }

  private:
    static int ShowFolders(const Call &call, const std::vector<int> &ids)
    {
        Table table({"service", "folder", "there"});
        for (const int id : ids) {
            for (const int32_t folder : FoldersOf(id)) {
                char volume[PATH_MAX];
                char path[PATH_MAX];
                struct stat st;
                if (TAVOServiceNewVolumeDecide(folder, volume, sizeof volume) < 1 ||
                    TAVOServiceShareGen(folder, volume, path, sizeof path) < 0)
                    throw LibraryFailure(std::string("find a volume for ") + TAVOServiceNameGet(id));
                table.Add({TAVOServiceNameGet(id), path, ::lstat(path, &st) == 0 && S_ISDIR(st.st_mode)});
            }
        }
        call.Print(table);
        return exit_done;
    }

    std::vector<std::string> names_;
    int wait_ = 0;
};

struct Enable {
    static constexpr int code = TAVO_SERVICE_ENABLE;
    static constexpr bool starts = true;
    static constexpr VerbInfo info = {
        "enable", changes | tells_before,
        "Enables services. Binds their data folders, on the volume where they are or else on the one with the most "
        "free "
        "space, sets their keys and starts them. With --dry-run, lists the folders that it would bind.",
        "tavoctl service enable samba\n"
        "tavoctl service enable --wait 10 ftp ssh\n"
        "tavoctl service enable --dry-run media"};
};

struct Disable {
    static constexpr int code = TAVO_SERVICE_DISABLE;
    static constexpr bool starts = false;
    static constexpr VerbInfo info = {
        "disable", changes,
        "Disables services. Sets their keys, stops them and releases their data folders. Data is not deleted, and a "
        "folder that another enabled service uses stays bound.",
        "tavoctl service disable telnet"};
};

struct Start {
    static constexpr int code = TAVO_SERVICE_START;
    static constexpr bool starts = true;
    static constexpr VerbInfo info = {"start", changes, "Starts services; whether they are enabled stays as it is.",
                                      "tavoctl service start --wait 10 crond"};
};

struct Stop {
    static constexpr int code = TAVO_SERVICE_STOP;
    static constexpr bool starts = false;
    static constexpr VerbInfo info = {"stop", changes,
                                      "Stops services until they are started again; whether they are enabled stays as "
                                      "it is.",
                                      "tavoctl service stop media itunes"};
};

struct Restart {
    static constexpr int code = TAVO_SERVICE_RESTART;
    static constexpr bool starts = true;
    static constexpr VerbInfo info = {"restart", changes, "Restarts services.",
                                      "tavoctl service restart DB\n"
                                      "tavoctl service restart --wait 10 web"};
};

// The daemons that are told to read their settings anew. Two services are driven otherwise and have a daemon all the same.
uint32_t ReloadMask(int id)
{
    const std::string name = TAVOServiceNameGet(id);
    if (name == "samba")
        return TAVO_DAEMON_SMB;
    if (name == "https")
        return TAVO_DAEMON_WEB_SYSTEM;
    return static_cast<uint32_t>(TAVOServiceDaemonIDGet(id));
}

class ServiceReload : public Verb {
  public:
    static constexpr VerbInfo info = {"reload", changes,
                                      "Tells running services to read their settings anew, by a hang-up signal.",
                                      "tavoctl service reload samba"};

    void Declare(Arguments &arguments) override
    {
        arguments.Texts("SERVICE", names_, "the name of the service", 1, ServiceNames);
    }

    int Run(const Call &) override
    {
        for (const int id : FindServices(names_)) {
            const std::string what = std::string("reload ") + TAVOServiceNameGet(id);
            const uint32_t mask = ReloadMask(id);
            if (!mask)
                throw Failure{.attempted = what,
                              .reason = "it has no daemon that could be told",
                              .hint = "restart it instead",
                              .status = exit_failed};
            const int done = TAVONetService(mask, TAVO_DAEMON_RELOAD);
            if (done < 0)
                throw LibraryFailure(what);
            if (!done)
                throw Failure{.attempted = what,
                              .reason = "no daemon took the signal",
                              .hint = "is it running? a daemon that knows no reload is restarted instead",
                              .status = StateOf(id).running == false ? exit_not_found : exit_failed};
        }
        return exit_done;
    }

  private:
    std::vector<std::string> names_;
};

// "/volume2", which may be written as "2".
std::string VolumePath(const std::string &word)
{
    return word.starts_with("/") ? word : "/volume" + word;
}

void RequireMounted(const std::string &volume)
{
    const std::vector<std::string> volumes = MountedVolumes();
    if (std::find(volumes.begin(), volumes.end(), volume) == volumes.end())
        throw Failure{.attempted = "use the volume " + volume,
                      .reason = "it is not mounted",
                      .hint = "volumes are /volume1, /volume2, ... in /proc/mounts",
                      .status = exit_not_found};
}

class ServiceVolume : public Verb {
  public:
    static constexpr VerbInfo info = {"volume", changes | tells_before,
                                      "Binds the data folders of a service to another volume and restarts the enabled "
                                      "services that use them. The data "
                                      "itself is not moved.",
                                      "tavoctl service volume web /volume2\n"
                                      "tavoctl service volume --dry-run media 2"};

    void Declare(Arguments &arguments) override
    {
        arguments.Text("SERVICE", name_, "the name of the service", ServiceNames);
        arguments.Text("VOLUME", volume_, "the volume, such as /volume2", MountedVolumes);
    }

    int Run(const Call &call) override
    {
        const int id = FindService(name_);
        const std::string volume = VolumePath(volume_);
        RequireMounted(volume);
        const std::vector<int32_t> folders = FoldersOf(id);
        if (folders.empty())
            throw UsageFailure("bind " + name_ + " to " + volume, "it keeps no data on a volume");
        if (call.dry_run)
            return ShowMove(call, folders, volume);
        for (const int32_t folder : folders) {
            if (TAVOServiceVolumeChange(folder, volume.c_str()) != 0)
                throw LibraryFailure("bind " + name_ + " to " + volume);
        }
        return exit_done;
    }

  private:
    static int ShowMove(const Call &call, const std::vector<int32_t> &folders, const std::string &volume)
    {
        Table table({"link", "from", "to"});
        for (const int32_t folder : folders) {
            TAVOSERVICESHARE share = {};
            char path[PATH_MAX];
            TAVOServiceSettingGet(folder, &share);
            if (TAVOServiceShareGen(folder, volume.c_str(), path, sizeof path) < 0)
                throw LibraryFailure("name the folder on " + volume);
            table.Add({share.szLink, Known(share.szVolume), path});
        }
        call.Print(table);
        return exit_done;
    }

    std::string name_;
    std::string volume_;
};

class ServiceRestore : public Verb {
  public:
    static constexpr VerbInfo info = {
        "restore", changes,
        "Brings services back after their volume has come back. Binds the data folders that are on it again and starts "
        "the enabled services that use them. Without VOLUME: enables the services again that have lost theirs, on the "
        "volumes that there are.",
        "tavoctl service restore /volume1\n"
        "tavoctl service restore"};

    void Declare(Arguments &arguments) override
    {
        arguments.OptionalText("VOLUME", volume_, "the volume, such as /volume2", MountedVolumes);
    }

    int Run(const Call &) override
    {
        if (volume_.empty()) {
            if (TAVOServiceRestartfromVolumeNone() < 0)
                throw LibraryFailure("restore the services");
            return exit_done;
        }
        const std::string volume = VolumePath(volume_);
        RequireMounted(volume);
        if (TAVOServiceRestore(volume.c_str()) < 0)
            throw LibraryFailure("restore the services of " + volume);
        return exit_done;
    }

  private:
    std::string volume_;
};

}  // namespace

void AddServiceSwitches(Family &service)
{
    service.Add<ServiceSwitch<Enable>>();
    service.Add<ServiceSwitch<Disable>>();
    service.Add<ServiceSwitch<Start>>();
    service.Add<ServiceSwitch<Stop>>();
    service.Add<ServiceSwitch<Restart>>();
    service.Add<ServiceReload>();
    service.Add<ServiceVolume>();
    service.Add<ServiceRestore>();
}

}  // namespace tavoctl
