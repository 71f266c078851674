// Reads the entries of domain accounts from stores that are about to be replaced.
#include "account/detail/domain_part.h"

#include "account/detail/btree.h"
#include "account/detail/store_seal.h"

#include <fcntl.h>

namespace tavo {
namespace {

Code ReadEntries(Btree &store, StoreContents contents, StoreEntries &entries)
{
    std::string_view key;
    std::string_view value;
    Code code;
    for (Entry which = Entry::first; (code = store.Walk(which, key, value)) == 0; which = Entry::next)
        if (IsDomainEntry(key, value, contents))
            entries.emplace(key, value);
    return code.Renaming(ERR_DB_END, ERR_SUCCESS);
}

}  // namespace

std::vector<StoreEntries> ReadDomainPart(const AccountKind &kind)
{
    const StoreFamily &family = kind.family;
    if (!StoresAreWhole(family))
        return {};
    std::vector<StoreEntries> part(family.stores.size());
    for (size_t i = 0; i < part.size(); ++i) {
        std::unique_ptr<Btree> store;
        int32_t refreshed = 0;
        if (Btree::Open(family.stores[i].path, {O_RDONLY, true, 0}, store) != 0)
            return {};
        if (store->GetNumber(kExpireKey, refreshed) == 0)
            part[i].emplace(kExpireKey, NumberBytes(refreshed));
        if (i == kind.name_store && (part[i].empty() || !IsDomainPartFresh(refreshed, ::time(nullptr))))
            return {};
        if (ReadEntries(*store, ContentsOf(kind, i), part[i]) != 0)
            return {};
    }
    return part;
}

}  // namespace tavo
