// Fills a group record.
#include "tavo_group.h"

#include "account/detail/account_name.h"
#include "account/detail/group_line.h"
#include "core/detail/fault.h"
#include "core/detail/owner.h"

#include <climits>
#include <cstring>

extern "C" int TAVOGroupAlloc2(TAVOGROUP **ppGroup, const char *szName, int gid, const char *const *rgszMember)
{
    if (!ppGroup || !szName || !*szName)
        return Fail(ERR_BAD_PARAMETERS);
    size_t count = 0;
    size_t size = sizeof(TAVOGROUP) + std::strlen(szName) + 1;
    for (const char *const *member = rgszMember; member && *member; ++member) {
        if (!tavo::IsMember(*member))
            continue;
        ++count;
        size += std::strlen(*member) + 1;
    }
    size += (count + 1) * sizeof(char *);
    if (size > INT_MAX)
        return Fail(ERR_OUT_OF_MEMORY);
    // A new block also for a record that is refilled: the arguments may be its own strings.
    tavo::HeapBlock<TAVOGROUP> group(static_cast<TAVOGROUP *>(std::malloc(size)));
    if (!group)
        return Fail(ERR_OUT_OF_MEMORY);

    char **members = reinterpret_cast<char **>(group.Get() + 1);
    char *next = reinterpret_cast<char *>(members + count + 1);
    *group = {.szName = next,
              .nGid = gid,
              .rgszMember = members,
              .nKind = tavo::IsDomainName(szName) ? TAVO_GROUP_KIND_DOMAIN : TAVO_GROUP_KIND_LOCAL,
              .cbBlock = static_cast<int32_t>(size)};
    next = ::stpcpy(next, szName) + 1;
    for (const char *const *member = rgszMember; member && *member; ++member) {
        if (!tavo::IsMember(*member))
            continue;
        *members++ = next;
        next = ::stpcpy(next, *member) + 1;
    }
    *members = nullptr;
    TAVOGroupFree(std::exchange(*ppGroup, group.Release()));
    return 0;
}
