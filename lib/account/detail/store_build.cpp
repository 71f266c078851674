// Builds the stores of a family anew from its text files.
#include "account/detail/store_build.h"

#include "account/detail/btree.h"
#include "account/detail/btree_file.h"
#include "account/detail/store_mode.h"
#include "account/detail/store_seal.h"
#include "account/detail/text_commit.h"
#include "tavo_error.h"

#include <filesystem>

#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

namespace tavo {
namespace {

namespace fs = std::filesystem;

std::string NameOf(const char *path)
{
    return fs::path(path).filename();
}

// An empty directory that is ours alone. What stands there instead is removed, links without being followed.
bool MakeBuildDir(const char *path)
{
    std::error_code ignored;
    fs::remove_all(path, ignored);
    return ::mkdir(path, 0700) == 0;
}

int FillStore(const std::string &path, const StoreEntries &entries, int64_t sync_time)
{
    std::unique_ptr<Btree> store;
    if (const int code = Btree::Open(path.c_str(), {O_RDWR | O_CREAT, true, StoreMode()}, store))
        return code;
    for (const auto &[key, value] : entries)
        if (const int code = store->Set(key, value))
            return code;
    if (const int code = store->SetNumber(kDeprecatedKey, 0))
        return code;
    if (const int code = store->SetNumber(kSyncTimeKey, static_cast<int32_t>(sync_time)))
        return code;
    const int code = store->Flush();
    return code != 0 ? code : store->Close();
}

bool MoveIntoPlace(const std::string &built, const char *path)
{
    std::error_code ignored;
    struct stat st;
    if (::lstat(path, &st) == 0) {
        const std::string backup = std::string(path) + ".bak";
        const bool ours = S_ISREG(st.st_mode) && st.st_uid == ::geteuid() && st.st_nlink == 1;
        fs::remove_all(ours ? fs::path(backup) : fs::path(path), ignored);
        if (ours)
            ::rename(path, backup.c_str());
    }
    return ::rename(built.c_str(), path) == 0;
}

}  // namespace

int BuildStores(const AccountKind &kind, std::string &texts)
{
    const StoreFamily &family = kind.family;
    BreakSeal(family);
    if (const int code = FinishCommit(family))
        return code;
    texts = StampTexts(family);
    StoreContent content;
    if (!kind.read(content))
        return ERR_READ_FAILED;
    if (!MakeBuildDir(family.build_dir))
        return ERR_OPEN_FAILED;
    const std::string dir = std::string(family.build_dir) + '/';
    int code = 0;
    for (size_t i = 0; i < family.stores.size() && code == 0; ++i)
        code = FillStore(dir + NameOf(family.stores[i].path), content.stores[i], content.sync_times[i]);
    for (size_t i = 0; i < family.stores.size() && code == 0; ++i)
        if (!MoveIntoPlace(dir + NameOf(family.stores[i].path), family.stores[i].path))
            code = ERR_OPEN_FAILED;
    std::error_code ignored;
    fs::remove_all(family.build_dir, ignored);
    if (code == 0)
        WriteSeal(family, texts);
    return code == ERR_NOT_ENOUGH_SPACE ? code : code == 0 ? 0 : ERR_OPEN_FAILED;
}

}  // namespace tavo
