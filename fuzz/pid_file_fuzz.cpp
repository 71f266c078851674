// Pid files: what is read from any text is a process id that the text plainly spells, or nothing.
#include "core/detail/pid_file.h"
#include "input.h"

#include <algorithm>
#include <cstdint>
#include <cstdio>
#include <cstdlib>
#include <string>
#include <string_view>

using fuzz::Check;

namespace {

constexpr pid_t kLargest = 32768;

// The slow and obvious way: cut the blanks off both ends of the first line, and compare with every spelling of the number.
pid_t Expected(const std::string &text)
{
    const std::string blanks = " \t\r\v\f";
    std::string line = text.substr(0, text.find('\n'));
    while (!line.empty() && blanks.find(line.front()) != std::string::npos)
        line.erase(0, 1);
    while (!line.empty() && blanks.find(line.back()) != std::string::npos)
        line.pop_back();
    for (const char byte : line) {
        if (byte < '0' || byte > '9')
            return 0;
    }
    line.erase(0, std::min(line.find_first_not_of('0'), line.size()));
    if (line.empty() || line.size() > 5)
        return 0;
    const long number = std::strtol(line.c_str(), nullptr, 10);
    return number <= kLargest ? static_cast<pid_t>(number) : 0;
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const uint8_t *data, size_t size)
{
    const std::string text(reinterpret_cast<const char *>(data), size);
    const pid_t pid = tavo::ParsePid(text, kLargest);
    Check(pid >= 0 && pid <= kLargest, "a process id that there cannot be");
    Check(pid == Expected(text), "another number than the one that stands there");
    const std::string again = std::to_string(pid) + "\n";
    Check(tavo::ParsePid(again, kLargest) == pid, "what a daemon writes is read back");
    return 0;
}
