// tavoctl version: what runs here, and on what.
#include "families.h"
#include "frame/failure.h"
#include "frame/host.h"
#include "frame/program.h"
#include "frame/table.h"

#include "tavo_error.h"

#include <filesystem>

#include <dlfcn.h>
#include <sys/utsname.h>

namespace tavoctl {
namespace {

// The file that the library was loaded from, with the links followed: its name ends in the version.
std::string LibraryFile()
{
    Dl_info found = {};
    if (!::dladdr(reinterpret_cast<const void *>(&TLIBErrGet), &found) || !found.dli_fname)
        return {};
    std::error_code ignored;
    const std::filesystem::path file = std::filesystem::canonical(found.dli_fname, ignored);
    return file.empty() ? found.dli_fname : file.string();
}

std::string VersionIn(const std::string &file)
{
    const std::size_t mark = file.rfind(".so.");
    return mark == std::string::npos ? "" : file.substr(mark + 4);
}

class Version : public Verb {
  public:
    static constexpr VerbInfo info = {"", reads,
                                      "Shows the versions of this program and of the library that it runs on, and the "
                                      "machine.",
                                      "tavoctl version\n"
                                      "tavoctl version --json"};

    int Run(const Call &call) override
    {
        utsname machine = {};
        if (::uname(&machine) != 0)
            throw Failure{.attempted = "ask the kernel for the machine"};
        const std::string library = LibraryFile();
        Record record;
        record.Add("tavoctl", TAVOCTL_VERSION);
        record.Add("library", Known(VersionIn(library)));
        record.Add("library_file", Known(library));
        record.Add("machine", machine.machine);
        record.Add("kernel", machine.release);
        record.Add("appliance", IsAppliance());
        call.Print(record);
        return exit_done;
    }
};

}  // namespace

void AddVersion(Program &program)
{
    program.Add("version", "The versions of this program and of the library").Add<Version>();
}

}  // namespace tavoctl
