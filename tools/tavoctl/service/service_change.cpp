// tavoctl service: switching services, and where they keep their data.
#include "tavo_service.h"

#include "frame/program.h"
#include "frame/terminal.h"
#include "service/service_state.h"

#include <algorithm>
#include <climits>

#include <sys/stat.h>
#include <unistd.h>

namespace tavoctl {
namespace {

// A start-up script ends before its daemon is up, and says nothing of one that dies a moment later.
void AwaitRunning(int id, int64_t seconds)
{
    const std::string name = TAVOServiceNameGet(id);
    Progress progress("waiting for " + name);
    constexpr int looks_a_second = 10;
    for (int64_t look = 0; look <= seconds * looks_a_second; ++look) {
        const ServiceState state = StateOf(id);
        if (!state.running || *state.running)
            return;
        progress.Show(std::to_string(seconds - look / looks_a_second) + " s left");
        ::usleep(1'000'000 / looks_a_second);
    }
    throw Failure{"bring " + name + " up", "it is not running after " + std::to_string(seconds) + " s", log_hint};
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
        FailIf(volume.starts_with("/volume") && !IsMounted(volume), std::string("enable ") + TAVOServiceNameGet(id),
               std::string("the data of ") + share.szShare + " is on " + volume + ", which is not mounted",
               "--force uses an empty folder on another volume", exit_not_found);
    }
}

void CompareFolders(Call &call, int id)
{
    for (const int32_t folder : FoldersOf(id)) {
        char volume[PATH_MAX];
        char path[PATH_MAX];
        struct stat st;
        Must(TAVOServiceNewVolumeDecide(folder, volume, sizeof volume) >= 1 &&
                 TAVOServiceShareGen(folder, volume, path, sizeof path) >= 0,
             std::string("find a volume for ") + TAVOServiceNameGet(id));
        call.Change(path, "folder", ::lstat(path, &st) == 0 && S_ISDIR(st.st_mode), true);
    }
}

// The effect of the library's action on a service. An unknown state may become another one.
struct ServiceAction {
    const char *verb;
    int code;
    std::optional<bool> enabled;  // afterwards
    std::optional<bool> running;
    bool binds;
};

constexpr ServiceAction enable_action = {"enable", TAVO_SERVICE_ENABLE, true, true, true};
constexpr ServiceAction disable_action = {"disable", TAVO_SERVICE_DISABLE, false, false, false};
constexpr ServiceAction start_action = {"start", TAVO_SERVICE_START, {}, true, false};
constexpr ServiceAction stop_action = {"stop", TAVO_SERVICE_STOP, {}, false, false};
constexpr ServiceAction restart_action = {"restart", TAVO_SERVICE_RESTART, {}, {}, false};

void CompareService(Call &call, const ServiceAction &action, int id)
{
    const ServiceState state = StateOf(id);
    const std::string object = "service " + state.name;
    if (action.enabled)
        call.Change(object, "enabled", state.enabled, *action.enabled);
    if (action.running)
        call.Change(object, "running", state.running, *action.running);
    else
        call.Change(object, "running", state.running, "restarted");
    if (action.binds) {
        call.Change(object, "bound", state.bound, state.bound ? Cell(true) : Cell());
        CompareFolders(call, id);
    } else if (action.enabled) {
        call.Change(object, "bound", state.bound, state.bound ? Cell(false) : Cell());
    }
}

template <const ServiceAction &action>
Action SwitchServices(Arguments &in)
{
    const auto names = in.Texts("SERVICE", service_kind, service_help);
    Given<std::optional<int64_t>> wait;
    Given<bool> force;
    if (action.running.value_or(true))
        wait = in.Number("--wait", "SECONDS", "until it runs, at most that long; else it is a failure", 1);
    if (action.binds)
        force = in.Flag("--force", "also when the volume of its data is not mounted");
    return [=](Call &call) {
        const std::vector<int> ids = Mapped(*names, FindService);
        if (action.binds && !*force)
            std::for_each(ids.begin(), ids.end(), RequireVolumes);
        std::vector<bool> differs;
        for (const int id : ids) {
            const std::size_t before = call.report.changes.size();
            CompareService(call, action, id);
            differs.push_back(call.report.changes.size() > before);
        }
        if (call.dry_run)
            return;
        for (std::size_t i = 0; i < ids.size(); ++i) {
            TLIBErrSet(ERR_SUCCESS);
            if (differs[i])
                Must(TAVOServiceActionSet(ids[i], action.code) == 0,
                     std::string(action.verb) + " " + TAVOServiceNameGet(ids[i]));
            if (*wait)
                AwaitRunning(ids[i], **wait);
        }
    };
}

// The daemons that read their settings again on a signal. Two services are driven otherwise but have a daemon, too.
uint32_t ReloadMask(int id)
{
    const std::string name = TAVOServiceNameGet(id);
    if (name == "samba")
        return TAVO_DAEMON_SMB;
    if (name == "https")
        return TAVO_DAEMON_WEB_SYSTEM;
    return static_cast<uint32_t>(TAVOServiceDaemonIDGet(id));
}

Action ServiceReload(Arguments &in)
{
    const auto names = in.Texts("SERVICE", service_kind, service_help);
    return [=](Call &call) {
        const std::vector<int> ids = Mapped(*names, FindService);
        for (const std::string &name : *names)
            call.Change("service " + name, "settings", {}, "read again");
        if (!call.Proceed())
            return;
        for (const int id : ids) {
            const std::string what = std::string("reload ") + TAVOServiceNameGet(id);
            const uint32_t mask = ReloadMask(id);
            FailIf(!mask, what, "it has no daemon that could reload", "restart it instead");
            const int done = TAVONetService(mask, TAVO_DAEMON_RELOAD);
            Must(done >= 0, what);
            FailIf(!done, what, "no daemon took the signal",
                   "is it running? a daemon that knows no reload is restarted instead",
                   !done && StateOf(id).running == false ? exit_not_found : exit_failed);
        }
    };
}

Action ServiceVolume(Arguments &in)
{
    const auto name = in.Text("SERVICE", service_kind, service_help);
    const auto word = in.Text("VOLUME", mounted_kind, "the volume, such as /volume2");
    const auto force =
        in.Flag("--force", "also when the volume is not mounted: data goes to the system disk until then");
    return [=](Call &call) {
        const int id = FindService(*name);
        const std::string volume = VolumePath(*word);
        const std::string attempted = "bind " + *name + " to " + volume;
        if (!*force)
            RequireMounted(volume);
        const std::vector<int32_t> folders = FoldersOf(id);
        RefuseIf(folders.empty(), attempted, "it keeps no data on a volume");
        for (const int32_t folder : folders) {
            TAVOSERVICESHARE share = {};
            char path[PATH_MAX];
            TAVOServiceSettingGet(folder, &share);
            Must(TAVOServiceShareGen(folder, volume.c_str(), path, sizeof path) >= 0, "name the folder on " + volume);
            call.Change(share.szLink, "target", Maybe(share.szVolume), path);
        }
        if (!call.Proceed())
            return;
        for (const int32_t folder : folders)
            Must(TAVOServiceVolumeChange(folder, volume.c_str()) == 0, attempted);
    };
}

Action ServiceRestore(Arguments &in)
{
    const auto word = in.OptionalText("VOLUME", mounted_kind, "the volume, such as /volume2");
    return [=](Call &call) {
        const std::string volume = *word ? VolumePath(**word) : "";
        if (*word)
            RequireMounted(volume);
        call.Change(*word ? "services of " + volume : "services without their volume", "bound", {}, true);
        if (!call.Proceed())
            return;
        if (*word)
            Must(TAVOServiceRestore(volume.c_str()) >= 0, "restore the services of " + volume);
        else
            Must(TAVOServiceRestartfromVolumeNone() >= 0, "restore the services");
    };
}

}  // namespace

