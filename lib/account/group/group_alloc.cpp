// Fills a group record from a line of the group file.
#include "tavo_group.h"

#include "account/detail/group_line.h"
#include "core/detail/guard.h"

extern "C" int TAVOGroupAlloc(TAVOGROUP **ppGroup, const char *szLine)
{
    if (!ppGroup || !szLine)
        return Fail(ERR_BAD_PARAMETERS);
    return Guard([&] {
        const tavo::Result<tavo::GroupLine> line = tavo::ParseGroupLine(szLine);
        if (!line)
            return Fail(line.Failure());
        std::vector<const char *> members;
        for (const std::string &member : line->members)
            members.push_back(member.c_str());
        members.push_back(nullptr);
        return TAVOGroupAlloc2(ppGroup, line->name.c_str(), line->gid, members.data());
    });
}
