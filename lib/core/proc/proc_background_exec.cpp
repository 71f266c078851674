// Starts a daemon.
#include "tavo_proc.h"

#include "core/detail/argument_list.h"
#include "core/detail/child_process.h"
#include "core/detail/fault.h"

#include <unistd.h>

extern "C" pid_t TLIBBackgroundExec(const char *szProgram, ...)
{
    va_list list;
    va_start(list, szProgram);
    const tavo::ArgumentList<4> arguments(szProgram, list);
    va_end(list);

    const pid_t pid = tavo::StartChild({.program = szProgram,
                                        .arguments = arguments.Vector(),
                                        .environment = environ,
                                        .new_session = true,
                                        .close_others = true,
                                        .abort_on_failure = true});
    return pid < 0 ? Fail(ERR_OP_FAILURE) : pid;
}
