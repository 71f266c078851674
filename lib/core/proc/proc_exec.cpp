// Runs a program detached from the caller and waits for its end.
#include "tavo_proc.h"

#include "core/detail/argument_list.h"
#include "core/detail/child_process.h"
#include "core/detail/child_status.h"
#include "core/detail/fault.h"
#include "core/detail/path_only_environment.h"

extern "C" int TLIBExec(const char *szProgram, ...)
{
    va_list list;
    va_start(list, szProgram);
    const tavo::ArgumentList<4> arguments(szProgram, list);
    va_end(list);
    const tavo::PathOnlyEnvironment environment;

    const tavo::KeepChildStatus keep;
    const pid_t pid = tavo::StartChild({.program = szProgram,
                                        .arguments = arguments.Vector(),
                                        .environment = environment.Variables(),
                                        .new_session = true,
                                        .root_directory = true,
                                        .default_signals = true});
    const int result = pid < 0 ? -1 : tavo::CollectChild(pid);
    return result == -1 ? Fail(ERR_OP_FAILURE) : result;
}
