// Signals by their names, as the C library has them.
#include "frame/signal_name.h"

#include <charconv>
#include <csignal>
#include <cstring>

namespace tavoctl {

std::vector<std::string> SignalNames()
{
    std::vector<std::string> names;
    for (int number = 1; number < SIGRTMIN; ++number)
        if (const char *name = ::sigabbrev_np(number))
            names.emplace_back(name);
    return names;
}

std::optional<int> SignalNumber(const std::string &text)
{
    const std::string name = text.starts_with("SIG") ? text.substr(3) : text;
    for (int number = 1; number < SIGRTMIN; ++number)
        if (const char *known = ::sigabbrev_np(number); known && name == known)
            return number;
    int number = 0;
    const char *end = text.data() + text.size();
    const auto [stop, error] = std::from_chars(text.data(), end, number);
    if (error != std::errc{} || stop != end || number < 0 || number > SIGRTMAX)
        return {};
    return number;
}

}  // namespace tavoctl
