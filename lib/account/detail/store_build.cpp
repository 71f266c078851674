// Rebuilds the stores of a family from its text files.
#include "account/detail/store_build.h"

#include "tavo_error.h"

#include "account/detail/btree.h"
#include "account/detail/commit_resume.h"
#include "account/detail/domain_part.h"
#include "account/detail/free_name.h"
#include "account/detail/store_seal.h"
#include "core/detail/folder_reader.h"
#include "core/detail/owner.h"

#include <cstring>
#include <filesystem>

#include <fcntl.h>
#include <sys/stat.h>

namespace tavo {
namespace {

// Removes build folders (root's, with the mode of mkdtemp) of processes that died. The search is limited, because
// another user may have filled /tmp.
void RemoveLeftFolders(const StoreFamily &family)
{
    constexpr int most = 4096;
    FolderReader tmp("/tmp");
    const std::string prefix = std::string(family.prefix).substr(sizeof "/tmp") + "tmp.";
    const char *name = nullptr;
    for (int i = 0; i < most && (name = tmp.Next()) != nullptr; ++i) {
        struct stat st;
        if (!std::string_view(name).starts_with(prefix) ||
            ::fstatat(tmp.Descriptor(), name, &st, AT_SYMLINK_NOFOLLOW) != 0 || st.st_uid != 0 ||
            (st.st_mode & (S_IFMT | 07777)) != (S_IFDIR | 0700))
            continue;
        std::error_code ignored;
        std::filesystem::remove_all(std::filesystem::path("/tmp") / name, ignored);
    }
}

// A private folder, in which other users cannot create files; removed with its contents.
class BuildFolder {
  public:
    explicit BuildFolder(const StoreFamily &family) : path_(std::string(family.prefix) + "tmp.XXXXXX")
    {
        for (const StoreRow &row : family.stores) {
            const std::string_view name = NameOf(row);
            files_.push_back(path_ + '/' + std::string(name));
            files_.push_back(path_ + "/__db." + std::string(name));  // of a creation that failed
        }
        made_ = ::mkdtemp(path_.data()) != nullptr;
        for (std::string &file : files_)
            file.replace(0, path_.size(), path_);
    }
    ~BuildFolder()
    {
        const KeepErrno keep;
        if (!made_)
            return;
        for (const std::string &file : files_)
            ::unlink(file.c_str());
        ::rmdir(path_.c_str());
    }
    BuildFolder(const BuildFolder &) = delete;
    BuildFolder &operator=(const BuildFolder &) = delete;

    explicit operator bool() const { return made_; }
    const char *File(size_t store) const { return files_[2 * store].c_str(); }

  private:
    static std::string_view NameOf(const StoreRow &row)
    {
        const std::string_view path = row.path;
        return path.substr(path.rfind('/') + 1);
    }

    std::string path_;
    std::vector<std::string> files_;  // composed beforehand: a destructor must not need memory
    bool made_ = false;
};

Code FillStore(const char *path, const StoreEntries &entries, int64_t sync_time)
{
    std::unique_ptr<Btree> store;
    if (const Code code = Btree::Create(path, store))
        return code;
    for (const auto &[key, value] : entries)
        if (const Code code = store->Set(key, value))
            return code;
    if (const Code code = store->SetNumber(kDeprecatedKey, 0))
        return code;
    if (const Code code = store->SetNumber(kSyncTimeKey, static_cast<int32_t>(sync_time)))
        return code;
    const Code code = store->Flush();
    return code != 0 ? code : store->Close();
}

// The old store is kept for a look at what went wrong, unless it held secrets or was not ours.
void SetAside(const StoreRow &row)
{
    const std::string backup = std::string(row.path) + ".bak";
    struct stat st;
    FreeName(backup.c_str());
    if (::lstat(row.path, &st) == 0 && S_ISREG(st.st_mode) && st.st_uid == 0 && st.st_nlink == 1 &&
        row.mode != kSecretStore && ::chmod(row.path, 0600) == 0)
        ::rename(row.path, backup.c_str());
}

bool MoveIntoPlace(const char *built, const StoreRow &row)
{
    if (::chmod(built, row.mode) != 0)
        return false;
    SetAside(row);
    return ::rename(built, row.path) == 0 || (FreeName(row.path) && ::rename(built, row.path) == 0);
}

}  // namespace

bool ReadContent(const AccountKind &kind, StoreContent &out)
{
    const StoreFamily &family = kind.family;
    std::vector<std::string> texts(family.texts.size());
    out.sync_times.resize(family.stores.size());
    for (size_t i = 0; i < texts.size(); ++i) {
        int64_t time = 0;
        if (!ReadTextFile(family.texts[i].path, texts[i], time))
            return false;
        for (size_t store = 0; store < family.stores.size(); ++store)
            if (std::strcmp(family.stores[store].text, family.texts[i].path) == 0)
                out.sync_times[store] = time;
    }
    out.stores = kind.entries(texts);
    return true;
}

Code BuildStores(const AccountKind &kind, std::string &texts)
{
    const StoreFamily &family = kind.family;
    std::vector<StoreEntries> domain = ReadDomainPart(kind);
    BreakSeal(family);
    if (const Code code = FinishAccountFiles())
        return code;
    texts = StampTexts(family);
    StoreContent content;
    if (!ReadContent(kind, content))
        return ERR_READ_FAILED;
    for (size_t i = 0; i < domain.size(); ++i)
        content.stores[i].merge(domain[i]);  // the text files have precedence
    RemoveLeftFolders(family);
    const BuildFolder folder(family);
    if (!folder)
        return errno == ENOSPC ? ERR_NOT_ENOUGH_SPACE : ERR_OPEN_FAILED;
    Code code = 0;
    for (size_t i = 0; i < family.stores.size() && code == 0; ++i)
        code = FillStore(folder.File(i), content.stores[i], content.sync_times[i]);
    for (size_t i = 0; i < family.stores.size() && code == 0; ++i)
        if (!MoveIntoPlace(folder.File(i), family.stores[i]))
            code = ERR_OPEN_FAILED;
    if (code == 0)
        WriteSeal(family, texts);
    return code == 0 ? code : CodeOfStores(code);
}

}  // namespace tavo
