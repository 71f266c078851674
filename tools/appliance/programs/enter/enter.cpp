// Runs a command in a private copy of an appliance root.
#include "enter.h"

#include <cerrno>
#include <cstdarg>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <utility>

#include <sys/stat.h>
#include <unistd.h>

namespace enter {

void Die(const char *format, ...)
{
    va_list args;
    va_start(args, format);
    std::fputs("enter: ", stderr);
    std::vfprintf(stderr, format, args);
    std::fputc('\n', stderr);
    va_end(args);
    if (!unfinished.empty())
        RemoveTree(std::exchange(unfinished, ""));
    std::exit(exit_refused);
}

void Must(bool done, const char *what, const std::string &path)
{
    if (!done)
        Die("cannot %s %s: %s", what, path.c_str(), std::strerror(errno));
}

}  // namespace enter

int main(int argc, char **argv)
{
    using namespace enter;
    const Request request = ReadOptions(argc, argv);
    BlockSignals();
    ::umask(022);

    std::string why;
    int status = -1;
    if (request.form != Form::chroot)
        status = EnterNamespaces(request, &why);
    if (status == -1 && request.form != Form::namespaces) {
        if (request.form == Form::any)
            std::fprintf(stderr, "enter: no namespaces here (%s): chroot alone\n", why.c_str());
        status = EnterChroot(request, &why);
    }
    if (status == -1)
        Die("%s", why.c_str());
    EndAs(status);
}
