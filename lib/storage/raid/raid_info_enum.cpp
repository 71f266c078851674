// Reads all arrays.
#include "tavo_raid.h"

#include "core/detail/guard.h"
#include "core/detail/list_owner.h"
#include "core/detail/log.h"
#include "core/detail/owner.h"

#include <memory>

namespace {

// An array may go between its listing and its reading.
bool IsGone(int code)
{
    return code == ERR_SIZE_UNKNOWN || code == ERR_OPEN_FAILED || code == ERR_PATH_NOT_FOUND;
}

// Returns 1 when added, 0 when skipped, or -1.
int Add(const char *path, std::unique_ptr<RAIDLIST, tavo::FreedBy<RAIDListFree>> &owner)
{
    RAIDINFO *info = nullptr;
    const int result = RAIDInfoGet(path, &info);
    if (result == 0 || (result < 0 && IsGone(TLIBErrGet()))) {
        LogDebug("%s:%d RAID not exist %s", path);
        return 0;
    }
    if (result < 0) {
        LogError("%s:%d Failed to get RAID information %s, errno=0X%X", path, TLIBErrGet());
        return -1;
    }
    RAIDLIST *list = owner.release();
    const int pushed = RAIDListPush(&list, info);
    owner.reset(list);
    if (pushed != 0)
        RAIDInfoFree(info);
    return pushed == 0 ? 1 : -1;
}

}  // namespace

extern "C" int RAIDInfoEnum(RAIDLIST **ppList)
{
    if (!ppList)
        return Fail(ERR_BAD_PARAMETERS);
    *ppList = nullptr;
    return Guard([&] {
        tavo::ListOwner paths(PslTLIBSzListAlloc(512));
        if (!paths || RAIDPathEnum(paths.Addr()) < 0)
            return -1;
        std::unique_ptr<RAIDLIST, tavo::FreedBy<RAIDListFree>> list;
        int count = 0;
        for (int i = 0; i < paths->nItem; ++i) {
            const int added = Add(paths->pszItem[i], list);
            if (added < 0)
                return -1;
            count += added;
        }
        *ppList = list.release();
        return count;
    });
}
