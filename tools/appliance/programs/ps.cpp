// The appliance's ps: "-I" lists every process as "pid arguments", or "pid [name]" where a process has no arguments
// (a kernel thread). Any other use is the userland's own ps.
#include <algorithm>
#include <cstdio>
#include <cstdlib>
#include <string>
#include <string_view>
#include <vector>

#include <dirent.h>
#include <unistd.h>

namespace {

std::string ReadFile(const std::string &path)
{
    std::string text;
    if (std::FILE *file = std::fopen(path.c_str(), "re")) {
        char buffer[4096];
        for (size_t got; (got = std::fread(buffer, 1, sizeof buffer, file)) > 0;)
            text.append(buffer, got);
        std::fclose(file);
    }
    return text;
}

std::vector<int> Processes()
{
    std::vector<int> pids;
    DIR *directory = ::opendir("/proc");
    if (!directory)
        return pids;
    while (const dirent *entry = ::readdir(directory)) {
        if (const int pid = std::atoi(entry->d_name); pid > 0)
            pids.push_back(pid);
    }
    ::closedir(directory);
    std::sort(pids.begin(), pids.end());
    return pids;
}

// One process stays one line, whatever its arguments hold.
std::string Describe(int pid)
{
    const std::string process = "/proc/" + std::to_string(pid);
    std::string text = ReadFile(process + "/cmdline");
    while (!text.empty() && text.back() == '\0')
        text.pop_back();
    if (text.empty()) {
        text = ReadFile(process + "/comm");
        if (text.empty())
            return "";
        text = "[" + text.substr(0, text.size() - 1) + "]";
    }
    std::replace_if(
        text.begin(), text.end(), [](unsigned char c) { return c < ' ' || c == 0x7f; }, ' ');
    return text;
}

}  // namespace

int main(int argc, char **argv)
{
    if (argc != 2 || std::string_view(argv[1]) != "-I") {
        std::string applet = "ps";
        argv[0] = applet.data();
        ::execv("/bin/busybox", argv);
        std::perror("ps: busybox");
        return 127;
    }
    for (const int pid : Processes()) {
        if (const std::string text = Describe(pid); !text.empty())
            std::printf("%5d %s\n", pid, text.c_str());
    }
    return std::fflush(stdout) == 0 ? 0 : 1;
}
