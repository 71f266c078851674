// Turns the two text files of the group family into the content of its three stores.
#include "account/detail/group_texts.h"

#include "tavo_group.h"
#include "tavo_lock.h"

#include "account/detail/account_name.h"
#include "account/detail/btree.h"
#include "account/detail/group_line.h"
#include "account/detail/id_index.h"
#include "account/detail/misc_line.h"
#include "core/detail/text_fields.h"

#include <algorithm>

namespace tavo {
namespace {

std::string Value(std::string_view line)
{
    return std::string(line).append(1, '\0');
}

class GroupEntries {
  public:
    void AddGroup(std::string_view line);
    void AddDescription(std::string_view line);
    void SetCurrentGid(std::optional<int32_t> marked)
    {
        stores_[kGidStore].emplace(kCurrentGidKey, NumberBytes(marked.value_or(highest_)));
    }
    std::vector<StoreEntries> Take() { return std::move(stores_); }

  private:
    std::vector<StoreEntries> stores_{kGroupStores};
    std::map<std::string, std::string, std::less<>> keys_;  // by name, spelled as in the group file
    int32_t highest_ = TAVO_GROUP_GID_MIN - 1;
};

void GroupEntries::AddGroup(std::string_view line)
{
    const Result<GroupLine> parsed = ParseGroupLine(line);
    if (line.find('\0') != line.npos || !parsed || IsDomainName(parsed->name))
        return;
    const GroupLine &group = *parsed;
    const std::optional<std::string> key = FreeKey(stores_[kGroupNameStore], group.name, kGroupKeySize);
    if (!key)
        return;
    if (IsEverybody(*key))
        line = line.substr(0, line.rfind(':') + 1);
    stores_[kGroupNameStore].emplace(*key, Value(line));
    stores_[kGidStore].emplace(IdKey(group.gid), *key);
    keys_.emplace(group.name, *key);
    if (group.gid >= TAVO_GROUP_GID_MIN && group.gid <= TAVO_GROUP_GID_MAX)
        highest_ = std::max(highest_, group.gid);
}

void GroupEntries::AddDescription(std::string_view line)
{
    const std::string_view name = line.substr(0, line.find(':'));
    if (name.empty() || name.size() == line.size() || line.find('\0') != line.npos)
        return;
    std::string key;
    if (const auto exact = keys_.find(name); exact != keys_.end())
        key = exact->second;
    else
        key = AccountKey(name, kGroupKeySize).value_or(std::string());
    if (stores_[kGroupNameStore].contains(key))  // otherwise a line without a group
        stores_[kDescStore].emplace(std::move(key), Value(line));
}

}  // namespace

std::vector<StoreEntries> GroupStoreEntries(std::string_view groups, std::string_view descriptions)
{
    GroupEntries entries;
    std::optional<int32_t> marked;
    while (!groups.empty()) {
        const std::string_view line = TakeLine(groups);
        if (const std::optional<int32_t> id = ParseMarkerLine(line, kGidMarker))
            marked = id;
        else
            entries.AddGroup(line);
    }
    while (!descriptions.empty())
        entries.AddDescription(TakeLine(descriptions));
    entries.SetCurrentGid(marked);
    return entries.Take();
}

constexpr AccountKind kGroupKind{
    .family = kGroupFamily,
    .lock = TAVO_LOCK_GROUP,
    .name_store = kGroupNameStore,
    .id_store = kGidStore,
    .key_size = kGroupKeySize,
    .entries =
        [](std::span<const std::string> texts) { return GroupStoreEntries(texts[kGroupText], texts[kDescText]); },
};

}  // namespace tavo
