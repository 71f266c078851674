// tavoctl: administrators and scripts run it to read and change the state of the appliance.
#include "frame/program.h"
#include "frame/terminal.h"
#include "standard_descriptors.h"

#include <csignal>
#include <iostream>
#include <streambuf>

namespace {

// Standard output of a caller who has closed it: an answer that is written there has not arrived.
class Nobody final : public std::streambuf {};

}  // namespace

int main(int argc, char **argv)
{
    Nobody nobody;
    std::streambuf *const output = std::cout.rdbuf();
    if (FillStandardDescriptors())
        std::cout.rdbuf(&nobody);
    // A file that would become larger than the caller's limit is a failed write, with its message and nothing left.
    std::signal(SIGXFSZ, SIG_IGN);
    tavoctl::Terminal::UseUtf8();
    const int status = tavoctl::Program().Run({argv + (argc > 0 ? 1 : 0), argv + argc});
    std::cout.rdbuf(output);
    return status;
}
