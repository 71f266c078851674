// tavoctl service: the state of the services.

#include "tavo_lock.h"
#include "tavo_service.h"

#include "families.h"
#include "frame/containers.h"
#include "frame/held_locks.h"
#include "frame/watch.h"
#include "service/service_state.h"

namespace tavoctl {
namespace {

// The settings lock, so that all statuses of a table are of one moment and none of them waits on its own. While another
// process holds it, such as the dispatcher while scripts run, the table shows only facts that need no lock.
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

std::vector<std::string> NamesToList(bool all, const std::optional<std::string> &volume)
{
    if (all && !volume)
        return ServiceNames();
    StringList names;
    const int count =
        volume ? TAVOServiceGetbyVolume(volume->c_str(), names.Address()) : TAVOServiceGetAll(names.Address());
    Must(count >= 0, "list the services" + (volume ? " of " + *volume : ""));
    return names.Items();
}

Action ServiceList(Arguments &in)
{
    const auto all = in.Flag("--all", "those too that this model has not");
    const auto volume = in.Option("--volume", "VOLUME", mounted_kind, "only those with data on that volume");
    const auto watch = in.Flag("--watch", watch_help);
    const auto interval = in.Number("--interval", "SECONDS", "the time between two looks (2)", 1);
    return [=](Call &call) {
        const auto look = [&] {
            const OneMoment moment;
            return call.TableOf(service_columns, Mapped(NamesToList(*all, *volume), [&](const std::string &name) {
                                    return StateOf(FindService(name), moment.Held());
                                }));
        };
        if (*watch)
            Watch(call, static_cast<int>(interval->value_or(2)), look);
        else
            call.Print(look());
    };
}

Action ServiceStatus(Arguments &in)
{
    const auto name = in.Text("SERVICE", service_kind, service_help);
    return [=](Call &call) {
        const int id = FindService(*name);
        const HeldLocks locks(TAVO_LOCK_TAVOINFO, true, usual_wait);
        const ServiceState state = StateOf(id);
        call.One(service_columns, state);
        call.status = state.running == true ? exit_done : exit_not_found;
    };
}

}  // namespace

void AddService(Program &program)
{
    Family &service = program.Add("service", "The appliance's services");
    service.Add("list", reads, Answer::List(service_columns), ServiceList,
                R"(Lists the services that this model has. Shows whether
each is enabled and running, the process and since when, its data folders and the volumes where they are. "bound" says
whether all of them are there.

tavoctl service list
tavoctl service list --all --json
tavoctl service list --volume /volume1
tavoctl service list --watch --interval 5)");
    service.Add("status", reads, Answer::One(service_columns), ServiceStatus,
                R"(Describes one service. "on" is the library's answer:
enabled, its data folders there, and running. The exit status is 3 when it is not running.

tavoctl service status samba
tavoctl service status --json ftp)");
    AddServiceChanges(service);
}

}  // namespace tavoctl
