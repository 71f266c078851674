// Events of services: their pid files come and go, and their processes end.
#include "events/event.h"
#include "frame/failure.h"
#include "frame/files.h"
#include "service/service_state.h"

#include <cerrno>
#include <chrono>
#include <map>
#include <set>
#include <string_view>

#include <sys/inotify.h>
#include <sys/syscall.h>
#include <unistd.h>

namespace tavoctl {
namespace {

class ServiceSource : public EventSource {
  public:
    ServiceSource() : changes_(::inotify_init1(IN_CLOEXEC | IN_NONBLOCK))
    {
        if (!changes_.IsOpen())
            throw SystemFailure("watch the services", errno);
        for (int id = 0; TAVOServiceNameGet(id); ++id) {
            const char *proc = TAVOServiceProcGet(id);
            const std::string path = proc ? proc : "";
            if (const std::size_t slash = path.rfind('/'); slash != path.npos && slash > 0) {
                pid_files_.insert(path.substr(slash + 1));
                ::inotify_add_watch(changes_.Get(), path.substr(0, slash).c_str(),
                                    IN_CREATE | IN_DELETE | IN_CLOSE_WRITE | IN_MOVED_TO | IN_MOVED_FROM);
            }
        }
        Read();
    }
    std::vector<pollfd> Wanted() const override
    {
        std::vector<pollfd> wanted = {{changes_.Get(), POLLIN, 0}};
        for (const auto &[name, end] : ends_)
            if (end->IsOpen())
                wanted.push_back({end->Get(), POLLIN, 0});
        return wanted;
    }

    // Of a service without a pid file nothing tells that it starts.
    int Patience() const override { return static_cast<int>(look_interval.count()); }

    void Look(std::vector<Event> &events) override
    {
        if (!SomeChanged() && std::chrono::steady_clock::now() < next_look_)
            return;
        const std::map<std::string, pid_t> before = running_;
        Read();
        for (const auto &[name, pid] : before)
            if (!running_.contains(name))
                events.push_back({"service-down", name, ""});
        for (const auto &[name, pid] : running_)
            if (!before.contains(name))
                events.push_back({"service-up", name, "pid " + std::to_string(pid)});
            else if (before.at(name) != pid)
                events.push_back({"service-restarted", name, "pid " + std::to_string(pid)});
    }

  private:
    // Returns whether a pid file has changed or a process ended. Looking at services makes files in the same folders:
    // by those alone they would be looked at again and again.
    bool SomeChanged()
    {
        bool changed = false;
        alignas(inotify_event) char bytes[4096];
        for (ssize_t count; (count = ::read(changes_.Get(), bytes, sizeof bytes)) > 0;) {
            const inotify_event *event = nullptr;
            for (const char *at = bytes; at < bytes + count; at += sizeof *event + event->len) {
                event = reinterpret_cast<const inotify_event *>(at);
                const std::string_view name = event->len ? event->name : "";
                changed =
                    changed || (event->mask & IN_Q_OVERFLOW) || name.ends_with(".pid") || pid_files_.contains(name);
            }
        }
        for (const auto &[name, end] : ends_) {
            pollfd ended = {end->Get(), POLLIN, 0};
            changed = changed || (ended.fd >= 0 && ::poll(&ended, 1, 0) > 0);
        }
        return changed;
    }

    void Read()
    {
        next_look_ = std::chrono::steady_clock::now() + look_interval;
        std::map<std::string, pid_t> now;
        for (int id = 0; TAVOServiceNameGet(id); ++id)
            if (const ServiceState state = StateOf(id, false); state.pid > 0)
                now[state.name] = state.pid;
        std::erase_if(ends_, [&](const auto &end) {
            const auto found = now.find(end.first);
            return found == now.end() || running_[end.first] != found->second;
        });
        running_ = std::move(now);
        for (const auto &[name, pid] : running_)
            if (!ends_.contains(name))
                ends_[name] = std::make_unique<Descriptor>(static_cast<int>(::syscall(SYS_pidfd_open, pid, 0)));
    }

    static constexpr std::chrono::milliseconds look_interval{2000};

    Descriptor changes_;
    std::chrono::steady_clock::time_point next_look_{};
    std::set<std::string, std::less<>> pid_files_;  // by their names alone
    std::map<std::string, pid_t> running_;
    std::map<std::string, std::unique_ptr<Descriptor>> ends_;  // they report the end of the processes to poll
};

}  // namespace

Source ServiceEvents()
{
    return std::make_unique<ServiceSource>();
}

}  // namespace tavoctl
