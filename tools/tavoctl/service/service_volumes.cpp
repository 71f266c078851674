// tavoctl service: where services keep their data.
#include "frame/failure.h"
#include "frame/program.h"
#include "frame/table.h"
#include "service/service.h"
#include "service/service_state.h"

#include "tavo_service.h"

#include <climits>

namespace tavoctl {
namespace {

// "/volume2", which may be written as "2".
std::string VolumePath(const std::string &word)
{
    return word.starts_with("/") ? word : "/volume" + word;
}

void RequireMounted(const std::string &volume)
{
    if (!IsMounted(volume))
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
                                      "tavoctl service volume --force web /volume3\n"
                                      "tavoctl service volume --dry-run media 2"};

    void Declare(Arguments &arguments) override
    {
        arguments.Text("SERVICE", name_, "the name of the service", ServiceNames);
        arguments.Text("VOLUME", volume_, "the volume, such as /volume2", MountedVolumes);
        arguments.Flag("--force", force_,
                       "also when the volume is not mounted: data goes to the system disk until then");
    }

    int Run(const Call &call) override
    {
        const int id = FindService(name_);
        const std::string volume = VolumePath(volume_);
        if (!force_)
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
            table.Add({share.szLink, Known(std::string(share.szVolume)), path});
        }
        call.Print(table);
        return exit_done;
    }

    std::string name_;
    std::string volume_;
    bool force_ = false;
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

void AddServiceVolumes(Family &service)
{
    service.Add<ServiceVolume>();
    service.Add<ServiceRestore>();
}

}  // namespace tavoctl
