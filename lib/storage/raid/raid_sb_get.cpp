// Reads the superblock of a member.
#include "tavo_raid.h"

#include "core/detail/command_output.h"
#include "core/detail/guard.h"
#include "core/detail/log.h"
#include "core/detail/shell_command.h"
#include "storage/detail/array_name.h"
#include "storage/detail/mdadm_examine.h"

#include <cstring>

namespace {

// False when the reading ends there.
bool Take(const std::string &line, RAIDSUPERBLOCK &superblock)
{
    std::string wrong;
    switch (tavo::ReadExamineLine(line, superblock, wrong)) {
    case tavo::ExamineOutcome::good:
        return true;
    case tavo::ExamineOutcome::bad_version:
        LogError("%s:%d bad version format: '%s'.", wrong);
        return false;
    case tavo::ExamineOutcome::bad_role:
        LogError("%s:%d bad device order format: '%s'.", wrong);
        return false;
    case tavo::ExamineOutcome::bad_row:
        LogError("%s:%d Failed to trim val: '%s'.", wrong);
        return false;
    }
    return false;
}

}  // namespace

extern "C" int RAIDSBGet(const char *szMember, RAIDSUPERBLOCK *pSuperblock)
{
    if (!pSuperblock || !tavo::IsMemberPath(szMember))
        return Fail(ERR_BAD_PARAMETERS);
    return Guard([&] {
        const std::string command = *tavo::ShellCommand("/sbin/mdadm -E %s 2>/dev/null", szMember);
        RAIDSUPERBLOCK superblock = {};
        tavo::CommandOutput output(command);
        bool any = false;
        for (std::string line; output.Next(line);) {
            any = true;
            if (!Take(line, superblock))
                break;
        }
        if (!any && output.Status() < 0) {
            LogError("%s:%d Failed to popen cmd = '%s', errno=%s.", command, std::strerror(errno));
            return -1;
        }
        *pSuperblock = superblock;
        return any ? 1 : 0;
    });
}
