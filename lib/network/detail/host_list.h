// The list of discovered hosts: its paths, and one line of it.
#ifndef TAVO_NETWORK_DETAIL_HOST_LIST_H
#define TAVO_NETWORK_DETAIL_HOST_LIST_H

#include "tavo_fhost.h"

#include <optional>
#include <string_view>

namespace tavo {

inline constexpr const char *kHostList = "/tmp/tavods.list";           // the daemon writes it
inline constexpr const char *kHostListTaken = "/tmp/tavods.list.tmp";  // a caller reads it

enum class HostLineKind { host, too_few_fields, no_model, other_protocol, bad_address };

struct HostLine {
    HostLineKind kind;
    std::string_view name;
    std::string_view address;
};

// The same of a host as a record; empty for any other line.
std::optional<TAVOFHOST> ParseHost(std::string_view line) noexcept;

// "MODEL,PROTOCOL,NAME,ADDRESS,..." without white space around it. Names are cut at 255 bytes.
HostLine ParseHostLine(std::string_view line) noexcept;

}  // namespace tavo

#endif
