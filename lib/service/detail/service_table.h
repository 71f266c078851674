// The two tables of the services: their rows, and where each keeps its data.
#ifndef TAVO_SERVICE_DETAIL_SERVICE_TABLE_H
#define TAVO_SERVICE_DETAIL_SERVICE_TABLE_H

#include "tavo_service.h"

#include <array>
#include <span>

namespace tavo {

inline constexpr int kServices = 30;       // row kServices is the empty one that ends the table
inline constexpr int kServiceShares = 12;  // row 0 is unused

struct ServiceShareRow {
    TAVOSERVICESHARE share;
    std::array<const char *, 3> capability_keys;  // any of them "yes" makes the service supported; NULL: no more
};

extern const TAVOSERVICE service_table[kServices + 1];
extern const ServiceShareRow service_share_table[kServiceShares];

// Empty for an id outside the tables.
const TAVOSERVICE *FindService(int id) noexcept;
const ServiceShareRow *FindServiceShare(int id) noexcept;

// A service's share ids without the end mark.
std::span<const int32_t> SharesOf(const TAVOSERVICE &service) noexcept;
bool UsesShare(const TAVOSERVICE &service, int share) noexcept;

}  // namespace tavo

#endif
