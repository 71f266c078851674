// Replaces the text files of an account family by what its open stores say.
#include "account/detail/family_dump.h"

#include "account/detail/btree.h"
#include "account/detail/store_content.h"
#include "account/detail/text_commit.h"
#include "tavo_error.h"

#include <sys/stat.h>

namespace tavo {
namespace {

// A time that cannot be recorded costs a rebuild at the next open: the files are what counts, and they are in place.
void RecordSyncTimes(const StoreFamily &family, std::span<TAVOBDB *const> stores)
{
    for (size_t i = 0; i < stores.size(); ++i) {
        struct stat st = {};
        ::lstat(family.stores[i].text, &st);
        Btree::Of(stores[i])->SetNumber(kSyncTimeKey, static_cast<int32_t>(st.st_mtime));
    }
}

}  // namespace

int DumpFamily(const StoreFamily &family, std::span<TAVOBDB *const> stores, std::span<const std::string> texts,
               const char *&not_opened)
{
    // A full /tmp must show before anything is decided.
    for (TAVOBDB *store : stores)
        if (const int code = Btree::Of(store)->Flush())
            return code;
    TextCommit commit(family);
    for (size_t i = 0; i < texts.size(); ++i) {
        const int code = commit.Write(i, texts[i]);
        if (code == ERR_OPEN_FAILED)
            not_opened = family.texts[i].temporary;
        if (code != 0)
            return code;
    }
    if (const int code = commit.Commit())
        return code;
    RecordSyncTimes(family, stores);
    return 0;
}

}  // namespace tavo
