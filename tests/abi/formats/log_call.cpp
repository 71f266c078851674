// Log calls and commands with a format that does not fit: each CASE but 0 must not compile.
#include "core/detail/log.h"
#include "core/detail/shell_command.h"

void LogCalls(const char *name, int code)
{
#if CASE == 0
    LogError("%s:%d [%s] 0x%04X %c %5d 100%%", name, code, 'x', 7L);
    LogError({"%s:%d Parameter error", 37});
    (void)tavo::ShellCommand("/bin/true %s %d", name, code);
#elif CASE == 1
    LogError("%s:%d Duplicated key:[%s]");  // an argument is missing
#elif CASE == 2
    LogError("%s:%d Duplicated key", name);  // one too many
#elif CASE == 3
    LogError("%s:%d errno=%d", name);  // text for a number
#elif CASE == 4
    LogDebug("%s:%d path=%s", code);  // a number for text
#elif CASE == 5
    LogError("%d:%s path=%s", name);  // module and line turned round
#elif CASE == 6
    LogError("%s:%d %f", code);  // a conversion that nothing writes
#elif CASE == 7
    (void)tavo::ShellCommand("/bin/true %s", code);
#elif CASE == 8
    (void)tavo::ShellCommand("/bin/true %s %s", name);
#elif CASE == 9
    LogError(name);  // not a literal
#endif
    (void)name, (void)code;
}
