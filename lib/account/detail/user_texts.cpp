// Turns the four text files of the user family into the content of its five stores.
#include "account/detail/user_texts.h"

#include "tavo_lock.h"
#include "tavo_user.h"

#include "account/detail/account_name.h"
#include "account/detail/btree.h"
#include "account/detail/colon_fields.h"
#include "account/detail/id_index.h"
#include "account/detail/misc_line.h"
#include "account/detail/passwd_line.h"
#include "account/detail/shadow_line.h"
#include "core/detail/text_fields.h"

#include <algorithm>

namespace tavo {
namespace {

constexpr std::string_view kNul{"", 1};

std::string Value(std::string_view line)
{
    return std::string(line).append(kNul);
}

std::string_view FirstField(std::string_view line)
{
    return line.substr(0, line.find(':'));
}

class UserEntries {
  public:
    void AddPasswd(std::string_view line);
    void AddLine(UserStoreIndex store, std::string_view line);
    void SetCurrentUid(std::optional<int32_t> marked);
    std::vector<StoreEntries> Take()
    {
        stores_[kShadowStore].merge(kept_);
        return std::move(stores_);
    }

  private:
    void KeepPassword(const std::string &key, const PasswdLine &account, std::string_view password);

    std::vector<StoreEntries> stores_{kUserStores};
    std::map<std::string, std::string, std::less<>> keys_;  // by name, spelled as in passwd
    StoreEntries kept_;                                     // passwords from passwd itself
    int32_t highest_ = TAVO_USER_UID_MIN - 1;
};

void UserEntries::AddPasswd(std::string_view line)
{
    const Result<PasswdLine> parsed = ParsePasswdLine(line);
    if (line.find('\0') != line.npos || !parsed || IsDomainName(parsed->name))
        return;
    const PasswdLine &account = *parsed;
    const std::optional<std::string> key = FreeKey(stores_[kNameStore], account.name, kUserKeySize);
    if (!key)
        return;
    // The line unchanged, except for the password, which from here on is only in the shadow file.
    const std::string_view password = SplitColons(line)[1];
    const size_t rest = account.name.size() + 1 + password.size();
    stores_[kNameStore].emplace(*key, Value(account.name + ":x" + std::string(line.substr(rest))));
    stores_[kUidStore].emplace(IdKey(account.uid), *key);
    keys_.emplace(account.name, *key);
    if (account.uid >= TAVO_USER_UID_MIN && account.uid <= TAVO_USER_UID_MAX)
        highest_ = std::max(highest_, account.uid);
    if (password != "x")
        KeepPassword(*key, account, password);
}

// The account comes from a system without a shadow file. A shadow line of its own, should there be one, wins.
void UserEntries::KeepPassword(const std::string &key, const PasswdLine &account, std::string_view password)
{
    const ShadowLine shadow{account.name, std::string(password)};
    kept_.emplace(key, Value(FormatShadowLine(shadow, ::time(nullptr))));
}

void UserEntries::AddLine(UserStoreIndex store, std::string_view line)
{
    const std::string_view name = FirstField(line);
    if (name.empty() || line.starts_with('#') || line.find('\0') != line.npos)
        return;
    std::string key;
    if (const auto exact = keys_.find(name); exact != keys_.end())
        key = exact->second;
    else
        key = AccountKey(name).value_or(std::string());
    if (stores_[kNameStore].contains(key))  // otherwise a line without an account
        stores_[store].emplace(std::move(key), Value(line));
}

void UserEntries::SetCurrentUid(std::optional<int32_t> marked)
{
    stores_[kUidStore].emplace(kCurrentUidKey, NumberBytes(marked.value_or(highest_)));
}

}  // namespace

std::vector<StoreEntries> UserStoreEntries(const UserTexts &texts)
{
    UserEntries entries;
    for (std::string_view rest = texts.passwd; !rest.empty();)
        entries.AddPasswd(TakeLine(rest));
    for (std::string_view rest = texts.shadow; !rest.empty();)
        entries.AddLine(kShadowStore, TakeLine(rest));
    for (std::string_view rest = texts.smb; !rest.empty();)
        entries.AddLine(kSmbStore, TakeLine(rest));
    std::optional<int32_t> marked;
    for (std::string_view rest = texts.misc; !rest.empty();) {
        const std::string_view line = TakeLine(rest);
        if (const std::optional<int32_t> id = ParseMarkerLine(line, kUidMarker))
            marked = id;
        else
            entries.AddLine(kMiscStore, line);
    }
    entries.SetCurrentUid(marked);
    return entries.Take();
}

constexpr AccountKind kUserKind{
    .family = kUserFamily,
    .lock = TAVO_LOCK_USER,
    .name_store = kNameStore,
    .id_store = kUidStore,
    .key_size = kUserKeySize,
    .entries =
        [](std::span<const std::string> texts) {
            return UserStoreEntries({.passwd = texts[kPasswdText],
                                     .shadow = texts[kShadowText],
                                     .misc = texts[kMiscText],
                                     .smb = texts[kSmbText]});
        },
};

}  // namespace tavo
