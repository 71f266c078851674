// Applies renames and deletions of users to the member lists of all groups.
#include "tavo_group.h"

#include "core/detail/log.h"

extern "C" int TAVOUserModifyGroup(const TLIBSZHASH *)
{
    LogError("%s:%d Groups are not available yet");
    return Fail(ERR_OP_UNREGISTERED);
}
