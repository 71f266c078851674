// Runs one of the quota tools on a volume.
#ifndef TAVO_ACCOUNT_DETAIL_QUOTA_COMMAND_H
#define TAVO_ACCOUNT_DETAIL_QUOTA_COMMAND_H

#include "tavo_error.h"

#include "account/detail/quota_volumes.h"
#include "core/detail/result.h"
#include "core/detail/run_command.h"
#include "core/detail/shell_command.h"

namespace tavo {

struct QuotaCommand {
    CheckedFormat<ArgKind::text, ArgKind::number> format;  // volume path and number
    Code failure;                                          // the code when the tool fails
};

// 0, the command's code, or ERR_QUOTA_SHELL when it could not be run.
inline Code RunQuotaCommand(const QuotaCommand &command, int volume)
{
    const std::optional<std::string> text = ShellCommand(command.format, kVolume, volume);
    const int status = text ? RunCommand(*text) : -1;
    return status == 0 ? Code() : status < 0 ? Code(ERR_QUOTA_SHELL) : command.failure;
}

}  // namespace tavo

#endif
