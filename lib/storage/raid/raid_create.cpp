// Creates an array.
#include "tavo_appliance.h"
#include "tavo_raid.h"

#include "core/detail/guard.h"
#include "core/detail/log.h"
#include "storage/detail/array_level.h"
#include "storage/detail/array_name.h"
#include "storage/detail/kernel_reach.h"
#include "storage/detail/partition_command.h"

#include <optional>
#include <string>

namespace {

constexpr size_t kMostCommand = 511;  // limit of the appliance's tools: 512 bytes with the final NUL

struct LevelOption {
    const char *level;
    bool spares;  // takes an option for their number
    const char *layout;
};

std::optional<LevelOption> OptionOf(int level)
{
    switch (level) {
    case RAID_LEVEL_5:
        return LevelOption{"5", true, ""};
    case RAID_LEVEL_1:
        return LevelOption{"1", true, ""};
    case RAID_LEVEL_6:
        return LevelOption{"6", true, ""};
    case RAID_LEVEL_0:
        return LevelOption{"0", false, ""};
    case RAID_LEVEL_LINEAR:
        return LevelOption{"linear", false, ""};
    case RAID_LEVEL_10:
        return LevelOption{"10", false, "-pn2"};  // near layout, two copies
    default:
        return std::nullopt;
    }
}

bool AreMembersPlain(const TLIBSZLIST &members)
{
    for (int i = 0; i < members.nItem; ++i) {
        if (!tavo::IsMemberPath(members.pszItem[i]))
            return false;
    }
    return true;
}

std::string MemberArgument(const RAIDREQUEST &request)
{
    std::string argument;
    for (int i = 0; i < request.pslMembers->nItem; ++i)
        argument.append(" ").append(request.pslMembers->pszItem[i]);
    const int missing = request.nSlot - (request.pslMembers->nItem - request.nSpare);
    for (int i = 0; i < missing && argument.size() <= kMostCommand; ++i)
        argument += " missing";
    return argument;
}

constexpr uint64_t kKib = 1024;

std::string SizeOption(const RAIDREQUEST &request)
{
    if (request.cbArray > 0)
        return "-z " + std::to_string(request.cbArray / kKib);
    const unsigned long limit = RAIDSizeLimitGet();
    return limit > 0 ? "-z " + std::to_string(limit) : "";
}

std::string VersionText(const RAIDVERSION *version)
{
    return version ? std::to_string(version->nMajor) + "." + std::to_string(version->nMinor) : "1.1";
}

std::string Command(const RAIDREQUEST &request, const LevelOption &option, const std::string &members)
{
    using Piece = tavo::ComposedPiece;
    const bool clean = request.fSync == 0 && !tavo::HasNoRedundancy(request.fLevel);
    const std::string spares = option.spares ? "-x" + std::to_string(request.nSpare) : "";
    const std::string size = SizeOption(request);
    return *tavo::ShellCommand("/sbin/mdadm -C %s -e %s -amd %s -R -l%s %s -n%d %s %s %s %s > /dev/null 2>&1",
                               request.szPath, VersionText(request.pVersion), Piece{clean ? "--assume-clean" : ""},
                               option.level, Piece{request.nSlot == 1 ? "-f" : ""}, request.nSlot, Piece{option.layout},
                               Piece{spares}, Piece{size}, Piece{members});
}

}  // namespace

extern "C" int RAIDCreate(const RAIDREQUEST *pRequest)
{
    if (!pRequest || !pRequest->szPath || !pRequest->pslMembers || pRequest->nSpare < 0 || pRequest->nSlot < 1 ||
        !tavo::IsArrayPath(pRequest->szPath) || !AreMembersPlain(*pRequest->pslMembers) ||
        (pRequest->pVersion && (pRequest->pVersion->nMajor < 0 || pRequest->pVersion->nMinor < 0))) {
        LogError({"%s:%d Bad parameters", 47});
        return Fail(ERR_BAD_PARAMETERS, Line{47});
    }
    const int listed = pRequest->pslMembers->nItem;
    if (listed <= pRequest->nSpare || listed - pRequest->nSpare > pRequest->nSlot) {
        LogError({"%s:%d Bad parameters", 54});
        return Fail(ERR_BAD_PARAMETERS, Line{54});
    }
    return Guard([&] {
        const std::optional<LevelOption> option = OptionOf(pRequest->fLevel);
        if (!option) {
            LogError("%s:%d unknown raid level: %d", pRequest->fLevel);
            return Fail(ERR_BAD_PARAMETERS);
        }
        const std::string beyond = tavo::ArrayBeyondReach(
            pRequest->szPath, {.level = pRequest->fLevel,
                               .slots = pRequest->nSlot,
                               .member_limit = pRequest->cbArray > 0 ? pRequest->cbArray : RAIDSizeLimitGet() * kKib,
                               .members = pRequest->pslMembers});
        if (!beyond.empty()) {
            LogError("%s:%d %s", beyond);
            return -1;
        }
        // A command that is cut could create some other array.
        const std::string members = MemberArgument(*pRequest);
        const std::string command = Command(*pRequest, *option, members);
        tavo::CommandResult result = {command, -1};
        if (members.size() <= kMostCommand && command.size() <= kMostCommand)
            result = tavo::RunComposed(command);
        if (result.status != 0) {
            LogError({"%s:%d Failed to do '%s'", 124}, command);
            return -1;
        }
        TAVORAIDMdTuningPerformance(pRequest->szPath);
        // A disk alone gets such an array, so that a second one can join it later.
        if (pRequest->nSlot == 1 && !tavo::HasNoRedundancy(pRequest->fLevel))
            LogDebug("%s:%d [Info] %s has one slot: it is normal, but loses everything with its disk",
                     pRequest->szPath);
        return 0;
    });
}
