// The time by which the daemon counts.
#ifndef FINDHOSTD_CLOCK_H
#define FINDHOSTD_CLOCK_H

#include <cstdint>
#include <ctime>

namespace findhostd {

// The monotonic time in milliseconds, which a change of the clock does not affect; above 0.
inline int64_t Now() noexcept
{
    timespec now{};
    ::clock_gettime(CLOCK_MONOTONIC, &now);
    return int64_t{now.tv_sec} * 1000 + now.tv_nsec / 1000000 + 1;
}

}  // namespace findhostd

#endif
