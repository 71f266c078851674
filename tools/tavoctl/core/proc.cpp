// tavoctl proc: programs and processes.
#include "tavo_proc.h"

#include "families.h"
#include "frame/processes.h"
#include "frame/program_run.h"
#include "frame/text.h"

#include <array>
#include <cerrno>
#include <csignal>
#include <cstring>

#include <unistd.h>

namespace tavoctl {
namespace {

struct Process {
    pid_t pid;
    std::string command;
};

constexpr Column<Process> process_columns[] = {
    {"pid", field<&Process::pid>},
    {"command", field<&Process::command>, "its command line, or [NAME]"},
};

// As the C library has them, without "SIG".
std::vector<std::string> SignalNames()
{
    std::vector<std::string> names;
    for (int number = 1; number < SIGRTMIN; ++number)
        if (const char *name = ::sigabbrev_np(number))
            names.emplace_back(name);
    return names;
}

// The number of "HUP", "SIGHUP" or "1"; nothing for other text. Signal 0 only tests that the process is there.
std::optional<int> SignalNumber(const std::string &text)
{
    const std::string name = text.starts_with("SIG") ? text.substr(3) : text;
    for (int number = 1; number < SIGRTMIN; ++number)
        if (const char *known = ::sigabbrev_np(number); known && name == known)
            return number;
    const auto number = NumberIn<int>(text);
    return number && *number >= 0 && *number <= SIGRTMAX ? number : std::nullopt;
}

constexpr ArgumentKind signal_kind = {.name = "signal",
                                      .allowed = "a name such as HUP, or a number",
                                      .valid = [](const std::string &text) { return SignalNumber(text).has_value(); },
                                      .candidates = SignalNames,
                                      .sample = "0",
                                      .wrong = "NONSENSE"};

Action ProcFind(Arguments &in)
{
    const auto pattern = in.Text("PATTERN", any_text, "a regular expression, as grep takes it");
    return [=](Call &call) {
        std::vector<Process> found;
        for (const pid_t pid : MatchingProcesses(*pattern)) {
            // This process has the pattern among its arguments and always matches.
            if (pid == ::getpid())
                continue;
            if (std::string command = CommandLine(pid); !command.empty())
                found.push_back({pid, std::move(command)});
        }
        FailIf(found.empty(), "find " + *pattern, "no process matches", {}, exit_not_found);
        call.List(process_columns, found);
    };
}

Action ProcSignal(Arguments &in)
{
    const auto path = in.Text("PIDFILE", file_path, "a file whose first line is a process id");
    const auto name = in.OptionalText("SIGNAL", signal_kind, "a name such as HUP, or a number (TERM)");
    return [=](Call &call) {
        const std::string signal = name->value_or("TERM");
        const std::string attempted = "send " + signal + " to the process of " + *path;
        call.Change("the process of " + *path, "signal", {}, signal);
        if (!call.Proceed() || TLIBProcSignalByPidFile(path->c_str(), *SignalNumber(signal)) == 0)
            return;
        Failure failure = LibraryFailure(attempted);
        const pid_t pid = TLIBReadPidFile(path->c_str());
        if (pid > 0 && ::kill(pid, 0) != 0 && errno == EPERM)
            throw SystemFailure(attempted, EPERM);
        if (failure.code == ERR_OPEN_FAILED || (failure.code == ERR_SYS_UNKNOWN && !BlTLIBProcAlive(pid))) {
            failure.status = exit_not_found;
            failure.reason = pid > 0 ? "process " + std::to_string(pid) + " is gone" : "no process is named there";
            failure.hint = "is the daemon running?";
        }
        throw failure;
    };
}

constexpr std::size_t most_arguments = 30;

template <std::size_t... Index>
int TimedRun(int64_t seconds, const std::string &program, const std::array<const char *, most_arguments> &arguments,
             std::index_sequence<Index...>)
{
    return TLIBTimedExec(static_cast<int>(seconds), program.c_str(), arguments[Index]...,
                         static_cast<const char *>(nullptr));
}

Action ProcRun(Arguments &in)
{
    const auto timeout = in.Number("--timeout", "SECONDS", "kill it after that time (no limit)", 1);
    const auto words = in.Program();
    return [=](Call &call) {
        RefuseIf(words->size() - 1 > most_arguments, "run " + words->front(), "it has more than 30 arguments");
        const std::string program = FindProgram(words->front());
        std::array<const char *, most_arguments> arguments = {};
        for (std::size_t i = 1; i < words->size(); ++i)
            arguments[i - 1] = (*words)[i].c_str();
        call.status =
            TimedRun(timeout->value_or(most_seconds), program, arguments, std::make_index_sequence<most_arguments>());
        Must(call.status >= 0, "run " + words->front());
    };
}

}  // namespace

void AddProc(Program &program)
{
    Family &proc = program.Add("proc", "Programs and processes");
    proc.Add("find", reads, Answer::List(process_columns), ProcFind,
             R"(Lists the processes whose line in the process table
matches PATTERN.

tavoctl proc find smbd
tavoctl proc find --json rc.d)");
    proc.Add("signal", changes | by_anybody, ProcSignal, R"(Sends a signal to the process that a pid file names.
Signal 0 sends nothing and shows by the exit status whether the process is there.

tavoctl proc signal /var/run/smbd.pid
tavoctl proc signal /var/run/smbd.pid HUP
tavoctl proc signal /var/run/smbd.pid 0)");
    proc.Add("run", changes | by_anybody | runs_program, Answer::Nothing(), ProcRun,
             R"(Runs PROGRAM as the appliance's daemons
run their tools: in a session of its own, in the directory "/", with no environment but PATH, and with /dev/null as
standard input, output and error. The exit status is the program's.

tavoctl proc run --timeout 60 /usr/tavo/etc/rc.d/S80samba.sh restart)");
}

}  // namespace tavoctl
