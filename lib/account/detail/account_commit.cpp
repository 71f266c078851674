// Replaces everything that one change touches together.
#include "account/detail/account_commit.h"

#include "account/detail/store_content.h"
#include "core/detail/open_file.h"
#include "tavo_error.h"

#include <algorithm>
#include <filesystem>
#include <set>

namespace tavo {
namespace {

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

bool SyncDirectories(const std::vector<FileStep> &files)
{
    std::set<std::string> directories;
    for (const FileStep &file : files)
        directories.insert(std::filesystem::path(file.path).parent_path());
    for (const std::string &directory : directories) {
        const Fd fd = OpenFd(directory.c_str(), O_RDONLY | O_DIRECTORY);
        if (!fd || !SyncFd(fd.Get()))
            return false;
    }
    return true;
}

bool IsWhole(const FileStep &file)
{
    return FileIdentity(file.temporary.c_str()) == file.made;
}

bool Move(const FileStep &file)
{
    return ::rename(file.temporary.c_str(), file.path.c_str()) == 0;
}

int FinishAccountFiles(const Marker &marker)
{
    for (const FileStep &file : marker.files)
        if (file.target == kAccountFile && IsWhole(file) && !Move(file))
            return ERR_RENAME_FAILED;
    return 0;
}

// The file's new text could not be put in place: the names that it was about are changed in what it says by then.
void MakePending(Marker &marker, unsigned target)
{
    for (NameStep &name : marker.names)
        name.pending |= name.targets & target;
}

bool FinishNeighbour(const FileStep &file)
{
    const std::string now = FileIdentity(file.path.c_str());
    if (now == file.made)
        return true;
    if (IsWhole(file) && now == file.before && Move(file))
        return true;
    // It was moved, and somebody has changed it since; or it was not.
    const bool moved = ::unlink(file.temporary.c_str()) != 0 && errno == ENOENT && now != file.before;
    return moved;
}

void DropDone(Marker &marker)
{
    std::erase_if(marker.names, [](const NameStep &name) { return name.pending == 0; });
    for (NameStep &name : marker.names)
        name.targets = name.pending;
}

}  // namespace

int ResumeCommit(Marker &marker)
{
    if (const int code = ReadMarker(marker))
        return code;
    if (marker.files.empty())
        return 0;
    if (const int code = FinishAccountFiles(marker))
        return code;
    for (const FileStep &file : marker.files)
        if (file.target != kAccountFile && !FinishNeighbour(file))
            MakePending(marker, file.target);
    SyncDirectories(marker.files);
    marker.files.clear();
    DropDone(marker);
    if (marker.IsEmpty())
        RemoveMarker();
    else
        WriteMarker(FormatMarker(marker), false);
    return 0;
}

int FinishAccountFiles()
{
    if (!MarkerStands())
        return 0;
    Marker marker;
    if (const int code = ReadMarker(marker))
        return code;
    if (const int code = FinishAccountFiles(marker))
        return code;
    SyncDirectories(marker.files);
    const bool more = std::any_of(marker.files.begin(), marker.files.end(),
                                  [](const FileStep &file) { return file.target != kAccountFile; });
    if (!more && marker.homes.empty() && marker.stages.empty() &&
        std::all_of(marker.names.begin(), marker.names.end(), [](const NameStep &name) { return name.pending == 0; })) {
        RemoveMarker();
        for (const StoreFamily *family : {&kUserFamily, &kGroupFamily})
            RemoveTemporaries(*family);
    }
    return 0;
}

int RemoveTemporaries(const StoreFamily &family)
{
    if (MarkerStands())
        return ERR_REMOVE_FAILED;
    int code = 0;
    for (const TextRow &row : family.texts)
        if (::unlink(row.temporary) != 0 && errno != ENOENT)
            code = ERR_REMOVE_FAILED;
    return code;
}

AccountCommit::~AccountCommit()
{
    const KeepErrno keep;
    if (!decided_)
        for (const FileStep &file : marker_.files)
            ::unlink(file.temporary.c_str());
}

int AccountCommit::Write(const TextRow &row, std::string_view text, unsigned target)
{
    if (IsAlready(row.path, text))
        return 0;
    // Complete before the file is made: what the destructor removes must stand in the list.
    marker_.files.push_back({target, row.temporary, row.path, {}, FileIdentity(row.path)});
    Fd fd = CreateTemporary(row.temporary);
    if (!fd)
        return ERR_OPEN_FAILED;
    if (!TakeOwnerAndMode(fd.Get(), row) || !WriteAll(fd.Get(), text) || !SyncFd(fd.Get()))
        return WriteCode();
    if (row.path == kUserTextRows[kSmbText].path)
        samba_.TakeNew(fd.Get());
    if (!fd.Close())
        return WriteCode();
    marker_.files.back().made = FileIdentity(row.temporary);
    return 0;
}

void AccountCommit::Withdraw(unsigned target) noexcept
{
    std::erase_if(marker_.files, [&](const FileStep &file) {
        if (file.target == target)
            ::unlink(file.temporary.c_str());
        return file.target == target;
    });
}

int AccountCommit::WriteNeighbour(unsigned target, FileRewrite &file, std::string_view text, mode_t mode_of_new)
{
    const std::string &path = file.Target();
    marker_.files.push_back({target, path + ".tmp", path, {}, FileIdentity(path.c_str())});
    FileStep &step = marker_.files.back();
    ::unlink(step.temporary.c_str());
    Fd fd = OpenFd(step.temporary.c_str(), O_WRONLY | O_CREAT | O_EXCL | O_NOFOLLOW, 0600);
    if (!fd)
        return ERR_OPEN_FAILED;
    if (!file.Complete(fd, text, mode_of_new))
        return WriteCode();
    step.made = FileIdentity(step.temporary.c_str());
    return 0;
}

int AccountCommit::Commit()
{
    const bool follows =
        !marker_.homes.empty() || !marker_.stages.empty() ||
        std::any_of(marker_.names.begin(), marker_.names.end(), [](const NameStep &name) { return name.pending != 0; });
    if (!follows && marker_.files.empty())
        return 0;
    // The accounts first: what they are does not depend on what neighbours know of them.
    std::stable_partition(marker_.files.begin(), marker_.files.end(),
                          [](const FileStep &file) { return file.target == kAccountFile; });
    return !follows && marker_.files.size() == 1 ? CommitOne() : CommitAll();
}

int AccountCommit::CommitOne()
{
    if (!Move(marker_.files[0])) {
        if (marker_.files[0].target == kAccountFile)
            return ERR_RENAME_FAILED;
        MakePending(marker_, marker_.files[0].target);
        return 0;
    }
    decided_ = true;
    return SyncDirectories(marker_.files) ? 0 : WriteCode();
}

// False when an account file could not be moved.
bool AccountCommit::MoveAll(bool &moved)
{
    for (const FileStep &file : marker_.files) {
        if (Move(file)) {
            moved = true;
        } else if (file.target == kAccountFile) {
            return false;
        } else {
            ::unlink(file.temporary.c_str());
            MakePending(marker_, file.target);
        }
    }
    return true;
}

int AccountCommit::CommitAll()
{
    const std::string text = FormatMarker(marker_);
    if (!WriteMarker(text, true) || !SyncDirectories(marker_.files)) {
        const int code = WriteCode();
        RemoveMarker();
        return code;
    }
    bool moved = false;
    if (!MoveAll(moved)) {
        decided_ = moved;
        if (!moved)
            RemoveMarker();
        return ERR_RENAME_FAILED;
    }
    decided_ = true;
    // If not: the marker may outlive a power failure, and then this is done again.
    try {
        SyncDirectories(marker_.files);
    } catch (const std::bad_alloc &) {
    }
    return 0;
}

void AccountCommit::Settle() noexcept
try {
    marker_.files.clear();
    decided_ = false;
    DropDone(marker_);
    if (!marker_.IsEmpty())
        WriteMarker(FormatMarker(marker_), false);
    else if (MarkerStands())
        RemoveMarker();
} catch (const std::bad_alloc &) {
}

}  // namespace tavo
