// Runs tavoctl, as it is installed in the appliance root, and keeps what it said.
#ifndef TESTS_TOOLS_TAVOCTL_RUN_TAVOCTL_H
#define TESTS_TOOLS_TAVOCTL_RUN_TAVOCTL_H

#include "support/running_program.h"
#include "support/test.h"

#include <nlohmann/json.hpp>

#include <sys/ioctl.h>

namespace test {

inline constexpr char tavoctl[] = "/usr/bin/tavoctl";

struct RunningTavoctl : RunningProgram {
    explicit RunningTavoctl(const Words &words, const std::string &input = {}) : RunningProgram(tavoctl, words, input)
    {
    }
};

inline Ran Tavoctl(const Words &words, const std::string &input = {})
{
    return RunningTavoctl(words, input).Wait();
}

// Runs what starts programs as the user "nobody", in a process of this test's own ids.
template <class Start>
Ran AsNobody(const Start &start)
{
    constexpr uid_t nobody = 65534;
    EXPECT_EQ(::setegid(nobody) + ::seteuid(nobody), 0);
    const Ran ran = start();
    EXPECT_EQ(::seteuid(0) + ::setegid(0), 0);
    return ran;
}

// A verb that has nothing to say when it is done.
inline void Succeeds(const Words &words, const std::string &input = {})
{
    const Ran ran = Tavoctl(words, input);
    EXPECT_EQ(ran.status, 0) << testing::PrintToString(words) << ran;
    EXPECT_EQ(ran.out + ran.err, "") << testing::PrintToString(words);
}

// Busy unless another status is given.
inline void IsRefused(const Words &words, const std::string &reason, int status = 4, const std::string &input = {})
{
    const Ran ran = Tavoctl(words, input);
    EXPECT_EQ(ran.status, status) << testing::PrintToString(words) << ran;
    EXPECT_NE(ran.err.find(reason), std::string::npos) << testing::PrintToString(words) << ran;
    EXPECT_EQ(ran.out, "") << testing::PrintToString(words);
}

// Another file, even one with the same text, has another number.
inline ino_t InodeOf(const std::string &path)
{
    struct stat state = {};
    EXPECT_EQ(::stat(path.c_str(), &state), 0) << path;
    return state.st_ino;
}

struct Answer {
    std::string prompt;  // once this is shown
    std::string typed;   // the person types that
};

// At a terminal of so many rows, 0 for unknown; everything shown comes back as it was sent.
inline Ran TavoctlAtTerminal(const Words &words, const std::vector<Answer> &answers, unsigned short rows = 0)
{
    const int master = ::posix_openpt(O_RDWR | O_NOCTTY | O_CLOEXEC);
    EXPECT_GE(master, 0);
    EXPECT_EQ(::grantpt(master), 0);
    EXPECT_EQ(::unlockpt(master), 0);
    const std::string name = ::ptsname(master);
    const int terminal = ::open(name.c_str(), O_RDWR | O_NOCTTY | O_CLOEXEC);
    EXPECT_GE(terminal, 0) << name;
    const winsize size = {rows, 80, 0, 0};
    EXPECT_TRUE(rows == 0 || ::ioctl(master, TIOCSWINSZ, &size) == 0);
    const pid_t pid = ::fork();
    if (pid == 0) {
        for (int fd = 0; fd < 3; ++fd)
            ::dup2(terminal, fd);
        BecomeProgram(tavoctl, words);
    }
    ::close(terminal);
    Ran ran = {};
    std::size_t seen = 0;
    auto answer = answers.begin();
    char bytes[4096];
    do {
        if (answer != answers.end())
            if (const std::size_t at = ran.out.find(answer->prompt, seen); at != std::string::npos) {
                seen = at + answer->prompt.size();
                EXPECT_EQ(::write(master, answer->typed.data(), answer->typed.size()),
                          static_cast<ssize_t>(answer->typed.size()));
                ++answer;
            }
        const ssize_t count = ::read(master, bytes, sizeof bytes);
        if (count <= 0)
            break;
        ran.out.append(bytes, static_cast<std::size_t>(count));
    } while (true);
    ::close(master);
    int status = 0;
    ::waitpid(pid, &status, 0);
    ran.status = ShellStatus(status);
    return ran;
}

// The input is typed before the program asks.
inline Ran TavoctlAtTerminal(const Words &words, const std::string &typed = {})
{
    return TavoctlAtTerminal(words, {{"", typed}});
}

// A document without its format_version: the items of a list, or the fields of one object.
inline nlohmann::json Facts(const Ran &ran)
{
    nlohmann::json document = nlohmann::json::parse(ran.out, nullptr, false);
    EXPECT_TRUE(document.is_object() && document.erase("format_version") == 1) << ran;
    return document.is_object() && document.contains("items") ? nlohmann::json(document.at("items")) : document;
}

inline nlohmann::json Facts(const Words &words)
{
    return Facts(Tavoctl(words));
}

}  // namespace test

#endif
