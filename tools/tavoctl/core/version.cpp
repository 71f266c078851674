// tavoctl version: the versions of the program and the library, and the machine.
#include "tavo_error.h"

#include "families.h"
#include "frame/host.h"

#include <cerrno>
#include <filesystem>

#include <dlfcn.h>
#include <sys/utsname.h>

namespace tavoctl {
namespace {

struct Versions {
    std::string library_file;
    utsname machine;
};

std::string VersionIn(const std::string &file)
{
    const std::size_t mark = file.rfind(".so.");
    return mark == std::string::npos ? "" : file.substr(mark + 4);
}

constexpr Column<Versions> version_columns[] = {
    {"tavoctl", [](const Versions &) { return std::string(TAVOCTL_VERSION); }},
    {"library", [](const Versions &v) { return Maybe(VersionIn(v.library_file)); }},
    {"library_file", [](const Versions &v) { return Maybe(v.library_file); }},
    {"machine", [](const Versions &v) { return std::string(v.machine.machine); }},
    {"kernel", [](const Versions &v) { return std::string(v.machine.release); }},
    {"appliance", [](const Versions &) { return IsAppliance(); }},
};

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

Action ShowVersion(Arguments &)
{
    return [](Call &call) {
        Versions versions = {LibraryFile(), {}};
        if (::uname(&versions.machine) != 0)
            throw SystemFailure("ask the kernel for the machine", errno);
        call.One(version_columns, versions);
    };
}

}  // namespace

void AddVersion(Program &program)
{
    program.Add("version", "The versions of this program and of the library")
        .Add("", reads, Answer::One(version_columns), ShowVersion,
             R"(Shows the versions of this program and of the library that it
runs on, and the machine.

tavoctl version
tavoctl version --json)");
}

}  // namespace tavoctl
