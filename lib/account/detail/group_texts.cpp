// Turns the two text files of the group family into the content of its three stores.
#include "account/detail/group_texts.h"

#include "tavo_group.h"
#include "tavo_lock.h"

#include "account/detail/account_entries.h"
#include "account/detail/account_name.h"
#include "account/detail/group_accounts.h"
#include "account/detail/group_line.h"
#include "account/detail/misc_line.h"
#include "core/detail/text_fields.h"

namespace tavo {
namespace {

void AddGroup(AccountEntries &entries, std::string_view line)
{
    const Result<GroupLine> group = ParseGroupLine(line);
    if (HasNul(line) || !group || IsDomainName(group->name))
        return;
    const std::optional<std::string> key = entries.KeyFor(group->name);
    if (!key)
        return;
    if (IsEverybody(*key))
        line = line.substr(0, line.rfind(':') + 1);
    entries.AddAccount(*key, group->name, group->gid, line);
}

}  // namespace

std::vector<StoreEntries> GroupStoreEntries(std::string_view groups, std::string_view descriptions)
{
    AccountEntries entries(kGroupKind, kGids);
    std::optional<int32_t> last_gid;
    while (!groups.empty()) {
        const std::string_view line = TakeLine(groups);
        if (const std::optional<int32_t> id = ParseMarkerLine(line, kGidMarker))
            last_gid = id;
        else
            AddGroup(entries, line);
    }
    while (!descriptions.empty())
        entries.AddLine(kDescStore, TakeLine(descriptions));
    entries.SetLastId(last_gid);
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
