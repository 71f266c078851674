// The state of the appliance as one document.
#include "state/state_document.h"

#include "tavo_file.h"

#include "account/account_plans.h"
#include "account/quota.h"
#include "account/user_verbs.h"
#include "frame/containers.h"
#include "frame/host.h"
#include "frame/json_document.h"
#include "frame/program.h"
#include "frame/settings_file.h"
#include "network/net_document.h"
#include "network/net_present.h"
#include "service/service_state.h"
#include "storage/storage_tree.h"

namespace tavoctl {
namespace {

constexpr Column<UserQuota> saved_quota_columns[] = {
    {"volume", field<&UserQuota::volume>, "its number"},
    {"user", field<&UserQuota::user>},
    {"limit_kib", field<&UserQuota::limit>, "null: no limit", in_list, "KiB"},
};

// Facts that change by themselves do not belong into a document.
bool IsMomentary(const ColumnFacts &column)
{
    const std::string name = column.name;
    return name == "state" || name == "available";
}

StateJson Items(const Table &table)
{
    return StateJson::parse(table.Json()).at("items");
}

StateJson SettingsJson()
{
    StateJson settings = StateJson::object();
    for (const auto &[key, value] : ReadSettings(settings_file)) {
        if (!OwnerOfSetting(key).empty())
            continue;
        try {
            (void)StateJson(key + value).dump();
            settings[key] = value;
        } catch (const StateJson::exception &) {
            Warn("the setting " + key + " is left out: it is not UTF-8");
        }
    }
    return settings;
}

// Those that are switched on and off. A service that is off keeps no folders.
std::vector<SavedService> AllServices()
{
    StringList names;
    Must(TAVOServiceGetAll(names.Address()) >= 0, "list the services");
    std::vector<SavedService> services;
    for (const std::string &name : names.Items()) {
        const ServiceState state = StateOf(FindService(name), false);
        if (!state.enabled)
            continue;
        services.push_back({name, state.enabled, {}});
        for (const int32_t folder : *state.enabled ? FoldersOf(state.id) : std::vector<int32_t>()) {
            TAVOSERVICESHARE share = {};
            TAVOServiceSettingGet(folder, &share);
            if (share.szVolume[0])
                services.back().folders.emplace_back(share.szVolume);
        }
    }
    return services;
}

StateJson LocalGroups(const Call &call)
{
    std::vector<Group> groups = AllGroups();
    // Everybody is in "users".
    std::erase_if(groups, [](const Group &group) { return group.domain || group.gid == TAVO_USER_GID_DEFAULT; });
    return Items(call.TableOf(group_export_columns, groups));
}

void CheckSection(const std::string &name, const StateJson &value)
{
    if (name == "settings" || name == "network") {
        if (!value.is_object())
            RefuseDocument(name, "not an object");
        return;
    }
    if (!value.is_array())
        RefuseDocument(name, "not a list");
    for (std::size_t i = 0; i < value.size(); ++i)
        if (!value[i].is_object())
            RefuseDocument(name + "[" + std::to_string(i) + "]", "not an object");
}

StateJson ListSchema(const std::string &about, const std::vector<ColumnFacts> &columns,
                     const std::vector<std::string> &required)
{
    return {{"type", "array"}, {"description", about}, {"items", StateJson::parse(SchemaOfRecord(columns, required))}};
}

}  // namespace

std::map<std::string, std::string> ReadSettings(const std::string &path)
{
    StringList lines;
    Must(TLIBFileReadLines(path.c_str(), lines.Address()) >= 0, "read " + path);
    std::map<std::string, std::string> settings;
    for (const std::string &line : lines.Items())
        if (const auto setting = SplitSetting(line))
            settings.insert(*setting);
    return settings;
}

std::string OwnerOfSetting(const std::string &key)
{
    for (int id = 0; TAVOServiceNameGet(id); ++id)
        if (const char *own = TAVOServiceKeyGet(id); own && key == own)
            return "services";
    return key.ends_with("_mtu") || key.ends_with("_wol_options") ? "network" : "";
}

StateJson ReadStorage()
{
    StateJson nodes = Items(StorageTree());
    for (StateJson &node : nodes)
        for (const ColumnFacts &column : StorageColumns())
            if (IsMomentary(column))
                node.erase(column.name);
    return nodes;
}

StateJson ReadState(const Call &call, const Sections &sections, bool secrets)
{
    StateJson state = {{"format_version", format_version}};
    const auto add = [&](const char *name, const auto &read) {
        if (sections.contains(name))
            state[name] = read();
    };
    add("settings", SettingsJson);
    add("users", [&] { return Items(ExportedUsers(LocalUsers(), secrets)); });
    add("groups", [&] { return LocalGroups(call); });
    add("network", [] { return StateJson::parse(JsonOf(StoredNet())); });
    add("quotas", [&] { return Items(call.TableOf(saved_quota_columns, AllQuotas())); });
    add("services", [&] { return Items(call.TableOf(saved_service_columns, AllServices())); });
    add("storage", ReadStorage);
    return state;
}

StateJson ParseState(const std::string &text, const Sections &sections)
{
    const StateJson document = ParseJsonDocument(text);
    StateJson wanted = StateJson::object();
    for (const auto &[name, value] : document.items()) {
        if (name == "format_version")
            continue;
        if (!Contains(state_sections, name))
            RefuseDocument(name, "there is no such section");
        CheckSection(name, value);
        if (sections.contains(name))
            wanted[name] = value;
    }
    return wanted;
}

std::string StateSchema()
{
    StateJson network = StateJson::parse(NetDocumentSchema());
    network.erase("$schema");
    std::vector<ColumnFacts> storage = StorageColumns();
    std::erase_if(storage, IsMomentary);
    StateJson properties = {
        {"format_version", {{"const", format_version}}},
        {"settings",
         {{"type", "object"},
          {"description", "of /etc/tavoinfo.conf, without those of services and of the network"},
          {"additionalProperties", {{"type", "string"}}}}},
        {"users", ListSchema("local users", Facts(user_export_columns), {"name"})},
        {"groups", ListSchema("local groups", Facts(group_export_columns), {"name"})},
        {"network", std::move(network)},
        {"quotas",
         ListSchema("limits on volumes with quotas", Facts(saved_quota_columns), {"volume", "user", "limit_kib"})},
        {"services", ListSchema("services that can be switched", Facts(saved_service_columns), {"name"})},
        {"storage", ListSchema("for comparison, never changed", storage, {"name"})}};
    return StateJson{{"type", "object"},
                     {"description", "The state of an appliance. What it does not speak of stays as it is"},
                     {"properties", std::move(properties)},
                     {"required", {"format_version"}},
                     {"additionalProperties", false}}
        .dump();
}

}  // namespace tavoctl
