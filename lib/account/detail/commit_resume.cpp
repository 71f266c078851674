// Completes the commits of programs that died over them.
#include "account/detail/commit_resume.h"

#include "tavo_error.h"

#include "account/detail/commit_files.h"

#include <algorithm>
#include <cerrno>

#include <unistd.h>

namespace tavo {
namespace {

Code FinishAccountFiles(const Marker &marker)
{
    for (const FileStep &file : marker.files)
        if (file.target == kAccountFile && IsWhole(file) && !MoveIntoPlace(file))
            return ERR_RENAME_FAILED;
    return 0;
}

bool FinishNeighbour(const FileStep &file)
{
    const std::string now = FileIdentity(file.path.c_str());
    if (now == file.made)
        return true;
    if (IsWhole(file) && now == file.before && MoveIntoPlace(file))
        return true;
    // It was moved and edited since, or it was not moved.
    const bool moved = ::unlink(file.temporary.c_str()) != 0 && errno == ENOENT && now != file.before;
    return moved;
}

}  // namespace

Code ResumeCommit(Marker &marker)
{
    if (const Code code = ReadMarker(marker))
        return code;
    if (marker.files.empty())
        return 0;
    if (const Code code = FinishAccountFiles(marker))
        return code;
    for (const FileStep &file : marker.files)
        if (file.target != kAccountFile && !FinishNeighbour(file))
            marker.MakePending(file.target);
    SyncFolders(marker.files);
    marker.files.clear();
    marker.DropDone();
    if (marker.IsEmpty())
        RemoveMarker();
    else
        WriteMarker(FormatMarker(marker), false);
    return 0;
}

Code FinishAccountFiles()
{
    if (!MarkerStands())
        return 0;
    Marker marker;
    if (const Code code = ReadMarker(marker))
        return code;
    if (const Code code = FinishAccountFiles(marker))
        return code;
    SyncFolders(marker.files);
    const bool more = std::any_of(marker.files.begin(), marker.files.end(),
                                  [](const FileStep &file) { return file.target != kAccountFile; });
    if (!more && !marker.HasMoreThanFiles()) {
        RemoveMarker();
        for (const StoreFamily *family : {&kUserFamily, &kGroupFamily})
            (void)RemoveTemporaries(*family);
    }
    return 0;
}

Code RemoveTemporaries(const StoreFamily &family)
{
    if (MarkerStands())
        return ERR_REMOVE_FAILED;
    Code code = 0;
    for (const TextRow &row : family.texts)
        if (::unlink(row.temporary) != 0 && errno != ENOENT)
            code = ERR_REMOVE_FAILED;
    return code;
}

}  // namespace tavo
