// The verbs of tavoctl volume that change volumes.
#ifndef TAVOCTL_VOLUME_VERBS_H
#define TAVOCTL_VOLUME_VERBS_H

#include "frame/verb.h"
#include "storage/system_tool.h"
#include "storage/volumes.h"

namespace tavoctl {

Action VolumeCreate(Arguments &in);
Action VolumeMount(Arguments &in);
Action VolumeUnmount(Arguments &in);
Action VolumeGrow(Arguments &in);

// Throws a Failure when there is no such volume.
Volume FindStoredVolume(int number, const std::string &attempted);

// Has the kernel know the volume, which it may not since the system was started; until it is destroyed.
class ActiveVolume {
  public:
    ActiveVolume(const Volume &volume, const std::string &attempted);
    ~ActiveVolume();
    ActiveVolume(const ActiveVolume &) = delete;
    ActiveVolume &operator=(const ActiveVolume &) = delete;
    void Keep() { group_.clear(); }

  private:
    std::string group_;  // empty: it was active before
};

}  // namespace tavoctl

#endif
