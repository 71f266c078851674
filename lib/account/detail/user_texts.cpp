// Turns the four text files of the user family into the content of its five stores.
#include "account/detail/user_texts.h"

#include "tavo_lock.h"
#include "tavo_user.h"

#include "account/detail/account_entries.h"
#include "account/detail/account_name.h"
#include "account/detail/colon_fields.h"
#include "account/detail/misc_line.h"
#include "account/detail/passwd_line.h"
#include "account/detail/shadow_line.h"
#include "account/detail/user_accounts.h"
#include "core/detail/text_fields.h"

#include <map>

namespace tavo {
namespace {

// An account of a system without a shadow file has its password in its line; a shadow line, should there be one, wins.
void AddPasswd(AccountEntries &entries, std::string_view line, std::map<std::string, std::string> &passwords)
{
    const Result<PasswdLine> account = ParsePasswdLine(line);
    if (HasNul(line) || !account || IsDomainName(account->name))
        return;
    const std::optional<std::string> key = entries.KeyFor(account->name);
    if (!key)
        return;
    // The line unchanged, except for the password, which from here on is only in the shadow file.
    const std::string_view password = SplitColons(line)[1];
    const size_t rest = account->name.size() + 1 + password.size();
    entries.AddAccount(*key, account->name, account->uid, account->name + ":x" + std::string(line.substr(rest)));
    if (password != "x")
        passwords.emplace(account->name, password);
}

}  // namespace

std::vector<StoreEntries> UserStoreEntries(const UserTexts &texts)
{
    AccountEntries entries(kUserKind, kUids);
    std::map<std::string, std::string> passwords;
    for (std::string_view rest = texts.passwd; !rest.empty();)
        AddPasswd(entries, TakeLine(rest), passwords);
    for (std::string_view rest = texts.shadow; !rest.empty();)
        entries.AddLine(kShadowStore, TakeLine(rest));
    for (const auto &[name, password] : passwords)
        entries.AddLine(kShadowStore, FormatShadowLine({name, password}, ::time(nullptr)));
    for (std::string_view rest = texts.smb; !rest.empty();)
        entries.AddLine(kSmbStore, TakeLine(rest));
    std::optional<int32_t> last_uid;
    for (std::string_view rest = texts.misc; !rest.empty();) {
        const std::string_view line = TakeLine(rest);
        if (const std::optional<int32_t> id = ParseMarkerLine(line, kUidMarker))
            last_uid = id;
        else
            entries.AddLine(kMiscStore, line);
    }
    entries.SetLastId(last_uid);
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
