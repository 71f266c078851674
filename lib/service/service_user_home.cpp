// Switches user homes: the "homes" share and, when it is enabled, a folder for every user.
#include "tavo_service.h"
#include "tavo_user.h"

#include "core/detail/guard.h"
#include "core/detail/list_owner.h"
#include "core/detail/log.h"
#include "service/detail/data_folder.h"

#include <cerrno>

#include <fcntl.h>
#include <pwd.h>
#include <unistd.h>

namespace {

constexpr const char *kHomes = "/var/services/homes";

// Creates a home that only its user may enter. An existing file or folder of that name is not changed.
void MakeHome(int homes, const char *user)
{
    const passwd *account = ::getpwnam(user);
    if (!account || std::string_view(user).find('/') != std::string_view::npos || user[0] == '.')
        return;
    if (::mkdirat(homes, user, 0700) != 0) {
        if (errno != EEXIST)
            LogError("%s:%d Failed to create the home of %s", user);
        return;
    }
    if (::fchownat(homes, user, account->pw_uid, account->pw_gid, AT_SYMLINK_NOFOLLOW) != 0)
        LogError("%s:%d Failed to give %s its home", user);
}

int MakeHomes()
{
    const tavo::Fd homes(::open(kHomes, O_RDONLY | O_DIRECTORY | O_CLOEXEC));
    tavo::ListOwner users(PslTLIBSzListAlloc(0));
    if (!homes)
        return Fail(ERR_OPEN_FAILED);
    if (!users)
        return Fail(ERR_OUT_OF_MEMORY);
    if (TAVOUserEnum(users.Addr(), TAVO_USER_LOCAL) < 0)
        return -1;
    for (int i = 0; i < users->nItem; ++i)
        MakeHome(homes.Get(), SzTLIBSzListGet(users.Get(), i));
    return 0;
}

}  // namespace

extern "C" int TAVOServiceUserHome(const TAVOSERVICE *pService, int action)
{
    if (TAVOServiceSTDAction(pService, action) != 0)
        return -1;
    if (action != TAVO_SERVICE_ENABLE)
        return 0;
    return MakeHomes();
}
