// Appends one line to a log file and syncs it.
#include "tavo_error.h"

#include "core/detail/guard.h"
#include "core/detail/open_file.h"
#include "core/detail/trusted_file.h"

#include <string>

namespace {

// The message used to be a format without arguments: "%%" is one percent sign, and every other "%" has nothing to
// convert and is copied.
std::string LogLine(std::string_view message)
{
    std::string line;
    line.reserve(message.size() + 1);
    for (size_t at = 0; at < message.size(); ++at) {
        line += message[at];
        if (message[at] == '%' && message.substr(at).starts_with("%%"))
            ++at;
    }
    return line += '\n';
}

}  // namespace

extern "C" int TLIBErrLogSet(const char *szPath, const char *szMessage)
{
    if (!szPath || !szMessage)
        return Fail(ERR_BAD_PARAMETERS, Line{33});
    return Guard([&] {
        const std::string line = LogLine(szMessage);
        tavo::Fd fd = tavo::OpenTrusted(szPath, O_RDWR | O_CREAT | O_APPEND);
        if (!fd)
            return Fail(ERR_OPEN_FAILED, Line{38});
        if (!tavo::WriteAll(fd.Get(), line))
            return Fail(ERR_WRITE_FAILED, Line{52});
        if (!tavo::SyncFd(fd.Get()) || !fd.Close())
            return Fail(ERR_WRITE_FAILED);
        return 0;
    });
}
