// Replaces the text files of an account family together.
#include "account/detail/text_commit.h"

#include "account/detail/store_content.h"
#include "core/detail/open_file.h"
#include "tavo_error.h"

#include <cinttypes>
#include <filesystem>
#include <set>

namespace tavo {
namespace {

constexpr std::string_view kEndOfMarker = "end\n";

int WriteCode()
{
    return errno == ENOSPC || errno == EDQUOT ? ERR_NOT_ENOUGH_SPACE : ERR_WRITE_FAILED;
}

// Creates the temporary file, and the directory that a fresh appliance may still lack (Samba's private one).
Fd CreateTemporary(const char *path)
{
    constexpr int flags = O_WRONLY | O_CREAT | O_EXCL | O_NOFOLLOW;
    ::unlink(path);
    Fd fd = OpenFd(path, flags, 0600);
    if (fd || errno != ENOENT)
        return fd;
    const std::filesystem::path parent = std::filesystem::path(path).parent_path();
    std::error_code error;
    std::filesystem::create_directories(parent.parent_path(), error);
    if (!error)
        ::mkdir(parent.c_str(), 0700);
    return OpenFd(path, flags, 0600);
}

bool TakeOwnerAndMode(int fd, const TextRow &row)
{
    struct stat old;
    if (::lstat(row.path, &old) != 0 || !S_ISREG(old.st_mode))
        return ::fchmod(fd, row.mode) == 0;
    return ::fchown(fd, old.st_uid, old.st_gid) == 0 && ::fchmod(fd, old.st_mode & 07777) == 0;
}

bool IsAlready(const char *path, std::string_view text)
{
    struct stat st;
    std::string old;
    int64_t ignored = 0;
    return ::lstat(path, &st) == 0 && S_ISREG(st.st_mode) && st.st_size == static_cast<off_t>(text.size()) &&
           ReadTextFile(path, old, ignored) && old == text;
}

bool SyncDirectories(std::span<const TextRow> rows)
{
    std::set<std::string> directories;
    for (const TextRow &row : rows)
        directories.insert(std::filesystem::path(row.path).parent_path());
    for (const std::string &directory : directories) {
        const Fd fd = OpenFd(directory.c_str(), O_RDONLY | O_DIRECTORY);
        if (!fd || !SyncFd(fd.Get()))
            return false;
    }
    return true;
}

// How the marker knows a temporary file: it must be the very one, complete. Empty when there is none.
std::string MarkerLine(const char *temporary)
{
    struct stat st;
    if (::lstat(temporary, &st) != 0 || !S_ISREG(st.st_mode))
        return {};
    char numbers[128];
    std::snprintf(numbers, sizeof numbers, " %" PRIuMAX " %" PRIdMAX " %" PRIdMAX ".%09ld\n", uintmax_t{st.st_ino},
                  intmax_t{st.st_size}, intmax_t{st.st_mtim.tv_sec}, long{st.st_mtim.tv_nsec});
    return std::string(temporary) + numbers;
}

bool WriteMarker(const char *path, std::span<const TextRow> rows)
{
    std::string text;
    for (const TextRow &row : rows)
        text += MarkerLine(row.temporary);
    text += kEndOfMarker;
    ::unlink(path);
    Fd fd = OpenFd(path, O_WRONLY | O_CREAT | O_EXCL | O_NOFOLLOW, 0600);
    return fd && WriteAll(fd.Get(), text) && SyncFd(fd.Get()) && fd.Close();
}

// The marker of a commit that was decided; empty when there is none or when it was cut short.
std::string ReadMarker(const StoreFamily &family)
{
    const Fd fd = OpenRegular(family.marker, O_RDONLY | O_NOFOLLOW);
    struct stat st;
    if (!fd || ::fstat(fd.Get(), &st) != 0 || (st.st_uid != 0 && st.st_uid != ::geteuid()) || (st.st_mode & 022) != 0)
        return {};
    std::string text(4096, '\0');
    const ssize_t length = ::read(fd.Get(), text.data(), text.size());
    text.resize(length > 0 ? static_cast<size_t>(length) : 0);
    return text.ends_with(kEndOfMarker) ? text : std::string();
}

}  // namespace

TextCommit::~TextCommit()
{
    if (!keep_)
        RemoveTemporaries(family_);
}

int TextCommit::Write(size_t index, std::string_view text)
{
    const TextRow &row = family_.texts[index];
    if (IsAlready(row.path, text))
        return 0;
    changed_.push_back(row);
    Fd fd = CreateTemporary(row.temporary);
    if (!fd)
        return ERR_OPEN_FAILED;
    if (!TakeOwnerAndMode(fd.Get(), row) || !WriteAll(fd.Get(), text) || !SyncFd(fd.Get()) || !fd.Close())
        return WriteCode();
    return 0;
}

int TextCommit::Commit()
{
    return changed_.empty() ? 0 : changed_.size() == 1 ? CommitOne() : CommitAll();
}

int TextCommit::CommitOne()
{
    if (::rename(changed_[0].temporary, changed_[0].path) != 0)
        return ERR_RENAME_FAILED;
    return SyncDirectories(changed_) ? 0 : WriteCode();
}

int TextCommit::CommitAll()
{
    if (!WriteMarker(family_.marker, changed_) || !SyncDirectories(changed_)) {
        const int code = WriteCode();
        ::unlink(family_.marker);
        return code;
    }
    bool moved = false;
    for (const TextRow &row : changed_) {
        if (::rename(row.temporary, row.path) != 0) {
            keep_ = moved;
            if (!moved)
                ::unlink(family_.marker);
            return ERR_RENAME_FAILED;
        }
        moved = true;
    }
    keep_ = true;
    SyncDirectories(changed_);  // if not: the marker may outlive a power failure, and then this is done again
    ::unlink(family_.marker);
    return 0;
}

int FinishCommit(const StoreFamily &family)
{
    if (::access(family.marker, F_OK) != 0)
        return 0;
    const std::string marker = ReadMarker(family);
    for (const TextRow &row : family.texts) {
        const std::string line = MarkerLine(row.temporary);
        if (!line.empty() && marker.find(line) != std::string::npos && ::rename(row.temporary, row.path) != 0)
            return ERR_RENAME_FAILED;
    }
    SyncDirectories(family.texts);
    ::unlink(family.marker);
    RemoveTemporaries(family);
    return 0;
}

int RemoveTemporaries(const StoreFamily &family)
{
    if (::access(family.marker, F_OK) == 0)
        return ERR_REMOVE_FAILED;
    int code = 0;
    for (const TextRow &row : family.texts)
        if (::unlink(row.temporary) != 0 && errno != ENOENT)
            code = ERR_REMOVE_FAILED;
    return code;
}

}  // namespace tavo
