// Starts the command in the entered root.
#include "enter.h"

#include <algorithm>
#include <cerrno>
#include <cstdio>
#include <cstdlib>
#include <cstring>

#include <elf.h>
#include <fcntl.h>
#include <linux/capability.h>
#include <sys/prctl.h>
#include <unistd.h>

namespace enter {
namespace {

constexpr char inner_emulator[] = "/run/emulator";

bool IsForeign(const std::string &program)
{
    Elf32_Ehdr head = {}, own = {};
    const auto read = [](const char *path, Elf32_Ehdr *into) {
        const int file = ::open(path, O_RDONLY | O_CLOEXEC);
        const bool whole = file >= 0 && ::read(file, into, sizeof *into) == ssize_t{sizeof *into};
        ::close(file);
        return whole && std::memcmp(into->e_ident, ELFMAG, SELFMAG) == 0;
    };
    return read(program.c_str(), &head) && read("/bin/busybox", &own) && head.e_machine != own.e_machine;
}

std::string Find(const std::string &name)
{
    if (name.find('/') != std::string::npos)
        return name;
    for (const char *folder : {"/usr/sbin/", "/usr/bin/", "/sbin/", "/bin/"}) {
        const std::string path = folder + name;
        if (::access(path.c_str(), X_OK) == 0)
            return path;
    }
    return name;
}

void SetEnvironment(const char *form, const std::string &lacks)
{
    // Paths of the machine outside mean nothing here.
    for (const char *name : {"LD_LIBRARY_PATH", "LD_PRELOAD", "TMPDIR", "TMP", "TEMP", "OLDPWD", "ENV", "BASH_ENV",
                             "XDG_RUNTIME_DIR", "MAIL", "SUDO_USER"})
        ::unsetenv(name);
    ::setenv("PATH", "/usr/sbin:/usr/bin:/sbin:/bin", 1);
    ::setenv("HOME", "/root", 1);
    ::setenv("USER", "root", 1);
    ::setenv("LOGNAME", "root", 1);
    ::setenv("SHELL", "/bin/sh", 1);
    ::setenv("PS1", "appliance:\\w\\$ ", 1);
    ::setenv("TAVO_ROOT_FORM", form, 1);
    ::setenv("TAVO_ROOT_LACKS", lacks.c_str(), 1);
}

}  // namespace

// Everything that reaches past the root: what a faulty library could do to the machine must not be possible. The
// bounding set is enough, because an exec follows.
void DropCapabilities(bool whole_machine_is_visible)
{
    for (const int capability :
         {CAP_MKNOD, CAP_SYS_RAWIO, CAP_SYS_MODULE, CAP_SYS_TIME, CAP_SYS_BOOT, CAP_SYSLOG, CAP_LINUX_IMMUTABLE})
        ::prctl(PR_CAPBSET_DROP, capability, 0, 0, 0);
    if (whole_machine_is_visible) {
        for (const int capability : {CAP_SYS_ADMIN, CAP_NET_ADMIN, CAP_SYS_PTRACE, CAP_DAC_READ_SEARCH})
            ::prctl(PR_CAPBSET_DROP, capability, 0, 0, 0);
    }
}

void RunCommand(const Request &request, const char *form, const std::string &lacks, bool emulate)
{
    if (::chdir(request.cwd.c_str()) != 0)
        Must(::chdir("/") == 0, "go to", "/");
    SetEnvironment(form, lacks);
    UnblockSignals();

    std::vector<std::string> words = request.command;
    std::string program = Find(words[0]);
    if (emulate && IsForeign(program)) {
        words[0] = program;
        words.insert(words.begin(), inner_emulator);
        program = inner_emulator;
    }
    std::vector<char *> argv;
    std::transform(words.begin(), words.end(), std::back_inserter(argv), [](std::string &word) { return word.data(); });
    argv.push_back(nullptr);
    ::execv(program.c_str(), argv.data());
    const int error = errno;
    std::fprintf(stderr, "enter: cannot run %s: %s\n", program.c_str(), std::strerror(error));
    ::_exit(error == ENOENT ? 127 : 126);
}

}  // namespace enter
