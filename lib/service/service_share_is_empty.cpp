// Checks whether the data folder of a service is empty.
#include "tavo_service.h"

#include "core/detail/fault.h"
#include "core/detail/folder_reader.h"
#include "service/detail/service_table.h"

extern "C" int TAVOServiceShareIsEmpty(int idShare)
{
    const tavo::ServiceShareRow *row = tavo::FindServiceShare(idShare);
    if (!row)
        return Fail(ERR_BAD_PARAMETERS);
    tavo::FolderReader folder(row->share.szLink);
    if (folder.Next())
        return 0;
    // Callers delete empty folders, so an unreadable one must not look empty.
    return folder.Failed() ? Fail(ERR_MAKE_PATH) : 1;
}
