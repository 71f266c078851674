// The renames and deletions to apply to names elsewhere on the appliance.
#include "account/detail/name_map.h"

#include "account/detail/account_name.h"

namespace tavo {
namespace {

// Without its NUL; empty for what no list can name.
std::string KeyOf(std::string_view name)
{
    std::string key = AccountKey(name).value_or(std::string(1, '\0'));
    key.pop_back();
    return key;
}

}  // namespace

void NameMap::Add(const NameStep &step)
{
    const std::string prefix = step.is_group ? "@" : "";
    const std::string old_key = KeyOf(prefix + step.old_name);
    if (old_key.empty())
        return;
    std::string first = old_key;
    if (const auto holder = first_.find(old_key); holder != first_.end()) {
        first = holder->second;
        first_.erase(holder);
        names_[first] = step.new_name;
    } else if (!names_.emplace(first, step.new_name).second) {
        return;  // this name was not known before
    }
    if (!step.new_name.empty())
        first_[KeyOf(prefix + step.new_name)] = first;
}

const std::string *NameMap::Find(std::string_view name) const
{
    const auto found = names_.empty() ? names_.end() : names_.find(KeyOf(name));
    return found == names_.end() ? nullptr : &found->second;
}

}  // namespace tavo
