// Takes the place of every tool that a test scripts (mdadm, pvs, ifconfig, ...): writes down its argument vector,
// prints what the scenario prescribes and ends with the prescribed status. Called as "scenario" it is the shell's
// interface to create a scenario and to ask for its result.
#include "quoted_line.h"
#include "scenario_dir.h"

#include <csignal>
#include <cstdio>
#include <cstring>
#include <iostream>

#include <fcntl.h>
#include <sys/file.h>
#include <sys/wait.h>
#include <unistd.h>

namespace {

const scenario::Call *Choose(const std::vector<scenario::Call> &calls, const std::string &line)
{
    const bool any_order = scenario::Read(std::filesystem::path(scenario::folder) / "order").starts_with("any");
    for (const scenario::Call &call : calls) {
        if (call.times < 0 || call.seen >= call.times)
            continue;
        if (call.Matches(line))
            return &call;
        if (!any_order)
            break;
    }
    for (const scenario::Call &call : calls) {
        if (call.times < 0 && call.Matches(line))
            return &call;
    }
    return nullptr;
}

void Print(const std::filesystem::path &path, std::FILE *to)
{
    const std::string text = scenario::Read(path);
    std::fwrite(text.data(), 1, text.size(), to);
    std::fflush(to);
}

int RunProgram(const std::filesystem::path &program, char **argv)
{
    const pid_t child = ::fork();
    if (child == 0) {
        ::execv(program.c_str(), argv);
        std::perror("scripted tool: run");
        ::_exit(127);
    }
    int status = 0;
    ::waitpid(child, &status, 0);
    return WIFEXITED(status) ? WEXITSTATUS(status) : 128 + WTERMSIG(status);
}

int Play(const std::filesystem::path &call, char **argv)
{
    int result = 0;
    if (std::filesystem::exists(call / "run"))
        result = RunProgram(call / "run", argv);
    Print(call / "stdout", stdout);
    Print(call / "stderr", stderr);
    const std::string status = scenario::Read(call / "status");
    if (status.starts_with("signal ")) {
        const int number = std::atoi(status.c_str() + std::strlen("signal "));
        ::signal(number, SIG_DFL);
        ::raise(number);
    }
    return status.empty() ? result : std::atoi(status.c_str());
}

int Called(char **argv, const std::string &line)
{
    // Opened first and locked: calls that run at the same time are counted and logged one after the other.
    const int log = ::open(scenario::log_file, O_WRONLY | O_CREAT | O_APPEND | O_CLOEXEC, 0666);
    if (log < 0 || ::flock(log, LOCK_EX) != 0) {
        std::perror(scenario::log_file);
        return scenario::unscripted_status;
    }
    const bool scripted = scenario::Exists();
    const std::vector<scenario::Call> calls = scenario::Calls();
    const scenario::Call *call = Choose(calls, line);
    const std::string mark = call ? call->path.filename().string() : scripted ? "-" : "~";
    const std::string entry = mark + " " + line + "\n";
    if (::write(log, entry.data(), entry.size()) != static_cast<ssize_t>(entry.size()))
        std::perror(scenario::log_file);
    if (call)
        scenario::Write(call->path / "seen", std::to_string(call->seen + 1));
    ::close(log);

    if (call)
        return Play(call->path, argv);
    if (scripted) {
        std::cerr << "scripted tool: not expected: " << line << '\n';
        return scenario::unscripted_status;
    }
    ::execv("/bin/busybox", argv);
    std::perror("scripted tool: busybox");
    return scenario::unscripted_status;
}

int Expect(const std::vector<std::string> &words)
{
    std::vector<std::pair<std::string, std::string>> files;
    size_t i = 0;
    for (; i + 1 < words.size() && words[i].starts_with("--") && words[i] != "--"; i += 2)
        files.emplace_back(words[i].substr(2), words[i + 1]);
    i += i < words.size() && words[i] == "--";
    if (i == words.size())
        return 2;
    const std::filesystem::path call =
        scenario::AddCall(scenario::QuotedLine({words.begin() + static_cast<long>(i), words.end()}));
    for (const auto &[name, value] : files) {
        if (name == "stdout" || name == "stderr" || name == "run")
            std::filesystem::copy_file(value, call / name);
        else if (name == "status" || name == "times")
            scenario::Write(call / name, value);
        else
            return 2;
    }
    return 0;
}

int Command(const std::vector<std::string> &words)
{
    const std::string verb = words.empty() ? "" : words[0];
    int status = 2;
    if (verb == "expect")
        status = Expect({words.begin() + 1, words.end()});
    else if (verb == "check") {
        const std::string complaints = scenario::Complaints();
        std::cout << complaints;
        status = complaints.empty() ? 0 : 1;
    } else if (verb == "reset" || verb == "begin") {
        scenario::Reset();
        if (verb == "begin")
            std::filesystem::create_directories(std::filesystem::path(scenario::folder) / "calls");
        status = 0;
    }
    if (status == 2)
        std::cerr << "usage: scenario begin | reset | check\n"
                     "       scenario expect [--stdout FILE] [--stderr FILE] [--status N|'signal N'] [--times N|any]\n"
                     "                       [--run PROGRAM] -- TOOL ARGUMENT...   (TOOL ... alone: any arguments)\n";
    return status;
}

}  // namespace

int main(int argc, char **argv)
{
    const std::vector<std::string> words(argv, argv + argc);
    if (std::filesystem::path(words[0]).filename() == "scenario")
        return Command({words.begin() + 1, words.end()});
    return Called(argv, scenario::QuotedLine(words));
}