void AddServiceChanges(Family &service)
{
    service.Add("enable", changes, SwitchServices<enable_action>,
                R"(Enables services. Binds their data folders, on the volume where
they are or else on the one with the most free space, sets their keys and starts them. Refuses a service whose data is
on a volume that is not mounted.

tavoctl service enable samba
tavoctl service enable --wait 10 ftp ssh
tavoctl service enable --dry-run media)");
    service.Add("disable", changes, SwitchServices<disable_action>,
                R"(Disables services. Sets their keys, stops them and releases
their data folders. Data is not deleted, and a folder that another enabled service uses stays bound.

tavoctl service disable telnet)");
    service.Add("start", changes, SwitchServices<start_action>,
                R"(Starts services; whether they are enabled stays as it is.

tavoctl service start --wait 10 crond)");
    service.Add("stop", changes, SwitchServices<stop_action>,
                R"(Stops services until they are started again; whether they are
enabled stays as it is.

tavoctl service stop media itunes)");
    service.Add("restart", changes, SwitchServices<restart_action>, R"(Restarts services.

tavoctl service restart DB
tavoctl service restart --wait 10 web)");
    service.Add("reload", changes, ServiceReload, R"(Sends running services a hang-up signal, on which they read their
settings again.

tavoctl service reload samba)");
    service.Add("volume", changes, ServiceVolume, R"(Binds the data folders of a service to another volume and
restarts the enabled services that use them. The data itself is not moved.

tavoctl service volume web /volume2
tavoctl service volume --force web /volume3
tavoctl service volume --dry-run media 2)");
    service.Add("restore", changes, ServiceRestore, R"(Brings services back after their volume has come back. Binds the
data folders that are on it again and starts the enabled services that use them. Without VOLUME: enables the services
again that have lost theirs, on the volumes that there are.

tavoctl service restore /volume1
tavoctl service restore)");
}

}  // namespace tavoctl
