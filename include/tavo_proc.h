/*
 * Programs and processes: running programs and reading their exit status, signalling daemons through their pid files,
 * finding processes.
 *
 * Status: functions that return the status of a program return its exit code (0 to 255); -1 when it was killed by a
 * signal or could not be started or waited for; 0 when other code of this process collected it first, so that its code
 * is not known.
 *
 * Programs are named by their path; PATH is not searched. No program inherits a lock of tavo_lock.h. The functions are
 * for single-threaded callers: they change the process-wide action of SIGCHLD while they run (an ignored SIGCHLD, or
 * SA_NOCLDWAIT, would hide the program's status) and put it back afterwards.
 */
#ifndef TAVO_PROC_H
#define TAVO_PROC_H

#include "tavo_error.h"

#include <sys/types.h>

TAVO_BEGIN_DECLS

/* Runs a command line through the shell, as system(3), with the caller's environment. Never pass text that came from
 * outside the program: the shell would run it as commands.
 * Returns the wait status (not the exit code) that system(3) returns; 0 for NULL, without running anything. Sets no
 * code.
 * Runs: /bin/sh */
TAVO_API int TLIBSystem(const char *szCommand);

/* Runs a program and waits for its end. szProgram is followed by at most four arguments (const char *) and NULL; with
 * four arguments the NULL may be left out.
 * The program runs in a session of its own, in the directory "/", with /dev/null as standard input, output and error,
 * with no environment but the caller's PATH, every signal at its default and none blocked. Other descriptors that the
 * caller has not marked close-on-exec are inherited.
 * Returns the status; 255 when szProgram could not be executed. With -1, ERR_OP_FAILURE is set. */
TAVO_API int TLIBExec(const char *szProgram, ...);

/* Runs a program with the argument vector rgszArg (its first entry is the program's name, a NULL ends it). It has
 * /dev/null as standard input, output and error and keeps the caller's session, directory and environment.
 * Returns the status, -1 when szProgram could not be executed (the child aborts); with fWait 0, 0 as soon as the child
 * is started, which the caller then collects with wait(2). Sets no code. */
TAVO_API int TLIBExecv(const char *szProgram, char *const rgszArg[], int fWait);

/* Starts a daemon and does not wait for it. The arguments are passed as to TLIBExec. It has a session of its own,
 * /dev/null as standard input, output and error, no other descriptor, and keeps the caller's directory and environment.
 * Returns its pid, which the caller must collect with wait(2) later; a program that could not be executed also has a
 * pid and ends by SIGABRT at once. -1 with ERR_OP_FAILURE when no process could be started. */
TAVO_API pid_t TLIBBackgroundExec(const char *szProgram, ...);

/* As TLIBExec, with at most 30 arguments, for at most cSeconds seconds from the call on. After that, the
 * program and the process group that it leads get SIGTERM and at once SIGKILL. A program that does not die within a
 * second, because it waits for a disk that does not answer, is left; a later call that starts a program collects it.
 * The child is a copy of the caller, so that the caller does not wait for a program that cannot be read from its disk.
 * A caller with much memory therefore pays more for this function than for the others.
 * The first call installs a handler of SIGCHLD, which stays; a process that ignored SIGCHLD before still leaves no
 * zombies. The process is aborted when it has no descriptors left for the pipe that the handler writes to.
 * Returns the status; 255 when szProgram could not be executed; else -1 with
 *   ERR_BAD_PARAMETERS  cSeconds is below 1, or szProgram is NULL or empty; logged
 *   ERR_TIMER_EXPIRED   the time has passed
 *   ERR_OP_FAILURE      the program was killed by a signal, or no process could be started */
TAVO_API int TLIBTimedExec(int cSeconds, const char *szProgram, ...);

/*
 * Pid files: the first line holds a process id in decimal, from 1 to the kernel's largest process id, with only blanks
 * around it; otherwise the file counts as holding no number. Another user could plant a pid file to make root signal a
 * process of that user's choice. So root does not open a symbolic link as a pid file, and for root these files hold no
 * number: a file that belongs neither to root nor to the user whose process it names, and a file that its group or
 * others may write to.
 */

/* Returns the process id in the pid file szPath; 0 when it holds no number; -1 with
 *   ERR_BAD_PARAMETERS  szPath is NULL
 *   ERR_OPEN_FAILED     the file cannot be opened, is not a regular file, or is a symbolic link and the caller root */
TAVO_API pid_t TLIBReadPidFile(const char *szPath);

/* Writes the caller's process id and a newline to szPath, creating the file (mode 0644, whatever the umask). An
 * existing file loses the write permission of group and others.
 * In a directory that everybody may write to, an existing file must belong to root or to the caller, be regular and
 * have no second name.
 * Returns 0, or -1 with
 *   ERR_BAD_PARAMETERS  szPath is NULL
 *   ERR_OPEN_FAILED     the file cannot be created or opened, is not a regular file or fails this check
 *   ERR_WRITE_FAILED    the text could not be written */
TAVO_API int TAVOProcPidFileCreate(const char *szPath);

/* Sends signal to the process named by the pid file szPath. Signal 0 only tests that the process is there.
 * Returns 0, or -1 with
 *   ERR_BAD_PARAMETERS  szPath is NULL or signal is negative
 *   ERR_OPEN_FAILED     there is no file or no number in it
 *   ERR_SYS_UNKNOWN     the signal could not be sent: no such process, not allowed, no such signal */
TAVO_API int TLIBProcSignalByPidFile(const char *szPath, int signal);

/* Returns 1 when TLIBProcSignalByPidFile(szPath, 0) succeeds, else 0 with its code. */
TAVO_API int TLIBProcAliveByPidFile(const char *szPath);

/* Returns 1 when there is a process pid, of any owner, else 0; 0 also for a pid below 1. Sets no code. */
TAVO_API int BlTLIBProcAlive(pid_t pid);

/* Finds the processes whose line in the process table matches szPattern, and stores the pids of the first nPid of them
 * in rgPid (not touched when nPid is 0 or less). The caller's own process counts when it matches; the search does not.
 * The source is /bin/ps -I, searched by grep, so szPattern is a basic regular expression there. Where ps does not know
 * -I, the process table is read from /proc ("PID ARGUMENTS", or "PID [NAME]" for a process without arguments) and
 * szPattern is plain text. The scratch file /tmp/tempTLIBPs followed by the caller's pid is removed afterwards; if
 * another user has taken that name, a dot and six random characters follow it.
 * Returns how many processes match, which may exceed nPid, or -1 with
 *   ERR_BAD_PARAMETERS  szPattern is NULL or longer than 1024 bytes, or rgPid is NULL with nPid above 0
 *   ERR_READ_FAILED     the scratch file cannot be created or opened again
 *   ERR_OUT_OF_MEMORY
 * Files: /tmp/tempTLIBPs* (created and removed)
 * Runs: /bin/ps, /bin/grep */
TAVO_API int TLIBPs(const char *szPattern, pid_t *rgPid, int nPid);

/* Removes a file, or a symbolic link itself. Directories are refused.
 * Returns 0, or -1 with
 *   ERR_BAD_PARAMETERS  szPath is NULL
 *   ERR_FILE_NOT_FOUND  there is no such file
 *   ERR_ACCESS_DENIED   permission is missing, or the file system is read-only
 *   ERR_SYS_UNKNOWN     anything else */
TAVO_API int TLIBSysRemove(const char *szPath);

TAVO_END_DECLS

#endif
