// Writes the text files of an account family by what its open stores say.
#include "account/detail/family_dump.h"

#include "tavo_error.h"

#include "account/detail/btree.h"

#include <sys/stat.h>

namespace tavo {

void RecordSyncTimes(const StoreFamily &family, std::span<TAVOBDB *const> stores)
{
    for (size_t i = 0; i < stores.size(); ++i) {
        struct stat st = {};
        ::lstat(family.stores[i].text, &st);
        if (stores[i])
            (void)Btree::Of(stores[i])->SetNumber(kSyncTimeKey, static_cast<int32_t>(st.st_mtime));
    }
}

Code WriteFamily(const StoreFamily &family, std::span<TAVOBDB *const> stores, std::span<const std::string> texts,
                 AccountCommit &commit, unsigned target, const char *&not_opened)
{
    // A full /tmp must show before anything is decided.
    for (TAVOBDB *store : stores)
        if (const Code code = Btree::Of(store)->Flush())
            return code;
    for (size_t i = 0; i < texts.size(); ++i) {
        const Code code = commit.Write(family.texts[i], texts[i], target);
        if (code == ERR_OPEN_FAILED)
            not_opened = family.texts[i].temporary;
        if (code != 0)
            return code;
    }
    return 0;
}

}  // namespace tavo
