// The state of the network before a change: restored when a step fails, and by the next change when the process dies.
//
// A snapshot is taken from files, /proc, /sys and ioctl, and runs no command. The record is on the disk from before the
// first step until the end of the change: /etc/network.undo. A successful change removes it.
#ifndef TAVO_NETWORK_DETAIL_CHECKPOINT_H
#define TAVO_NETWORK_DETAIL_CHECKPOINT_H

#include "core/detail/owner.h"
#include "core/detail/where.h"
#include "network/detail/route_table.h"
#include "network/detail/undo_step.h"

#include <string>
#include <string_view>
#include <utility>
#include <vector>

#include <sys/types.h>

namespace tavo {

class Checkpoint {
  public:
    Checkpoint() = default;
    ~Checkpoint();  // closes; a change that is cut off by an exception is finished by the next one
    Checkpoint(const Checkpoint &) = delete;
    Checkpoint &operator=(const Checkpoint &) = delete;

    // The parts that the change may touch, in the order in which they are restored. False when one cannot be read.
    bool AddFile(const std::string &path);
    bool AddInterfaceFiles();
    void AddSetting(const char *path, const std::string &key);
    void AddHostName();
    void AddMtu(const std::string &interface);
    void AddGateway();  // the kernel's default routes
    // Address, routes and DHCP client. The address is that of the interface file or of the lease; of neither, the
    // kernel's.
    void AddCard(const std::string &interface);
    // Everything that an interface has in the kernel, and only that.
    void AddLiveCard(const std::string &interface);
    void AddIpv6(const std::string &interface);  // switched on or off, addresses, routes
    // An IPv6 address that the change adds or removes.
    void AddIpv6Address(const std::string &interface, const std::string &address, int length);
    void AddCommand(std::string command, bool after_death = false);

    // Writes the record: after everything that may be refused, before the first step. Where the disk takes none the
    // change goes on without.
    void Begin(Where where = Where());

    // The change is over, whether or not it was made.
    void End();

    // Puts back all that was added, by the stated tools, and ends. Routes that the kernel still has are only left alone
    // when `cleared` is false. False when an address could not be set.
    bool PutBack(bool cleared = true);
    // The same when the effect of the last command is not known.
    void PutBackAll();
    void PutBackFiles();

    // Records a command that is about to be started (`pid` is 0, `beginning` "-") or runs, so that a process that
    // completes the change ends it first.
    static void NoteCommand(pid_t pid, const std::string &beginning, std::string_view command);

    void Add(UndoStep step) { steps_.push_back(std::move(step)); }
    const std::vector<UndoStep> &Steps() const { return steps_; }

  private:
    void AddClientsEnd(const std::string &interface, pid_t client);
    void AddFurtherAddresses(const std::string &interface);
    void AddRoutes(const std::vector<Route> &routes, const std::string &interface);

    std::vector<UndoStep> steps_;
    Fd record_;
};

// Finishes what a process that died has left: everything is as before its change. After a restart of the system only
// files are put back. The caller holds the network lock.
void FinishCutOffChange(Where where = Where());

}  // namespace tavo

#endif
