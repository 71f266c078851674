// Collects the accounts of open stores in the order of their ids.
#include "account/detail/indexed_accounts.h"

#include "account/detail/account_name.h"
#include "account/detail/store_content.h"
#include "core/detail/text_fields.h"

#include <algorithm>

namespace tavo {
namespace {

constexpr size_t kLongestBeginning = 64;

Code AddAccount(std::string_view key, std::string_view value, const AccountLines &lines, AccountKeys &seen,
                std::vector<IndexedAccount> &accounts)
{
    const std::string_view text = LineOf(value);
    const Result<NameAndId> account = lines.parse(text);
    if (!IsOneLine(text) || !account)
        return ERR_FORMAT_ERROR;
    if (seen.emplace(key).second && !IsDomainName(account->name))
        accounts.push_back({std::string(key), account->name, static_cast<uint32_t>(account->id), std::string(text)});
    return 0;
}

}  // namespace

std::string_view LineOf(std::string_view value)
{
    return value.substr(0, value.find('\0'));
}

bool IsOneLine(std::string_view line)
{
    return line.find('\n') == line.npos;
}

// By the index first and then those that it does not name: accounts that share an id with another one.
Code CollectAccounts(Btree &index, Btree &names, const AccountLines &lines, AccountKeys &keys,
                     std::vector<IndexedAccount> &accounts)
{
    std::string_view key;
    std::string_view value;
    Code code;
    for (Entry which = Entry::first; (code = index.Walk(which, key, value)) == 0; which = Entry::next) {
        const Result<std::string_view> line = names.Get(value);
        code = line ? AddAccount(value, *line, lines, keys, accounts) : line.Failure();
        if (code != 0 && code != ERR_KEY_NOT_FOUND)
            return code;
    }
    if (code != ERR_DB_END)
        return code;
    for (Entry which = Entry::first; (code = names.Walk(which, key, value)) == 0; which = Entry::next)
        if (const Code added = AddAccount(key, value, lines, keys, accounts))
            return added;
    std::stable_sort(accounts.begin(), accounts.end(),
                     [](const IndexedAccount &left, const IndexedAccount &right) { return left.id < right.id; });
    return code.Renaming(ERR_DB_END, ERR_SUCCESS);
}

FileReview ReviewFile(const Btree &names, const AccountLines &lines, const AccountKeys &kept)
{
    FileReview review;
    std::string text;
    int64_t ignored = 0;
    if (!ReadTextFile(lines.path, text, ignored)) {
        review.lost = "?";
        return review;
    }
    std::set<std::string, std::less<>> seen;
    for (std::string_view rest = text; !rest.empty();) {
        const std::string_view whole = TakeLine(rest);
        const Result<NameAndId> account = lines.parse(whole);
        const bool is_account = !HasNul(whole) && account && !IsDomainName(account->name);
        if (!is_account || !seen.insert(account->name).second) {
            // Comments mean nothing to the system. A line may hold a hash, so the log has only its first field.
            if (!whole.empty() && !whole.starts_with('#'))
                review.dropped.emplace_back(whole.substr(0, std::min(whole.find(':'), kLongestBeginning)));
            continue;
        }
        const std::string as_it_stands = account->name + '\0';
        const std::string key = AccountKey(account->name, lines.key_size).value_or(as_it_stands);
        if (review.lost.empty() && !kept.contains(key) && !kept.contains(as_it_stands) &&
            !names.Deleted().contains(key))
            review.lost = account->name;
    }
    return review;
}

}  // namespace tavo
