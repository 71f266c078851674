// tavoctl service: switching services.
#include "frame/failure.h"
#include "frame/program.h"
#include "frame/progress.h"
#include "frame/table.h"
#include "service/service.h"
#include "service/service_state.h"

#include "tavo_service.h"

#include <algorithm>
#include <climits>

#include <sys/stat.h>
#include <unistd.h>

namespace tavoctl {
namespace {

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

// The library binds a folder whose volume is away to another volume, where it is empty: the service then starts without
// its data.
void RequireVolumes(int id)
{
    for (const int32_t folder : FoldersOf(id)) {
        TAVOSERVICESHARE share = {};
        TAVOServiceSettingGet(folder, &share);
        const std::string target = share.szVolume;
        const std::string volume = target.substr(0, target.find('/', 1));
        if (volume.starts_with("/volume") && !IsMounted(volume))
            throw Failure{.attempted = std::string("enable ") + TAVOServiceNameGet(id),
                          .reason = std::string("the data of ") + share.szShare + " is on " + volume +
                                    ", which is not mounted",
                          .hint = "--force uses an empty folder on another volume",
                          .status = exit_not_found};
    }
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
        if (Action::binds)
            arguments.Flag("--force", force_, "also when the volume of its data is not mounted");
    }

    int Run(const Call &call) override
    {
        const std::vector<int> ids = FindServices(names_);
        if (Action::binds && !force_)
            std::for_each(ids.begin(), ids.end(), RequireVolumes);
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
    bool force_ = false;
};

struct Enable {
    static constexpr int code = TAVO_SERVICE_ENABLE;
    static constexpr bool binds = true;
    static constexpr bool starts = true;
    static constexpr VerbInfo info = {
        "enable", changes | tells_before,
        "Enables services. Binds their data folders, on the volume where they are or else on the one with the most "
        "free "
        "space, sets their keys and starts them. Refuses a service whose data is on a volume that is not mounted. With "
        "--dry-run, lists the folders that it would bind.",
        "tavoctl service enable samba\n"
        "tavoctl service enable --wait 10 ftp ssh\n"
        "tavoctl service enable --dry-run media"};
};

struct Disable {
    static constexpr int code = TAVO_SERVICE_DISABLE;
    static constexpr bool binds = false;
    static constexpr bool starts = false;
    static constexpr VerbInfo info = {
        "disable", changes,
        "Disables services. Sets their keys, stops them and releases their data folders. Data is not deleted, and a "
        "folder that another enabled service uses stays bound.",
        "tavoctl service disable telnet"};
};

struct Start {
    static constexpr int code = TAVO_SERVICE_START;
    static constexpr bool binds = false;
    static constexpr bool starts = true;
    static constexpr VerbInfo info = {"start", changes, "Starts services; whether they are enabled stays as it is.",
                                      "tavoctl service start --wait 10 crond"};
};

struct Stop {
    static constexpr int code = TAVO_SERVICE_STOP;
    static constexpr bool binds = false;
    static constexpr bool starts = false;
    static constexpr VerbInfo info = {"stop", changes,
                                      "Stops services until they are started again; whether they are enabled stays as "
                                      "it is.",
                                      "tavoctl service stop media itunes"};
};

struct Restart {
    static constexpr int code = TAVO_SERVICE_RESTART;
    static constexpr bool binds = false;
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

}  // namespace

void AddServiceSwitches(Family &service)
{
    service.Add<ServiceSwitch<Enable>>();
    service.Add<ServiceSwitch<Disable>>();
    service.Add<ServiceSwitch<Start>>();
    service.Add<ServiceSwitch<Stop>>();
    service.Add<ServiceSwitch<Restart>>();
    service.Add<ServiceReload>();
}

}  // namespace tavoctl
