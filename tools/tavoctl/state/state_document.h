// The state of the appliance as one document.
#ifndef TAVOCTL_STATE_DOCUMENT_H
#define TAVOCTL_STATE_DOCUMENT_H

#include "frame/verb.h"

#include <nlohmann/json.hpp>

#include <map>
#include <set>

namespace tavoctl {

using StateJson = nlohmann::ordered_json;
using Sections = std::set<std::string>;

// The parts of a document, in the order in which they are carried out.
inline constexpr const char *state_sections[] = {"settings", "users",    "groups", "network",
                                                 "quotas",   "services", "storage"};

// A service in a document.
struct SavedService {
    std::string name;
    std::optional<bool> enabled;       // nothing: it stays unchanged
    std::vector<std::string> folders;  // "/volume1/music"
};

inline constexpr Column<SavedService> saved_service_columns[] = {
    {"name", field<&SavedService::name>},
    {"enabled", field<&SavedService::enabled>, "null: as it is"},
    {"folders", field<&SavedService::folders>, "where its data folders are while it is enabled"},
};

// The settings that are no other section's: those of a file, the first line of each key.
std::map<std::string, std::string> ReadSettings(const std::string &path);

// The section that has this setting; "" for the settings themselves.
std::string OwnerOfSetting(const std::string &key);

// The present state. `secrets`: with the hashes of passwords.
StateJson ReadState(const Call &call, const Sections &sections, bool secrets);
StateJson ReadStorage();

// The sections that were asked for. Throws a Failure that names the place of what is wrong.
StateJson ParseState(const std::string &text, const Sections &sections);

std::string StateSchema();

}  // namespace tavoctl

#endif
