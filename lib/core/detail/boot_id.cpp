// This run of the machine.
#include "core/detail/boot_id.h"

#include "core/detail/open_file.h"

#include <atomic>

#include <unistd.h>

namespace tavo {

// No process lives longer than a run of the machine, so the line is read once.
std::string BootId()
{
    static constinit char known[64];
    static constinit std::atomic<size_t> length = 0;
    static constinit std::atomic_flag is_taken;
    if (const size_t size = length.load(std::memory_order_acquire))
        return std::string(known, size);
    char line[sizeof known];
    const Fd fd = OpenFd("/proc/sys/kernel/random/boot_id", O_RDONLY);
    const ssize_t got = fd ? ::read(fd.Get(), line, sizeof line) : -1;
    if (got <= 0)
        return "unknown\n";
    const std::string text(line, static_cast<size_t>(got));
    if (!is_taken.test_and_set()) {
        text.copy(known, text.size());
        length.store(text.size(), std::memory_order_release);
    }
    return text;
}

}  // namespace tavo
