// The system's own tools, for what the library leaves to them: file systems, and arrays that have to be forced.
#ifndef TAVOCTL_SYSTEM_TOOL_H
#define TAVOCTL_SYSTEM_TOOL_H

#include <string>
#include <vector>

namespace tavoctl {

struct ToolResult {
    int status;  // as a shell gives it
    std::string output;
    std::string Reason() const;  // the last line of it
};

// Runs a tool by its path, with a fixed environment, nothing on its standard input, and its output kept.
ToolResult TryTool(const std::vector<std::string> &words);

// The same; throws a Failure, with what it said last, unless it succeeds.
std::string RunTool(const std::vector<std::string> &words, const std::string &attempted);

}  // namespace tavoctl

#endif
