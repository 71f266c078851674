// Events of disks, arrays and mounts.
#include "events/event.h"
#include "events/kernel_socket.h"
#include "frame/failure.h"
#include "storage/arrays.h"
#include "storage/device.h"

#include <algorithm>
#include <cerrno>
#include <map>

#include <fcntl.h>
#include <linux/netlink.h>
#include <sys/socket.h>
#include <unistd.h>

namespace tavoctl {
namespace {

// A file of the kernel's that says by poll when it has changed.
class ChangingFile {
  public:
    explicit ChangingFile(const char *path) : file_(::open(path, O_RDONLY | O_CLOEXEC))
    {
        if (!file_.IsOpen())
            throw SystemFailure(std::string("watch ") + path, errno);
        Reread();
    }

    pollfd Wanted() const { return {file_.Get(), POLLPRI | POLLERR, 0}; }
    // Until it is read, it is reported again.
    void Reread() const
    {
        char bytes[4096];
        ::lseek(file_.Get(), 0, SEEK_SET);
        while (::read(file_.Get(), bytes, sizeof bytes) > 0)
            ;
    }

  private:
    Descriptor file_;
};

class DiskSource : public EventSource {
  public:
    std::vector<pollfd> Wanted() const override { return {{socket_.Get(), POLLIN, 0}}; }

    void Look(std::vector<Event> &events) override
    {
        while (const auto message = socket_.Receive()) {
            std::map<std::string, std::string> facts;
            for (std::size_t at = 0; at < message->size();) {
                const std::string line = message->c_str() + at;
                at += line.size() + 1;
                if (const std::size_t sign = line.find('='); sign != line.npos)
                    facts[line.substr(0, sign)] = line.substr(sign + 1);
            }
            const std::string &name = facts["DEVNAME"];
            if (facts["SUBSYSTEM"] != "block" || facts["DEVTYPE"] != "disk" ||
                !(name.starts_with("sd") || name.starts_with("nvme")))
                continue;
            if (facts["ACTION"] == "add")
                events.push_back({"disk-in", name, Place(name)});
            else if (facts["ACTION"] == "remove")
                events.push_back({"disk-out", name, Place(name)});
        }
    }

  private:
    static std::string Place(const std::string &name)
    {
        const std::string bay = name.starts_with("sd") ? BayOf(DevicePath(name)) : "";
        return bay.empty() || bay == "usb" || bay == "esata" ? bay : "bay " + bay;
    }

    KernelSocket socket_{NETLINK_KOBJECT_UEVENT, 1};
};

class ArraySource : public EventSource {
  public:
    ArraySource() : last_(Read()) {}

    std::vector<pollfd> Wanted() const override { return {file_.Wanted()}; }

    // How far a rebuild has come is not announced.
    int Patience() const override
    {
        constexpr int between = 2000;
        const bool works = std::any_of(last_.begin(), last_.end(), [](const auto &a) { return a.second.percent >= 0; });
        return works ? between : -1;
    }

    void Look(std::vector<Event> &events) override
    {
        file_.Reread();
        std::map<std::string, State> now = Read();
        for (const auto &[name, state] : last_)
            if (!now.contains(name))
                events.push_back({"array-stopped", name, ""});
        for (auto &[name, state] : now) {
            const auto before = last_.find(name);
            if (before == last_.end())
                events.push_back({"array-started", name, state.status});
            Compare(name, before == last_.end() ? State{state.status, {}, {}, -1, 0} : before->second, state, events);
        }
        last_ = std::move(now);
    }

  private:
    struct State {
        std::string status, action;
        std::map<std::string, int> members;  // by path: RAID_MEMBER_
        int percent;                         // -1: nothing is done
        int told;                            // the last tenth that was reported
    };

    static std::map<std::string, State> Read()
    {
        std::map<std::string, State> states;
        for (const Array &array : ReadArrays()) {
            const auto rebuild = RebuildOf(*array);
            const std::string action = ActionOf(*array);
            State state = {StatusText(array->nStatus), action, {}, -1, 0};
            if (!action.empty())
                state.percent = rebuild ? rebuild->Percent() : 0;
            for (const RAIDMEMBER *member = array->pMembers; member; member = member->pNext)
                state.members[member->szPath] = member->nState;
            states[DeviceName(array->szPath)] = std::move(state);
        }
        return states;
    }

    static void Compare(const std::string &name, const State &before, State &now, std::vector<Event> &events)
    {
        constexpr int failed = RAID_MEMBER_FAILED | RAID_MEMBER_FATAL;
        for (const auto &[path, state] : now.members) {
            const auto known = before.members.find(path);
            const bool had_failed = known != before.members.end() && (known->second & failed);
            if ((state & failed) && !had_failed)
                events.push_back({"member-failed", name, path});
            else if (known == before.members.end() && !before.members.empty())
                events.push_back({"member-added", name, path});
        }
        for (const auto &[path, state] : before.members)
            if (!now.members.contains(path))
                events.push_back({"member-removed", name, path});
        if (before.status != now.status)
            events.push_back({"array-" + now.status, name, ""});
        if (before.action != now.action && !before.action.empty())
            events.push_back({"rebuild-ended", name, before.action});
        if (before.action != now.action && !now.action.empty())
            events.push_back({"rebuild-begun", name, now.action});
        if (now.action.empty())
            return;
        now.told = before.action == now.action ? before.told : 0;
        if (const int tenth = now.percent / 10 * 10; tenth > now.told) {
            now.told = tenth;
            events.push_back({"rebuild-progress", name, std::to_string(tenth) + " %"});
        }
    }

    ChangingFile file_{"/proc/mdstat"};
    std::map<std::string, State> last_;
};

class MountSource : public EventSource {
  public:
    MountSource() : last_(Read()) {}

    std::vector<pollfd> Wanted() const override { return {file_.Wanted()}; }

    void Look(std::vector<Event> &events) override
    {
        file_.Reread();
        std::map<std::string, std::string> now = Read();
        for (const auto &[place, source] : last_)
            if (!now.contains(place))
                events.push_back({Kind(place) + "unmounted", place, source});
        for (const auto &[place, source] : now)
            if (!last_.contains(place))
                events.push_back({Kind(place) + "mounted", place, source});
        last_ = std::move(now);
    }

  private:
    static std::string Kind(const std::string &place) { return place.starts_with("/volume") ? "volume-" : ""; }

    static std::map<std::string, std::string> Read()
    {
        std::map<std::string, std::string> places;
        for (const Mount &mount : Mounts())
            if (mount.source.starts_with("/dev/") || mount.place.starts_with("/volume"))
                places[mount.place] = mount.source;
        return places;
    }

    ChangingFile file_{"/proc/self/mounts"};
    std::map<std::string, std::string> last_;
};

}  // namespace

Source DiskEvents()
{
    return std::make_unique<DiskSource>();
}

// A kernel without md has none.
Source ArrayEvents()
{
    return ::access("/proc/mdstat", R_OK) == 0 ? std::make_unique<ArraySource>() : nullptr;
}

Source MountEvents()
{
    return std::make_unique<MountSource>();
}

}  // namespace tavoctl
