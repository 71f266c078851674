// Signals by their names.
#ifndef TAVOCTL_SIGNAL_NAME_H
#define TAVOCTL_SIGNAL_NAME_H

#include <optional>
#include <string>
#include <vector>

namespace tavoctl {

std::vector<std::string> SignalNames();  // without "SIG"

// The number of "HUP", "SIGHUP" or "1"; empty when there is no such signal. 0 is one: it tests.
std::optional<int> SignalNumber(const std::string &text);

}  // namespace tavoctl

#endif
