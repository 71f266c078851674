// tavoctl service: what the services are doing.
#include "service/service.h"

#include "families.h"
#include "frame/containers.h"
#include "frame/failure.h"
#include "frame/held_locks.h"
#include "frame/program.h"
#include "frame/table.h"
#include "frame/watch.h"
#include "service/service_state.h"

#include "tavo_lock.h"
#include "tavo_service.h"

#include <algorithm>

namespace tavoctl {
namespace {

using tavoctl::Known;

Cell Known(const std::optional<bool> &truth)
{
    return truth ? Cell(*truth) : Cell();
}

Cell Known(pid_t pid)
{
    return pid > 0 ? Cell(int{pid}) : Cell();
}

// The settings lock, so that every status of one table is of one moment and none of them waits on its own. Where somebody
// holds it, such as the dispatcher while scripts run, the table says what can be said.
class OneMoment {
  public:
    OneMoment() : held_(ErrTLIBFileLock(TAVO_LOCK_TAVOINFO | TAVO_LOCK_SHARED | TAVO_LOCK_NONBLOCKING, 1) == 0) {}
    ~OneMoment()
    {
        if (held_)
            ErrTLIBFileUnlock(TAVO_LOCK_TAVOINFO);
    }
    OneMoment(const OneMoment &) = delete;
    OneMoment &operator=(const OneMoment &) = delete;

    bool Held() const { return held_; }

  private:
    bool held_;
};

class ServiceList : public Verb {
  public:
    static constexpr VerbInfo info = {
        "list", reads,
        "Lists the services that this model has. Shows whether each is enabled and running, the process and since "
        "when, its "
        "data folders and the volumes where they are. \"bound\" says whether all of them are there.",
        "tavoctl service list\n"
        "tavoctl service list --all --json\n"
        "tavoctl service list --volume /volume1\n"
        "tavoctl service list --watch --interval 5"};

    void Declare(Arguments &arguments) override
    {
        arguments.Flag("--all", all_, "those too that this model has not");
        arguments.Option("--volume", "VOLUME", volume_, "only those with data on that volume", MountedVolumes);
        arguments.Flag("--watch", watch_, watch_help);
        arguments.Number("--interval", "SECONDS", interval_, "the time between two looks (2)", 1);
    }

    int Run(const Call &call) override
    {
        if (watch_)
            Watch(call, interval_, [this] { return Look(); });
        else
            call.Print(Look());
        return exit_done;
    }

  private:
    std::vector<std::string> Names() const
    {
        if (all_ && volume_.empty())
            return ServiceNames();
        StringList names;
        const int count = volume_.empty() ? TAVOServiceGetAll(names.Address())
                                          : TAVOServiceGetbyVolume(volume_.c_str(), names.Address());
        if (count < 0)
            throw LibraryFailure("list the services" + (volume_.empty() ? "" : " of " + volume_));
        return names.Items();
    }

    Table Look() const
    {
        const OneMoment moment;
        Table table({"name", "enabled", "running", "pid", "since", "shares", "volumes", "bound"});
        for (const std::string &name : Names()) {
            const ServiceState state = StateOf(FindService(name), moment.Held());
            table.Add({state.name, Known(state.enabled), Known(state.running), Known(state.pid), Known(state.since),
                       state.shares, state.volumes, Known(state.bound)});
        }
        return table;
    }

    bool all_ = false;
    bool watch_ = false;
    int interval_ = 2;
    std::string volume_;
};

class ServiceStatus : public Verb {
  public:
    static constexpr VerbInfo info = {
        "status", reads,
        "Describes one service. \"on\" is the library's answer: enabled, its data folders there, and running. The exit "
        "status is 3 when it is not running.",
        "tavoctl service status samba\n"
        "tavoctl service status --json ftp"};

    void Declare(Arguments &arguments) override
    {
        arguments.Text("SERVICE", name_, "the name of the service", ServiceNames);
    }

    int Run(const Call &call) override
    {
        const int id = FindService(name_);
        const HeldLocks locks(TAVO_LOCK_TAVOINFO, true, usual_wait);
        const ServiceState state = StateOf(id);
        Record record;
        record.Add("name", state.name);
        record.Add("on", TAVOServiceStatusGet(id) == 1);
        record.Add("enabled", Known(state.enabled));
        record.Add("running", Known(state.running));
        record.Add("pid", Known(state.pid));
        record.Add("since", Known(state.since));
        record.Add("shares", state.shares);
        record.Add("volumes", state.volumes);
        record.Add("bound", Known(state.bound));
        call.Print(record);
        return state.running == true ? exit_done : exit_not_found;
    }

  private:
    std::string name_;
};

}  // namespace

void AddService(Program &program)
{
    Family &service = program.Add("service", "The appliance's services");
    service.Add<ServiceList>();
    service.Add<ServiceStatus>();
    AddServiceSwitches(service);
    AddServiceVolumes(service);
}

}  // namespace tavoctl
