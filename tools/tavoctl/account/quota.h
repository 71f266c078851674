// Limits on the space of users on volumes.
#ifndef TAVOCTL_QUOTA_H
#define TAVOCTL_QUOTA_H

#include "frame/column.h"
#include "storage/mounted_volumes.h"

#include <cstdint>
#include <optional>
#include <string>
#include <vector>

namespace tavoctl {

inline constexpr double kib_in_mb = 1024;
inline constexpr int64_t most_volumes = 9999;

struct UserQuota {
    std::string user;
    int volume;
    std::optional<int64_t> limit;  // KiB
    int64_t used;
};

inline constexpr Column<UserQuota> quota_columns[] = {
    {"volume", field<&UserQuota::volume>, "its number"},
    {"user", field<&UserQuota::user>},
    {"limit_kib", field<&UserQuota::limit>, "null: no limit", in_list, "KiB"},
    {"used_bytes", field<&UserQuota::used>, "", in_list, "bytes"},
};

std::optional<UserQuota> QuotaOf(const std::string &user, const MountedVolume &volume);
bool HasQuotas(const MountedVolume &volume);  // whether they are switched on
std::vector<UserQuota> QuotasOn(const MountedVolume &volume);
std::vector<UserQuota> AllQuotas();  // of every volume that has them switched on

// Throw a Failure. 0 megabytes: no limit.
void SwitchQuotasOn(const MountedVolume &volume);
void SetLimit(const std::string &user, const MountedVolume &volume, float megabytes);

}  // namespace tavoctl

#endif
