// Fills a user record.
#include "tavo_user.h"

#include "account/detail/account_name.h"
#include "core/detail/fault.h"
#include "core/detail/owner.h"

#include <climits>
#include <cstring>
#include <string_view>

namespace {

int32_t KindOf(std::string_view name)
{
    return tavo::IsDomainName(name) ? TAVO_USER_KIND_DOMAIN : TAVO_USER_KIND_LOCAL;
}

}  // namespace

extern "C" int TAVOUserAlloc(TAVOUSER **ppUser, const char *szName, const char *szPasswd, int uid, int gid,
                             const char *szDesc, const char *szHome, const char *szShell, int expired,
                             int fCannotChgPasswd, const char *szMail, int privilege)
{
    if (!ppUser || !szName || !*szName)
        return Fail(ERR_BAD_PARAMETERS);
    const char *const texts[] = {szName, szPasswd, szDesc, szHome, szShell, szMail};
    size_t size = sizeof(TAVOUSER);
    for (const char *text : texts)
        size += (text ? std::strlen(text) : 0) + 1;
    if (size > INT_MAX)
        return Fail(ERR_OUT_OF_MEMORY);
    // A new block also for a record that is refilled: the arguments may be its own strings.
    tavo::HeapBlock<TAVOUSER> user(static_cast<TAVOUSER *>(std::malloc(size)));
    if (!user)
        return Fail(ERR_OUT_OF_MEMORY);

    char *next = reinterpret_cast<char *>(user.Get() + 1);
    char *copies[std::size(texts)];
    for (size_t i = 0; i < std::size(texts); ++i) {
        copies[i] = next;
        next = ::stpcpy(next, texts[i] ? texts[i] : "") + 1;
    }
    *user = {.szName = copies[0],
             .szPasswd = copies[1],
             .nUid = uid,
             .nGid = gid,
             .szDesc = copies[2],
             .szHome = copies[3],
             .szShell = copies[4],
             .nExpired = expired,
             .fCannotChgPasswd = fCannotChgPasswd ? 1 : 0,
             .szMail = copies[5],
             .nKind = KindOf(szName),
             .nPrivilege = privilege,
             .cbBlock = static_cast<int32_t>(size)};
    TAVOUserFree(std::exchange(*ppUser, user.Release()));
    return 0;
}
