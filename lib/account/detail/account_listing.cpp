// Lists of the names of users or groups.
#include "account/detail/account_listing.h"

#include "account/detail/account_name.h"
#include "core/detail/guard.h"

namespace tavo {

Result<AccountNames> NamesIn(StoreView &accounts, const KeyFilter &wanted,
                             const std::function<std::optional<std::string>(std::string_view line)> &name_of)
{
    AccountNames names;
    std::string_view key;
    std::string_view line;
    Code code;
    for (Entry which = Entry::first; (code = accounts.Walk(which, key, line)) == 0; which = Entry::next)
        if (std::optional<std::string> name = name_of(line); name && wanted(key.substr(0, key.find('\0'))))
            names.push_back(std::move(*name));
    if (code == ERR_DB_END)
        return names;
    return code == ERR_OUT_OF_MEMORY ? ERR_OUT_OF_MEMORY : ERR_ENUM_FAILED;
}

int EnumerateNames(TLIBSZLIST **list, const NameSource &source, int flags, const std::optional<NameSearch> &search,
                   Where where)
{
    if (!list || !*list || (search && !search->text))
        return Fail(ERR_BAD_PARAMETERS, where);
    const auto enumerate = [&] {
        const std::optional<std::string> key = search ? AccountKey(search->text, source.key_size) : std::nullopt;
        const auto wanted = [&](std::string_view name) {
            if (!search)
                return true;
            const std::string_view text = key ? std::string_view(*key).substr(0, key->size() - 1) : "";
            const size_t at = key ? name.find(text) : name.npos;  // a text that is not UTF-8 is in no name
            return search->where == NameSearch::Where::beginning ? at == 0 : at != name.npos;
        };
        const Result<AccountNames> names = source.list(flags, wanted);
        if (!names)
            return Fail(names.Failure(), where);
        return PushNames(list, *names) ? static_cast<int>(names->size()) : Fail(ERR_OUT_OF_MEMORY, where);
    };
    return Guard(enumerate, ERR_OUT_OF_MEMORY, where);
}

int CountNames(const NameSource &source, int flags, Where where)
{
    const auto count = [&] {
        const Result<AccountNames> names = source.list(flags, [](std::string_view) { return true; });
        return names ? static_cast<int>(names->size()) : Fail(names.Failure(), where);
    };
    return Guard(count, ERR_OUT_OF_MEMORY, where);
}

bool PushNames(TLIBSZLIST **list, const AccountNames &names)
{
    for (const std::string &name : names)
        if (TLIBSzListPush(list, name.c_str()) < 0)
            return false;
    return true;
}

}  // namespace tavo
