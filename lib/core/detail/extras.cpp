// Loads the small library that few callers need.
#include "core/detail/extras.h"

#include "core/detail/log.h"
#include "core/detail/owner.h"

#include <atomic>
#include <climits>
#include <cstring>
#include <string_view>

#include <dlfcn.h>
#include <link.h>

namespace tavo {
namespace {

constexpr std::string_view kExtrasFolder = "/tavosdk/";

constinit std::atomic<const Extras *> loaded_extras = nullptr;
constinit std::atomic<bool> told_of_extras = false;

// The path of the small library, in the folder of the object that holds this code. "$ORIGIN" is needed for programs and
// libraries with a relative name: the working directory may have changed since the start.
bool FileBeside(char (&path)[PATH_MAX]) noexcept
{
    Dl_info info;
    link_map *own = nullptr;
    if (::dladdr1(&loaded_extras, &info, reinterpret_cast<void **>(&own), RTLD_DL_LINKMAP) == 0 || !own)
        return false;
    std::string_view folder = own->l_name;
    folder = folder.starts_with('/') ? folder.substr(0, folder.rfind('/')) : "$ORIGIN";
    if (folder.size() + kExtrasFolder.size() + sizeof kExtrasFile > sizeof path)
        return false;
    char *end = path + folder.copy(path, folder.size());
    end += kExtrasFolder.copy(end, kExtrasFolder.size());
    std::memcpy(end, kExtrasFile, sizeof kExtrasFile);
    return true;
}

void *OpenExtras() noexcept
{
    constexpr int mode = RTLD_NOW | RTLD_LOCAL;
    char beside[PATH_MAX];
    void *handle = FileBeside(beside) ? ::dlopen(beside, mode) : nullptr;
    // A program that contains the library finds an installed small library through its run path.
    return handle ? handle : ::dlopen(kExtrasFile, mode);
}

const Extras *FindExtras(const char *&reason) noexcept
{
    void *handle = OpenExtras();
    const auto *found = handle ? static_cast<const Extras *>(::dlsym(handle, kExtrasSymbol)) : nullptr;
    if (!found) {
        const char *error = ::dlerror();
        reason = error ? error : "no memory";
    } else if (found->version != kExtrasVersion || found->size != sizeof *found) {
        reason = "it is of another version";
        found = nullptr;
    }
    if (handle && !found)
        ::dlclose(handle);
    return found;
}

}  // namespace

const Extras *LoadExtras() noexcept
{
    if (const Extras *there = loaded_extras)
        return there;
    const KeepErrno keep;
    const char *reason = "";
    const Extras *found = FindExtras(reason);
    if (found)
        loaded_extras = found;
    else if (!told_of_extras.exchange(true))
        LogError("%s:%d Failed to load %s: %s", kExtrasFile, reason);
    return found;
}

}  // namespace tavo
