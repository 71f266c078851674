// What the verbs about one disk share.
#ifndef TAVOCTL_DISK_VERB_H
#define TAVOCTL_DISK_VERB_H

#include "frame/verb.h"
#include "storage/device.h"

#include <string>

namespace tavoctl {

inline constexpr char disk_help[] = "its name, sda or /dev/sda";
inline constexpr char wake_help[] = "read it although that wakes it";

class DiskVerb : public Verb {
  public:
    void Declare(Arguments &arguments) override { arguments.Text("DISK", disk_, disk_help, DiskNames); }

  protected:
    std::string disk_;
};

// One that reads from the disk itself, which a disk in standby wakes up for.
class WakingVerb : public DiskVerb {
  public:
    void Declare(Arguments &arguments) override
    {
        DiskVerb::Declare(arguments);
        arguments.Flag("--wake", wake_, wake_help);
    }

  protected:
    bool wake_ = false;
};

}  // namespace tavoctl

#endif
