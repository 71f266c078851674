// Events of the appliance, as the kernel reports them. No disk is read for them.
#ifndef TAVOCTL_EVENT_H
#define TAVOCTL_EVENT_H

#include <memory>
#include <string>
#include <vector>

#include <poll.h>

namespace tavoctl {

struct Event {
    std::string event;   // "disk-in"
    std::string object;  // "sda"
    std::string detail;  // may be empty
};

class EventSource {
  public:
    EventSource() = default;
    virtual ~EventSource() = default;
    EventSource(const EventSource &) = delete;
    EventSource &operator=(const EventSource &) = delete;

    // The descriptors to wait for; asked before each wait.
    virtual std::vector<pollfd> Wanted() const = 0;
    // Milliseconds after which to look although no descriptor is ready; -1: never.
    virtual int Patience() const { return -1; }
    // Something may have happened: appends what did.
    virtual void Look(std::vector<Event> &events) = 0;
};

using Source = std::unique_ptr<EventSource>;

// Each of these throws a Failure when the kernel does not offer it.
Source DiskEvents();     // disks come and go
Source ArrayEvents();    // arrays, their health, their members, rebuilds and scrubs with their progress
Source MountEvents();    // volumes and other file systems on devices
Source NetworkEvents();  // links and addresses
Source ServiceEvents();  // services start and end

}  // namespace tavoctl

#endif
