// The folder through which a test and the scripted tools talk: what is expected, in order, and what was called.
//   /var/scenario/calls/NNN/line    the expected call as one quoted line; "TOOL ..." means any arguments
//                           stdout  printed as it is; stderr likewise
//                           status  the exit status in decimal, or "signal N"; 0 without this file
//                           times   how often: a number, or "any" for never, once or often, at any moment; default 1
//                           run     a program that is run first with the call's arguments
//                           seen    written by the tool: how often it was called
//   /var/scenario/order   "any" when the calls may come in any order
//   /var/scenario/log     one line per call: NNN and the call, "-" and the call when it was not expected, "~" and the call
//                         when there is no scenario and the userland's own tool of that name ran
#ifndef TOOLS_APPLIANCE_SCENARIO_DIR_H
#define TOOLS_APPLIANCE_SCENARIO_DIR_H

#include <algorithm>
#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <iterator>
#include <string>
#include <string_view>
#include <vector>

namespace scenario {

inline const char *const folder = "/var/scenario";
inline const char *const log_file = "/var/scenario/log";
inline constexpr int unscripted_status = 97;

inline std::string Read(const std::filesystem::path &path)
{
    std::ifstream in(path, std::ios::binary);
    return {std::istreambuf_iterator<char>(in), {}};
}

inline void Write(const std::filesystem::path &path, std::string_view text)
{
    std::ofstream(path, std::ios::binary) << text;
}

struct Call {
    std::filesystem::path path;
    std::string line;
    int times;  // -1: any
    int seen;

    bool Matches(std::string_view other) const
    {
        if (!line.ends_with(" ..."))
            return line == other;
        const std::string_view tool = std::string_view(line).substr(0, line.size() - 4);
        return other == tool || other.starts_with(std::string(tool) + " ");
    }
};

inline bool Exists()
{
    return std::filesystem::is_directory(std::filesystem::path(folder) / "calls");
}

inline std::vector<Call> Calls()
{
    std::vector<Call> calls;
    if (!Exists())
        return calls;
    for (const auto &entry : std::filesystem::directory_iterator(std::filesystem::path(folder) / "calls")) {
        const std::string times = Read(entry.path() / "times");
        std::string line = Read(entry.path() / "line");
        if (line.ends_with('\n'))
            line.pop_back();
        calls.push_back({entry.path(), line,
                         times.starts_with("any") ? -1
                         : times.empty()          ? 1
                                                  : std::atoi(times.c_str()),
                         std::atoi(Read(entry.path() / "seen").c_str())});
    }
    std::sort(calls.begin(), calls.end(), [](const Call &a, const Call &b) { return a.path < b.path; });
    return calls;
}

inline std::filesystem::path AddCall(const std::string &line)
{
    const std::filesystem::path calls = std::filesystem::path(folder) / "calls";
    std::filesystem::create_directories(calls);
    const auto count = std::distance(std::filesystem::directory_iterator(calls), {});
    std::string number = std::to_string(count + 1);
    number.insert(0, number.size() < 4 ? 4 - number.size() : 0, '0');
    const std::filesystem::path call = calls / number;
    std::filesystem::create_directory(call);
    Write(call / "line", line + "\n");
    return call;
}

inline void Reset()
{
    std::filesystem::remove_all(std::filesystem::path(folder) / "calls");
    std::filesystem::remove(std::filesystem::path(folder) / "order");
    std::filesystem::remove(log_file);
}

// What went otherwise than scripted, one line each; empty when all went as scripted.
inline std::string Complaints()
{
    std::string text;
    std::ifstream log(log_file);
    for (std::string line; std::getline(log, line);) {
        if (line.starts_with("- "))
            text += "not expected: " + line.substr(2) + "\n";
    }
    for (const Call &call : Calls()) {
        if (call.times >= 0 && call.seen < call.times)
            text += "not called: " + call.line + "\n";
    }
    return text;
}

}  // namespace scenario

#endif
