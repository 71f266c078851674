// Loaded before the C library into tavoctl and the tools that it runs: every drive says that it sleeps, and whatever else
// would reach a drive as a command is written down in /tmp/asked, a line each, in hexadecimal.
#include "drive_requests.h"

#include <cstdio>

#include <fcntl.h>
#include <linux/hdreg.h>
#include <scsi/sg.h>

namespace {

constexpr unsigned char kCheckPower = 0xE5;

void Note(const char *format, ...) __attribute__((format(printf, 1, 2)));

void Note(const char *format, ...)
{
    char line[128];
    va_list arguments;
    va_start(arguments, format);
    const int length = std::vsnprintf(line, sizeof line, format, arguments);
    va_end(arguments);
    const auto file = static_cast<int>(
        ::syscall(SYS_openat, AT_FDCWD, "/tmp/asked", O_WRONLY | O_CREAT | O_APPEND | O_CLOEXEC, 0666));
    if (file >= 0 && length > 0)
        static_cast<void>(::syscall(SYS_write, file, line, static_cast<size_t>(length)));
    ::syscall(SYS_close, file);
}

}  // namespace

static bool Answers(unsigned long request, void *argument)
{
    if (request == SG_IO) {
        const auto *const header = static_cast<const sg_io_hdr_t *>(argument);
        Note("SG_IO %02X\n", header->cmdp ? header->cmdp[0] : 0u);
    }
    if (request != HDIO_DRIVE_CMD)
        return false;
    auto *const bytes = static_cast<unsigned char *>(argument);
    Note("%02X\n", bytes[0]);
    if (bytes[0] != kCheckPower)
        return false;
    bytes[2] = 0;  // standby
    return true;
}
