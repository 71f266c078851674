// The content of the stores of users or groups while it is made from the text files.
#include "account/detail/account_entries.h"

#include "account/detail/account_name.h"

#include <algorithm>

namespace tavo {

std::optional<std::string> AccountEntries::KeyFor(std::string_view name) const
{
    return FreeKey(stores_[kind_.name_store], name, kind_.key_size);
}

void AccountEntries::AddAccount(const std::string &key, const std::string &name, int32_t id, std::string_view line)
{
    stores_[kind_.name_store].emplace(key, WithNul(line));
    stores_[kind_.id_store].emplace(IdKey(id), key);
    keys_.emplace(name, key);
    if (id >= ids_.first && id <= ids_.last)
        highest_ = std::max(highest_, id);
}

void AccountEntries::AddLine(size_t store, std::string_view line)
{
    const std::string_view name = line.substr(0, line.find(':'));
    if (name.empty() || name.size() == line.size() || HasNul(line))
        return;
    const auto exact = keys_.find(name);
    std::string key = exact != keys_.end() ? exact->second : AccountKey(name, kind_.key_size).value_or(std::string());
    if (stores_[kind_.name_store].contains(key))
        stores_[store].emplace(std::move(key), WithNul(line));
}

void AccountEntries::SetLastId(std::optional<int32_t> recorded)
{
    stores_[kind_.id_store].emplace(ids_.current_key, NumberBytes(recorded.value_or(highest_)));
}

}  // namespace tavo
