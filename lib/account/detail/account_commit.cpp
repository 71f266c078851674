// Replaces everything that one change touches together.
#include "account/detail/account_commit.h"

#include "tavo_error.h"

#include "account/detail/commit_files.h"
#include "account/detail/store_content.h"
#include "core/detail/open_file.h"

namespace tavo {
namespace {

Code WriteCode()
{
    return errno == ENOSPC || errno == EDQUOT ? ERR_NOT_ENOUGH_SPACE : ERR_WRITE_FAILED;
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

}  // namespace

AccountCommit::~AccountCommit()
{
    const KeepErrno keep;
    if (!decided_)
        for (const FileStep &file : marker_.files)
            ::unlink(file.temporary.c_str());
}

Fd AccountCommit::Begin(FileStep step, bool makes_folder)
{
    step.before = FileIdentity(step.path.c_str());
    // In the list before the file is made: the destructor removes what is there.
    marker_.files.push_back(std::move(step));
    return CreateTemporary(marker_.files.back().temporary.c_str(), makes_folder);
}

void AccountCommit::Complete()
{
    FileStep &step = marker_.files.back();
    step.made = FileIdentity(step.temporary.c_str());
}

Code AccountCommit::Write(const TextRow &row, std::string_view text, unsigned target)
{
    if (IsAlready(row.path, text))
        return 0;
    Fd fd = Begin({target, row.temporary, row.path, {}, {}}, true);
    if (!fd)
        return ERR_OPEN_FAILED;
    if (!TakeOwnerAndMode(fd.Get(), row) || !WriteAll(fd.Get(), text) || !SyncFd(fd.Get()))
        return WriteCode();
    if (row.path == kUserTextRows[kSmbText].path)
        samba_.TakeNew(fd.Get());
    if (!fd.Close())
        return WriteCode();
    Complete();
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

Code AccountCommit::WriteNeighbour(unsigned target, FileRewrite &file, std::string_view text, mode_t mode_of_new)
{
    const std::string &path = file.Target();
    Fd fd = Begin({target, path + ".tmp", path, {}, {}}, false);
    if (!fd)
        return ERR_OPEN_FAILED;
    if (!file.Complete(fd, text, mode_of_new))
        return WriteCode();
    Complete();
    return 0;
}

Code AccountCommit::Commit()
{
    const bool follows = marker_.HasMoreThanFiles();
    if (!follows && marker_.files.empty())
        return 0;
    // The accounts first: they do not depend on the neighbours' files.
    std::stable_partition(marker_.files.begin(), marker_.files.end(),
                          [](const FileStep &file) { return file.target == kAccountFile; });
    return !follows && marker_.files.size() == 1 ? CommitOne() : CommitAll();
}

Code AccountCommit::CommitOne()
{
    if (!MoveIntoPlace(marker_.files[0])) {
        if (marker_.files[0].target == kAccountFile)
            return ERR_RENAME_FAILED;
        marker_.MakePending(marker_.files[0].target);
        return 0;
    }
    decided_ = true;
    synced_ = SyncFolders(marker_.files);
    return 0;
}

// False when an account file could not be moved.
bool AccountCommit::MoveAll(bool &moved)
{
    for (const FileStep &file : marker_.files) {
        if (MoveIntoPlace(file)) {
            moved = true;
        } else if (file.target == kAccountFile) {
            return false;
        } else {
            ::unlink(file.temporary.c_str());
            marker_.MakePending(file.target);
        }
    }
    return true;
}

// From the marker on nothing allocates memory: the change is completed at once, or the marker is removed again.
Code AccountCommit::CommitAll()
{
    const std::string text = FormatMarker(marker_);
    if (!WriteMarker(text, true) || !SyncFolders(marker_.files)) {
        const Code code = WriteCode();
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
    synced_ = SyncFolders(marker_.files);
    return 0;
}

void AccountCommit::Settle() noexcept
try {
    marker_.files.clear();
    decided_ = false;
    marker_.DropDone();
    if (!marker_.IsEmpty())
        WriteMarker(FormatMarker(marker_), false);
    else if (MarkerStands())
        RemoveMarker();
} catch (const std::bad_alloc &) {
}

}  // namespace tavo
