// Appliances on one virtual cable: each has a network, processes, a host name, an /etc, a /tmp and a /var/run of its
// own, in namespaces that end with the test. The cards are veth pairs, and the cable is a bridge in the test's own
// network namespace.
#ifndef TESTS_SUPPORT_VIRTUAL_CABLE_H
#define TESTS_SUPPORT_VIRTUAL_CABLE_H

#include "support/test.h"

#include <sys/types.h>

namespace test {

// Held by a process of its own, which is process 1 there.
class Node {
  public:
    explicit Node(const std::string &host_name);
    ~Node();  // ends everything that runs there
    Node(const Node &) = delete;
    Node &operator=(const Node &) = delete;

    // Runs the function there, in a process of its own; false when it fails an assertion, dies or returns false.
    bool Run(const std::function<bool()> &body) const;
    // The same, for assertions alone.
    void Do(const std::function<void()> &body) const;
    // Runs a command of the shell and returns its exit status.
    int Shell(const std::string &command) const;
    // Returns its output.
    std::string Output(const std::string &command) const;

    pid_t Pid() const { return pid_; }

  private:
    void Enter() const;

    pid_t keeper_ = -1;
    pid_t pid_ = -1;
};

class VirtualCable {
  public:
    explicit VirtualCable(const std::string &name);
    ~VirtualCable();
    VirtualCable(const VirtualCable &) = delete;
    VirtualCable &operator=(const VirtualCable &) = delete;

    // A new card of the node, down and without an address, plugged into this cable.
    void Plug(const Node &node, const std::string &card);

    // Why this root cannot have one; empty when it can.
    static std::string Missing();

  private:
    std::string name_;
    std::vector<std::string> ends_;
};

// Runs a command of the shell here and returns its exit status.
int ShellStatus(const std::string &command);

}  // namespace test

#endif
