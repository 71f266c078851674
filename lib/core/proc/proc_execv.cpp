// Runs a program with a given argument vector in the caller's session, directory and environment.
#include "tavo_proc.h"

#include "core/detail/child_process.h"
#include "core/detail/child_status.h"

#include <unistd.h>

extern "C" int TLIBExecv(const char *szProgram, char *const rgszArg[], int fWait)
{
    const tavo::KeepChildStatus keep;
    const pid_t pid = tavo::StartChild(
        {.program = szProgram, .arguments = rgszArg, .environment = environ, .abort_on_failure = true});
    if (pid < 0)
        return -1;
    return fWait ? tavo::CollectChild(pid) : 0;
}
