// Removes the temporary files beside the account files.
#include "tavo_user.h"

#include "account/detail/commit_resume.h"
#include "core/detail/fault.h"

extern "C" int TAVOUserRemoveTmpFiles(void)
{
    const int code = tavo::RemoveTemporaries(tavo::kUserFamily);
    return code == 0 ? 0 : Fail(code);
}
