// The exit statuses of tavoctl. Scripts rely on them.
#ifndef TAVOCTL_EXIT_STATUS_H
#define TAVOCTL_EXIT_STATUS_H

namespace tavoctl {

enum ExitStatus : int {
    exit_done = 0,
    exit_failed = 1,
    exit_usage = 2,      // the command line or an argument is wrong, whichever layer noticed
    exit_not_found = 3,  // the object is not there
    exit_busy = 4,       // another program holds a lock or a device: trying again may help
    exit_denied = 5,     // permission denied: only root may do it
};

// The status of `lock run` for a program that it could not run, as in shells.
enum ProgramStatus : int {
    exit_cannot_execute = 126,
    exit_no_such_program = 127,
    exit_by_signal = 128,  // plus the number of the signal that ended the program
};

}  // namespace tavoctl

#endif
