// tavoctl service: switching services, and where they keep their data.
#include "tavo_service.h"

#include "frame/failure.h"
#include "frame/progress.h"
#include "service/service.h"
#include "service/service_state.h"

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

Action SwitchServices(Arguments &in, const ServiceAction &action)
{
    const auto names = in.Texts("SERVICE", service_kind, service_help);
    Given<std::optional<int64_t>> wait;
    Given<bool> force;
    if (action.running.value_or(true))
        wait = in.Number("--wait", "SECONDS", "until it runs, at most that long; else it is a failure", 1);
    if (action.binds)
        force = in.Flag("--force", "also when the volume of its data is not mounted");
    return [=, &action](Call &call) {
        const std::vector<int> ids = FindServices(*names);
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

}  // namespace

Action ServiceEnable(Arguments &in)
{
    return SwitchServices(in, enable_action);
}

Action ServiceDisable(Arguments &in)
{
    return SwitchServices(in, disable_action);
}

Action ServiceStart(Arguments &in)
{
    return SwitchServices(in, start_action);
}

Action ServiceStop(Arguments &in)
{
    return SwitchServices(in, stop_action);
}

Action ServiceRestart(Arguments &in)
{
    return SwitchServices(in, restart_action);
}

Action ServiceReload(Arguments &in)
{
    const auto names = in.Texts("SERVICE", service_kind, service_help);
    return [=](Call &call) {
        const std::vector<int> ids = FindServices(*names);
        for (const std::string &name : *names)
            call.Change("service " + name, "settings", {}, "read again");
        if (!call.Proceed())
            return;
        for (const int id : ids) {
            const std::string what = std::string("reload ") + TAVOServiceNameGet(id);
            const uint32_t mask = ReloadMask(id);
            if (!mask)
                throw Failure{.attempted = what,
                              .reason = "it has no daemon that could reload",
                              .hint = "restart it instead",
                              .status = exit_failed};
            const int done = TAVONetService(mask, TAVO_DAEMON_RELOAD);
            Must(done >= 0, what);
            if (!done)
                throw Failure{.attempted = what,
                              .reason = "no daemon took the signal",
                              .hint = "is it running? a daemon that knows no reload is restarted instead",
                              .status = StateOf(id).running == false ? exit_not_found : exit_failed};
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
        if (folders.empty())
            throw UsageFailure(attempted, "it keeps no data on a volume");
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

}  // namespace tavoctl
