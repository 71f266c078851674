// The present state of a service.
#include "service/service_state.h"

#include "tavo_file.h"
#include "tavo_proc.h"

#include "frame/containers.h"
#include "frame/failure.h"
#include "frame/host.h"
#include "frame/processes.h"
#include "frame/text.h"
#include "storage/mounted_volumes.h"

#include <strings.h>

namespace tavoctl {
namespace {

std::optional<bool> IsEnabled(const char *key)
{
    char value[8];
    if (!key || TLIBFileGetKeyValue(settings_file, key, value, sizeof value, 0) <= 0)
        return {};
    if (::strcasecmp(value, "yes") == 0)
        return true;
    return ::strcasecmp(value, "no") == 0 ? std::optional(false) : std::nullopt;
}

void AddFolders(ServiceState &state)
{
    for (const int32_t folder : FoldersOf(state.id)) {
        TAVOSERVICESHARE share = {};
        const bool there = TAVOServiceSettingGet(folder, &share) == 1;
        state.bound = there && state.bound.value_or(true);
        state.shares.emplace_back(share.szShareName);
        const std::string volume = share.szVolumePath;
        if (!volume.empty() && !Contains(state.volumes, volume))
            state.volumes.push_back(volume);
    }
}

void AddProcess(ServiceState &state, const std::string &proc)
{
    if (proc.find('/') == std::string::npos)
        state.pid = ProcessOf(proc);
    else if (TLIBProcAliveByPidFile(proc.c_str()) == 1 && !CommandLine(TLIBReadPidFile(proc.c_str())).empty())
        state.pid = TLIBReadPidFile(proc.c_str());
    state.running = state.pid > 0;
    if (state.pid > 0)
        state.since = StartOf(state.pid);
}

}  // namespace

int FindService(const std::string &name)
{
    const int id = TAVOServiceIndexGet(name.c_str());
    if (id < 0)
        throw Absent("find the service " + name, "there is none of that name",
                     DidYouMean(name, ServiceNames(), "tavoctl service list --all shows them"));
    return id;
}

ServiceState StateOf(int id, bool may_wait)
{
    ServiceState state;
    state.id = id;
    state.name = TAVOServiceNameGet(id);
    const char *key = TAVOServiceKeyGet(id);
    state.enabled = IsEnabled(key);
    AddFolders(state);
    // A service without a process of its own runs when the library reports that all it needs is there. For a service
    // without any of this, such as the stack of database servers, the state is not known.
    if (const char *proc = TAVOServiceProcGet(id))
        AddProcess(state, proc);
    else if (may_wait && (key || state.bound))
        state.running = TAVOServiceStatusGet(id) == 1;
    return state;
}

std::vector<std::string> ServiceNames()
{
    std::vector<std::string> names;
    for (int id = 0; const char *name = TAVOServiceNameGet(id); ++id)
        names.emplace_back(name);
    return names;
}

std::vector<int32_t> FoldersOf(int id)
{
    std::vector<int32_t> folders;
    for (const int32_t *folder = TAVOServiceShareIDGet(id); *folder != TAVO_SERVICE_SHARE_END; ++folder)
        folders.push_back(*folder);
    return folders;
}

std::vector<std::string> VolumePaths()
{
    return Mapped(MountedVolumes(), &MountedVolume::path);
}

bool IsMounted(const std::string &volume)
{
    return Contains(VolumePaths(), volume);
}

const ArgumentKind service_kind = {.name = "service", .candidates = ServiceNames, .sample = "no-service"};

const ArgumentKind mounted_kind = {.name = "volume", .candidates = VolumePaths, .sample = "/volume9998"};

std::string VolumePath(const std::string &word)
{
    return word.starts_with("/") ? word : "/volume" + word;
}

void RequireMounted(const std::string &volume)
{
    FailIf(!IsMounted(volume), "use the volume " + volume, "it is not mounted",
           "volumes are /volume1, /volume2, ... in /proc/mounts", exit_not_found);
}

}  // namespace tavoctl
