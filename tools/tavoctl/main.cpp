// tavoctl: what an administrator or a script runs to read and change the state of the appliance.
#include "frame/program.h"
#include "frame/terminal.h"
#include "standard_descriptors.h"

#include <csignal>

int main(int argc, char **argv)
{
    FillStandardDescriptors();
    // A file that would become larger than the caller's limit is a failed write, with its message and nothing left.
    std::signal(SIGXFSZ, SIG_IGN);
    tavoctl::Terminal::UseUtf8();
    return tavoctl::Program().Run({argv + (argc > 0 ? 1 : 0), argv + argc});
}
