// tavoctl proc: programs and processes.
#include "families.h"
#include "frame/failure.h"
#include "frame/processes.h"
#include "frame/program.h"
#include "frame/program_run.h"
#include "frame/signal_name.h"
#include "frame/table.h"

#include "tavo_proc.h"

#include <array>
#include <csignal>
#include <limits>
#include <utility>

#include <unistd.h>

namespace tavoctl {
namespace {

class ProcFind : public Verb {
  public:
    static constexpr VerbInfo info = {"find", reads,
                                      "Lists the processes whose line in the process table matches PATTERN.",
                                      "tavoctl proc find smbd\n"
                                      "tavoctl proc find --json rc.d"};

    void Declare(Arguments &arguments) override
    {
        arguments.Text("PATTERN", pattern_, "a regular expression, as grep takes it");
    }

    int Run(const Call &call) override
    {
        Table table({"pid", "command"});
        for (const pid_t pid : MatchingProcesses(pattern_)) {
            // This process has the pattern among its arguments and always matches.
            if (pid == ::getpid())
                continue;
            if (const std::string command = CommandLine(pid); !command.empty())
                table.Add({int{pid}, command});
        }
        if (table.Empty())
            throw Failure{.attempted = "find " + pattern_, .reason = "no process matches", .status = exit_not_found};
        call.Print(table);
        return exit_done;
    }

  private:
    std::string pattern_;
};

class ProcSignal : public Verb {
  public:
    static constexpr VerbInfo info = {"signal", changes,
                                      "Sends a signal to the process that a pid file names. Signal 0 sends nothing and "
                                      "tells by the exit status whether the process is there.",
                                      "tavoctl proc signal /var/run/smbd.pid\n"
                                      "tavoctl proc signal /var/run/smbd.pid HUP\n"
                                      "tavoctl proc signal /var/run/smbd.pid 0"};

    void Declare(Arguments &arguments) override
    {
        arguments.Text("PIDFILE", path_, "a file whose first line is a process id");
        arguments.OptionalText("SIGNAL", signal_, "a name such as HUP, or a number (TERM)", SignalNames);
    }

    int Run(const Call &) override
    {
        const auto number = SignalNumber(signal_);
        if (!number)
            throw UsageFailure("send " + signal_, "there is no such signal");
        if (TLIBProcSignalByPidFile(path_.c_str(), *number) == 0)
            return exit_done;
        Failure failure = LibraryFailure("send " + signal_ + " to the process of " + path_);
        const pid_t pid = TLIBReadPidFile(path_.c_str());
        if (failure.code == ERR_OPEN_FAILED || (failure.code == ERR_SYS_UNKNOWN && !BlTLIBProcAlive(pid))) {
            failure.status = exit_not_found;
            failure.reason = pid > 0 ? "process " + std::to_string(pid) + " is gone" : "no process is named there";
            failure.hint = "is the daemon running?";
        }
        throw failure;
    }

  private:
    std::string path_;
    std::string signal_ = "TERM";
};

constexpr std::size_t most_arguments = 30;

template <std::size_t... Index>
int TimedRun(int seconds, const std::string &program, const std::array<const char *, most_arguments> &arguments,
             std::index_sequence<Index...>)
{
    return TLIBTimedExec(seconds, program.c_str(), arguments[Index]..., static_cast<const char *>(nullptr));
}

class ProcRun : public Verb {
  public:
    static constexpr VerbInfo info = {
        "run", changes,
        "Runs PROGRAM as the appliance's daemons run their tools: in a session of its own, "
        "in the directory \"/\", with no environment but PATH, and with /dev/null as "
        "standard input, output and error. The exit status is the program's.",
        "tavoctl proc run --timeout 60 /usr/tavo/etc/rc.d/S80samba.sh restart"};

    void Declare(Arguments &arguments) override
    {
        arguments.Number("--timeout", "SECONDS", seconds_, "kill it after that time (no limit)", 1);
        arguments.Program(words_);
    }

    int Run(const Call &) override
    {
        if (words_.size() - 1 > most_arguments)
            throw UsageFailure("run " + words_[0], "it has more than 30 arguments");
        const std::string program = FindProgram(words_[0]);
        std::array<const char *, most_arguments> arguments = {};
        for (std::size_t i = 1; i < words_.size(); ++i)
            arguments[i - 1] = words_[i].c_str();
        const int status = TimedRun(seconds_, program, arguments, std::make_index_sequence<most_arguments>());
        if (status < 0)
            throw LibraryFailure("run " + words_[0]);
        return status;
    }

  private:
    int seconds_ = std::numeric_limits<int>::max();
    std::vector<std::string> words_;
};

}  // namespace

void AddProc(Program &program)
{
    Family &proc = program.Add("proc", "Programs and processes");
    proc.Add<ProcFind>();
    proc.Add<ProcSignal>();
    proc.Add<ProcRun>();
}

}  // namespace tavoctl
