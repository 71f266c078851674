// A change of the network on trial: a process of its own puts the old settings back unless somebody confirms the new ones
// in time. It does so whatever becomes of the command, which may be cut off with the connection that it came by.
#ifndef TAVOCTL_NET_TRIAL_H
#define TAVOCTL_NET_TRIAL_H

#include "network/net_snapshot.h"

#include <string>

#include <sys/types.h>

namespace tavoctl {

class NetTrial {
  public:
    // From here on the old settings come back. Throws a Failure where another trial goes on.
    NetTrial(const std::string &interface, int seconds);
    ~NetTrial();
    NetTrial(const NetTrial &) = delete;
    NetTrial &operator=(const NetTrial &) = delete;

    const TAVONETCARD &Before() const { return before_.Card(); }

    // The change is made: the time begins.
    void Begin();

    // Waits until it is decided, and asks when there is somebody to ask. True when the new settings stay.
    bool IsKept();

    // Puts the old settings back at once; false when that failed.
    bool GiveUp();

    // Keeps what is on trial; throws a Failure when nothing is.
    static void Confirm();

  private:
    NetSnapshot before_;
    int seconds_;
    int guardian_ = -1;
};

}  // namespace tavoctl

#endif
