// Volume groups, as LVM knows them. Asking it reads the disks.
#ifndef TAVOCTL_VOLUME_GROUPS_H
#define TAVOCTL_VOLUME_GROUPS_H

#include "tavo_lvm.h"

#include "frame/containers.h"

#include <memory>
#include <string>
#include <vector>

namespace tavoctl {

using VolumeGroup = std::unique_ptr<LVMVGINFO, By<LVMVgInfoFree>>;

std::vector<LVMPV> PhysicalVolumes();

// The physical volumes of the group with this path.
std::vector<std::string> DevicesOf(const std::string &group);

// All of these throw a Failure.
void RefuseWithoutLvm(const std::string &attempted);
LVMVG ReadVg(const std::string &path, const std::string &attempted);  // when there is no such group
VolumeGroup ReadVgInfo(const std::string &path, const std::string &attempted);
void RefuseUsedGroup(const std::string &path, const std::string &attempted);  // when one of its volumes is in use
void RefuseGrouped(const std::vector<std::string> &devices, const std::string &attempted);  // when one is in a group

}  // namespace tavoctl

#endif
