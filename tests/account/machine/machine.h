// The machine itself: its disks and its programs. Elsewhere these tests are skipped.
#ifndef TESTS_ACCOUNT_MACHINE_MACHINE_H
#define TESTS_ACCOUNT_MACHINE_MACHINE_H

#include "tavo_user.h"

#include <gtest/gtest.h>

#include <cstdio>
#include <initializer_list>
#include <iterator>
#include <ostream>
#include <string>

#include <sys/wait.h>
#include <unistd.h>

namespace test {

inline bool IsMachine()
{
    return ::access("/dev/sda", F_OK) == 0;
}

struct Output {
    int status;
    std::string text;  // of both streams
};

inline std::ostream &operator<<(std::ostream &out, const Output &output)
{
    return out << "exit status " << output.status << "\n" << output.text;
}

inline Output Shell(const std::string &command)
{
    Output output = {};
    std::FILE *pipe = ::popen(("{ " + command + "\n} 2>&1").c_str(), "re");
    char bytes[4096];
    for (std::size_t count; (count = std::fread(bytes, 1, sizeof bytes, pipe)) > 0;)
        output.text.append(bytes, count);
    const int status = ::pclose(pipe);
    output.status = WIFEXITED(status) ? WEXITSTATUS(status) : 128 + WTERMSIG(status);
    return output;
}

// The tests of a program share a root: what one leaves the next one finds.
inline void DeleteUsers(std::initializer_list<const char *> names)
{
    TAVOUserDelete(std::data(names), static_cast<int>(names.size()));
}

}  // namespace test

#endif
