// The present state of a service.
#ifndef TAVOCTL_SERVICE_STATE_H
#define TAVOCTL_SERVICE_STATE_H

#include "tavo_service.h"

#include "frame/arguments.h"
#include "frame/column.h"

#include <cstdint>
#include <optional>
#include <string>
#include <vector>

#include <sys/types.h>

namespace tavoctl {

class Family;

struct ServiceState {
    int id = 0;
    std::string name;
    std::optional<bool> enabled;  // empty: it has no key, or the key says neither
    std::optional<bool> running;  // empty: nothing of its own runs
    pid_t pid = 0;                // 0: not running, or no process of its own
    std::string since;
    std::vector<std::string> shares;
    std::vector<std::string> volumes;  // where the links of its data folders lead, each volume once
    std::optional<bool> bound;         // empty: it has no data folders; false: one of them is not there
};

inline constexpr Column<ServiceState> service_columns[] = {
    {"name", field<&ServiceState::name>},
    {"on", [](const ServiceState &s) { return TAVOServiceStatusGet(s.id) == 1; }, "enabled, bound and running", in_one},
    {"enabled", field<&ServiceState::enabled>, "null: it has no key, or its key says neither yes nor no"},
    {"running", field<&ServiceState::running>, "null: nothing of its own runs"},
    {"pid", [](const ServiceState &s) { return s.pid > 0 ? std::optional(s.pid) : std::nullopt; }},
    {"since", [](const ServiceState &s) { return Maybe(s.since); }, "when its process was started"},
    {"shares", field<&ServiceState::shares>, "its data folders"},
    {"volumes", field<&ServiceState::volumes>, "where they are"},
    {"bound", field<&ServiceState::bound>, "whether all of them are there; null: it has none"},
};

extern const ArgumentKind service_kind;
extern const ArgumentKind mounted_kind;  // a volume, "/volume2" or "2"
inline constexpr char service_help[] = "the name of the service";

// "/volume2", which may be written as "2".
std::string VolumePath(const std::string &word);

// Throws a Failure when it is not mounted.
void RequireMounted(const std::string &volume);

// The id of a service by its name. Throws a Failure.
int FindService(const std::string &name);

// The status of a service without a process of its own needs a look at its key under the settings lock; may_wait false
// leaves it out.
ServiceState StateOf(int id, bool may_wait = true);

// The numbers of its data folders.
std::vector<int32_t> FoldersOf(int id);

// Returns whether a file system is mounted at `volume`, "/volume2".
bool IsMounted(const std::string &volume);

// The verbs that change something.
void AddServiceChanges(Family &service);

// For completion.
std::vector<std::string> ServiceNames();
std::vector<std::string> VolumePaths();  // of those that are mounted

}  // namespace tavoctl

#endif
