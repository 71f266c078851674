// Takes the place of the C library's ioctl in a program that this is loaded into.
#ifndef TAVO_TESTS_PRELOAD_DRIVE_REQUESTS_H
#define TAVO_TESTS_PRELOAD_DRIVE_REQUESTS_H

#include <cstdarg>

#include <sys/ioctl.h>
#include <sys/syscall.h>
#include <unistd.h>

// Returns whether it has answered the request; otherwise the kernel does.
static bool Answers(unsigned long request, void *argument);

extern "C" int ioctl(int fd, unsigned long request, ...) noexcept
{
    va_list arguments;
    va_start(arguments, request);
    void *const argument = va_arg(arguments, void *);
    va_end(arguments);
    return argument && Answers(request, argument) ? 0 : static_cast<int>(::syscall(SYS_ioctl, fd, request, argument));
}

// What 32-bit programs with 64-bit times call.
extern "C" int __ioctl_time64(int, unsigned long, ...) noexcept __attribute__((alias("ioctl")));

#endif
