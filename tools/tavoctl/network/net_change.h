// A change of the network that is kept or undone as a whole, by a checkpoint of the library. A separate process owns
// the checkpoint, because the command may be cut off with its connection. On trial the old settings come back unless
// the new ones are confirmed in time.
#ifndef TAVOCTL_NET_CHANGE_H
#define TAVOCTL_NET_CHANGE_H

#include <functional>
#include <optional>

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
