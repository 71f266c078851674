// Where the home folders of users are.
#include "account/detail/home_folders.h"

#include "tavo_section.h"

#include "account/detail/account_name.h"
#include "core/detail/appliance_paths.h"
#include "core/detail/keep_fault.h"
#include "core/detail/list_owner.h"

namespace tavo {

bool IsFolderName(const std::string &name)
{
    return !name.empty() && name.find('/') == name.npos && !IsDotName(name);
}

Fd OpenFolder(const char *path)
{
    return OpenFd(path, O_RDONLY | O_DIRECTORY);
}

uint64_t InodeOf(const Fd &folder, const std::string &name)
{
    if (folder)
        errno = ENOENT;
    struct stat st;
    return folder && IsFolderName(name) && ::fstatat(folder.Get(), name.c_str(), &st, AT_SYMLINK_NOFOLLOW) == 0
               ? uint64_t{st.st_ino}
               : 0;
}

std::string PathOfHomes()
{
    const KeepFault keep;
    HashOwner pairs(PshTLIBSzHashAlloc(1024));
    if (!pairs)
        throw std::bad_alloc();
    tavoerrno = 0;
    errno = ENOENT;
    if (TLIBFileGetSection(kShareFile, "homes", pairs.Addr()) < 0) {
        if (tavoerrno == ERR_OUT_OF_MEMORY)
            throw std::bad_alloc();
        if (tavoerrno == ERR_SECTION_NOT_FOUND)
            errno = ENOENT;
        return {};
    }
    errno = ENOENT;
    const char *path = SzTLIBSzHashGetValue(pairs.Get(), "path");
    return path ? path : "";
}

}  // namespace tavo
