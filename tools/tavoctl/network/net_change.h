// A change of the network that is kept or given up as a whole, by a checkpoint of the library. A process of its own owns
// the checkpoint, whatever becomes of the command: it may be cut off with the connection that it came by. On trial the old
// settings come back unless somebody confirms the new ones in time.
#ifndef TAVOCTL_NET_CHANGE_H
#define TAVOCTL_NET_CHANGE_H

#include <functional>
#include <optional>
#include <string>

#include <sys/types.h>

namespace tavoctl {

class NetChange {
  public:
    // From here on the old settings come back. Throws a Failure while another change is in progress. `seconds` is 0
    // when no confirmation is needed.
    explicit NetChange(int seconds);
    ~NetChange();
    NetChange(const NetChange &) = delete;
    NetChange &operator=(const NetChange &) = delete;

    // Makes the change; a Failure that it throws says also that the old settings are back. Waits for the confirmation.
    static void Make(const std::optional<int64_t> &seconds, const std::function<void()> &change);

    // Keeps what is on trial; throws a Failure when nothing is.
    static void Confirm();

  private:
    void Begin();
    bool IsKept();
    bool GiveUp();

    int seconds_;
    int guardian_ = -1;
};

}  // namespace tavoctl

#endif
