// The appliance's partitioning tool.
#include "block_target.h"
#include "commands.h"
#include "options.h"
#include "standard_descriptors.h"

#include <cstdio>
#include <exception>

namespace {

int Run(const sfdisk::Options &options)
{
    switch (options.action) {
    case sfdisk::Action::list:
        return sfdisk::RunList(options);
    case sfdisk::Action::create:
        return sfdisk::RunCreate(options);
    case sfdisk::Action::clear:
        return sfdisk::RunClear(options);
    case sfdisk::Action::label:
        return sfdisk::RunLabel(options);
    case sfdisk::Action::help:
        std::fputs(sfdisk::kHelp, stdout);
        break;
    }
    return 0;
}

}  // namespace

int main(int argc, char **argv)
{
    FillStandardDescriptors();
    std::string complaint;
    const auto options = sfdisk::ParseOptions({argv + 1, argv + argc}, complaint);
    if (!options) {
        std::fprintf(stderr, "sfdisk: %s (--help)\n", complaint.c_str());
        return 2;
    }
    try {
        const int status = Run(*options);
        return std::fflush(stdout) == 0 ? status : 1;
    } catch (const std::exception &failure) {
        std::fprintf(stderr, "sfdisk: %s: %s\n", options->path.c_str(), failure.what());
        return 1;
    }
}
