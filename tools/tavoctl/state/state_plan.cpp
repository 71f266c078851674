// The changes from the present state to that of a document.
#include "state/state_plan.h"

#include "tavo_file.h"
#include "tavo_lock.h"
#include "tavo_service.h"

#include "account/account_rules.h"
#include "account/user_verbs.h"
#include "frame/files.h"
#include "frame/held_locks.h"
#include "frame/host.h"
#include "frame/json_document.h"
#include "frame/private_copy.h"
#include "frame/settings_file.h"
#include "service/service_state.h"
#include "state/account_files.h"
#include "storage/storage_tree.h"

#include <climits>
#include <cmath>

namespace tavoctl {
namespace {

constexpr char document_name[] = "the document";
constexpr int64_t most_kib = int64_t{1} << 40;

void CheckFields(const StateJson &row, const std::vector<std::string> &known, const std::string &place)
{
    for (const auto &[name, value] : row.items())
        if (!Contains(known, name))
            RefuseDocument(place + "." + name, "there is no such field");
}

std::string TextIn(const StateJson &row, const char *name, const std::string &place)
{
    if (!row.contains(name) || !row[name].is_string() || row[name].get<std::string>().find('\0') != std::string::npos)
        RefuseDocument(place + "." + name, "not a text");
    return row[name];
}

std::vector<AccountRow> Rows(const StateJson &document, const char *section, const std::vector<std::string> &columns)
{
    return document.contains(section) ? ParseAccountRows(document[section].dump(), columns) : std::vector<AccountRow>();
}

// The text that the settings file gets. Throws a Failure for a setting that a line cannot hold.
std::string EditedSettings(const std::map<std::string, std::string> &settings)
{
    const PrivateCopy copy(settings_file);
    const char *format = SettingsFile().LineFormat();
    for (const auto &[key, value] : settings)
        Must(TLIBFileSetKeyValue(copy.Path().c_str(), key.c_str(), value.c_str(), format) == 1, "set settings." + key);
    const auto now = ReadSettings(copy.Path());
    for (const auto &[key, value] : settings)
        if (const auto found = now.find(key); found == now.end() || found->second != value)
            RefuseDocument("settings." + key, "a settings file cannot hold it");
    return FileText(copy.Path());
}

std::string VolumeOf(const std::string &target)
{
    return target.substr(0, target.find('/', 1));
}

TAVOSERVICESHARE SettingOf(int32_t folder)
{
    TAVOSERVICESHARE share = {};
    TAVOServiceSettingGet(folder, &share);
    return share;
}

// The data folder of the service that would be at this place.
int32_t FolderAt(int id, const std::string &target, const std::string &place)
{
    char path[PATH_MAX];
    for (const int32_t folder : FoldersOf(id))
        if (TAVOServiceShareGen(folder, VolumeOf(target).c_str(), path, sizeof path) >= 0 && target == path)
            return folder;
    RefuseDocument(place, "no data folder of the service is at " + target);
}

}  // namespace

StatePlan::StatePlan(Call &call, const StateJson &document)
{
    if (document.contains("settings"))
        PlanSettings(call, document["settings"]);
    const auto users = Rows(document, "users", Names(user_export_columns));
    users_ = PlanUsers(call, document_name, true, users, nullptr);
    for (const AccountRow &row : users)
        new_users_[AccountKey(*row.Find("name"))] = *row.Find("name");
    groups_ = PlanGroups(call, document_name, true, Rows(document, "groups", Names(group_export_columns)),
                         [&](const std::string &name) { return MemberName(name); });
    if (document.contains("network"))
        net_ = PlanNet(call, document["network"].dump());
    for (const auto &[section, plan] :
         {std::pair("quotas", &StatePlan::PlanQuota), std::pair("services", &StatePlan::PlanService)})
        for (std::size_t i = 0; document.contains(section) && i < document[section].size(); ++i)
            (this->*plan)(call, document[section][i], section + ("[" + std::to_string(i) + "]"));
    if (!users_.locked.empty())
        call.Tell("locked", users_.locked);
}

std::string StatePlan::MemberName(const std::string &name) const
{
    const auto found = new_users_.find(AccountKey(name));
    return found != new_users_.end() ? found->second : ReadUser(name).name;
}

void StatePlan::PlanSettings(Call &call, const StateJson &settings)
{
    const auto now = ReadSettings(settings_file);
    for (const auto &[key, value] : settings.items()) {
        const std::string wanted = TextIn(settings, key.c_str(), "settings");
        if (const std::string owner = OwnerOfSetting(key); !owner.empty())
            RefuseDocument("settings." + key, "it belongs to the section " + owner);
        const auto found = now.find(key);
        if (found != now.end() && found->second == wanted)
            continue;
        call.Change("settings", key, found == now.end() ? Cell() : Cell(found->second), wanted);
        settings_[key] = wanted;
    }
    if (!settings_.empty())
        EditedSettings(settings_);
}

void StatePlan::AddItem(Call &call, Item item)
{
    item.last = call.report.changes.size();
    if (item.last > item.first)
        items_.push_back(std::move(item));
}

void StatePlan::PlanQuota(Call &call, const StateJson &row, const std::string &place)
{
    CheckFields(row, {"volume", "user", "limit_kib"}, place);
    if (!row.contains("volume") || !row["volume"].is_number_unsigned() || row["volume"] < 1 ||
        row["volume"] > most_volumes)
        RefuseDocument(place + ".volume", "not the number of a volume");
    if (!row.contains("limit_kib") || !(row["limit_kib"].is_null() || row["limit_kib"].is_number_unsigned()) ||
        row["limit_kib"] > most_kib)
        RefuseDocument(place + ".limit_kib", "neither a number nor null");
    const std::string user = MemberName(TextIn(row, "user", place));
    const int number = row["volume"];
    const float megabytes =
        row["limit_kib"].is_null() ? 0 : static_cast<float>(row["limit_kib"].get<double>() / kib_in_mb);
    const std::string path = "/volume" + std::to_string(number);
    Item item = {user + " on " + path, call.report.changes.size(), 0, {}, {}};
    std::optional<int64_t> before;
    try {
        const MountedVolume volume = FindVolume(number);
        if (!HasQuotas(volume) && volumes_to_switch_.insert(number).second)
            call.Change(path, "quotas", false, true);
        if (const auto quota = QuotaOf(user, volume))
            before = quota->limit;
        item.run = [=] {
            if (!HasQuotas(volume))
                SwitchQuotasOn(volume);
            SetLimit(user, volume, megabytes);
        };
    } catch (const Failure &failure) {
        item.refused = failure;
    }
    const auto kib = std::llround(static_cast<double>(megabytes) * kib_in_mb);
    call.Change("user " + item.name, "limit_kib", before, kib > 0 ? Cell(kib) : Cell());
    AddItem(call, std::move(item));
}

void StatePlan::PlanService(Call &call, const StateJson &row, const std::string &place)
{
    CheckFields(row, Names(saved_service_columns), place);
    const int id = FindService(TextIn(row, "name", place));
    const ServiceState now = StateOf(id, false);
    Item item = {"service " + now.name, call.report.changes.size(), 0, {}, {}};
    std::optional<bool> enabled;
    if (row.contains("enabled") && !row["enabled"].is_null()) {
        if (!row["enabled"].is_boolean() || !TAVOServiceKeyGet(id))
            RefuseDocument(place + ".enabled", "neither true nor false, or the service cannot be switched");
        enabled = row["enabled"].get<bool>();
    }
    std::map<int32_t, std::string> places, moves;
    const StateJson folders = row.contains("folders") ? row["folders"] : StateJson::array();
    if (!folders.is_array())
        RefuseDocument(place + ".folders", "not a list");
    for (const StateJson &one : folders) {
        if (!one.is_string() || !one.get<std::string>().starts_with("/volume"))
            RefuseDocument(place + ".folders", "not a folder on a volume");
        const std::string target = one;
        const int32_t folder = FolderAt(id, target, place + ".folders");
        const std::string link = SettingOf(folder).szLink, bound = SettingOf(folder).szVolume;
        places[folder] = target;
        if (!enabled.value_or(now.enabled.value_or(false)) || target == bound)
            continue;
        if (moved_.insert(folder).second)
            call.Change(link, "target", Maybe(bound), target);
        moves[folder] = target;
    }
    if (enabled && enabled != now.enabled)
        call.Change(item.name, "enabled", now.enabled, *enabled);
    const bool switches = enabled && enabled != now.enabled;
    try {
        // The library binds a folder whose volume is away to another volume, where it is empty.
        if (!moves.empty() || (switches && *enabled))
            for (const int32_t folder : FoldersOf(id)) {
                const auto place_of = places.find(folder);
                const std::string target = place_of != places.end() ? place_of->second : SettingOf(folder).szVolume;
                if (target.starts_with("/volume"))
                    RequireMounted(VolumeOf(target));
            }
    } catch (Failure &failure) {
        failure.attempted = "change the " + item.name + ": " + failure.attempted;
        item.refused = failure;
    }
    item.run = [=, name = item.name] {
        for (const auto &[folder, target] : moves)
            Must(SettingOf(folder).szVolume == target || TAVOServiceVolumeChange(folder, VolumeOf(target).c_str()) == 0,
                 "bind the " + name + " to " + target);
        TLIBErrSet(ERR_SUCCESS);
        if (switches)
            Must(TAVOServiceActionSet(id, *enabled ? TAVO_SERVICE_ENABLE : TAVO_SERVICE_DISABLE) == 0,
                 (*enabled ? "enable the " : "disable the ") + name);
    };
    AddItem(call, std::move(item));
}

void StatePlan::SetSettings() const
{
    const HeldLocks lock(TAVO_LOCK_TAVOINFO, false, usual_wait);
    ReplaceFile(settings_file, EditedSettings(settings_));
}

void StatePlan::SetAccounts() const
{
    // No other program changes the accounts between the users and the groups.
    const HeldLocks lock(TAVO_LOCK_USER | TAVO_LOCK_GROUP | TAVO_LOCK_SMB, false, usual_wait);
    AccountFiles files(users_);
    try {
        if (!users_.changes.empty())
            ThrowFirst(tavoctl::CarryOut(users_));
        if (!groups_.changes.empty())
            ThrowFirst(tavoctl::CarryOut(groups_));
    } catch (Failure &failure) {
        files.PutBack();
        failure.AddHint("the accounts are as they were");
        throw;
    }
}

void StatePlan::CarryOut(Call &call, bool probe)
{
    std::string done;
    const auto step = [&](const char *name, bool differs, const std::function<void()> &carry_out) {
        if (!differs || call.dry_run)
            return;
        try {
            carry_out();
        } catch (Failure &failure) {
            if (!done.empty())
                failure.AddHint("done before: " + done);
            throw;
        }
        done += (done.empty() ? "" : ", ") + std::string(name);
    };
    step("settings", !settings_.empty(), [&] { SetSettings(); });
    step("users and groups", !users_.changes.empty() || !groups_.changes.empty(), [&] { SetAccounts(); });
    for (const std::string &name : users_.locked)
        Warn("the user " + name + " is locked: the document has no hash of a password");
    step("network", !net_.differences.empty(), [&] { tavoctl::CarryOut(net_, probe, {}); });
    CarryOutItems(call);
}

void StatePlan::CarryOutItems(Call &call)
{
    for (Item &item : items_) {
        if (item.refused || call.dry_run)
            continue;
        try {
            item.run();
        } catch (const Failure &failure) {
            item.refused = failure;
        }
    }
    std::vector<std::string> failed;
    auto &changes = call.report.changes;
    for (auto item = items_.rbegin(); item != items_.rend(); ++item)
        if (item->refused) {
            const auto at = [&](std::size_t index) { return changes.begin() + static_cast<std::ptrdiff_t>(index); };
            changes.erase(at(item->first), at(item->last));
            failed.insert(failed.begin(), item->name);
        }
    if (WarnOfRefused(call))
        call.Tell("failed", failed);
}

bool StatePlan::WarnOfRefused(Call &call) const
{
    bool any = false;
    for (const Item &item : items_)
        if (item.refused) {
            call.Print(*item.refused);
            call.status = any ? call.status : item.refused->Status();
            any = true;
        }
    return any;
}

void CompareStorage(Call &call, const StateJson &storage)
{
    const auto by_name = [](const StateJson &nodes) {
        std::map<std::string, StateJson> named;
        for (std::size_t i = 0; i < nodes.size(); ++i)
            named[TextIn(nodes[i], "name", "storage[" + std::to_string(i) + "]")] = nodes[i];
        return named;
    };
    const auto now = by_name(ReadStorage());
    const auto wanted = by_name(storage);
    const auto cell = [](const auto &nodes, const std::string &name, const char *column) -> Cell {
        const auto node = nodes.find(name);
        if (node == nodes.end() || !node->second.contains(column) || node->second.at(column).is_null())
            return {};
        const StateJson &value = node->second.at(column);
        return value.is_string() ? value.template get<std::string>() : value.dump();
    };
    std::set<std::string> names;
    for (const auto *nodes : {&now, &wanted})
        for (const auto &[name, node] : *nodes)
            names.insert(name);
    for (const std::string &name : names)
        for (const ColumnFacts &column : StorageColumns())
            call.Change(name, column.name, cell(now, name, column.name), cell(wanted, name, column.name));
}

}  // namespace tavoctl
