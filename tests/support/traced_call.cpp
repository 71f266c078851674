// Runs a piece of work in a child process under ptrace.
#include "support/traced_call.h"

#include "support/test.h"

#include <elf.h>
#include <sys/ptrace.h>
#include <sys/syscall.h>
#include <sys/time.h>
#include <sys/uio.h>
#include <sys/user.h>

namespace test {
namespace {

struct NamedCall {
    long number;
    const char *name;
};

constexpr NamedCall kNames[] = {
#include "system_call_names.h"
};

pid_t watched = 0;
volatile bool timed_out = false;

void KillWatched(int)
{
    timed_out = true;
    ::kill(watched, SIGKILL);
}

// Kills a child that takes longer than this.
class TimeLimit {
  public:
    TimeLimit(pid_t child, int seconds)
    {
        watched = child;
        timed_out = false;
        struct sigaction action = {};
        action.sa_handler = KillWatched;
        action.sa_flags = SA_RESTART;
        ::sigaction(SIGALRM, &action, &before_);
        Set(seconds);
    }
    ~TimeLimit()
    {
        Set(0);
        ::sigaction(SIGALRM, &before_, nullptr);
    }
    TimeLimit(const TimeLimit &) = delete;
    TimeLimit &operator=(const TimeLimit &) = delete;

  private:
    static void Set(int seconds)
    {
        const itimerval timer = {{0, 0}, {seconds, 0}};
        ::setitimer(ITIMER_REAL, &timer, nullptr);
    }

    struct sigaction before_;
};

// How this processor's registers describe a system call and its result. Number -1 means none: the kernel makes no call,
// and the result is whatever the registers hold then.
bool SkipCall(pid_t child)
{
#ifdef __arm__
    constexpr auto kSetSyscall = static_cast<__ptrace_request>(23);  // PTRACE_SET_SYSCALL
    return ::ptrace(kSetSyscall, child, nullptr, reinterpret_cast<void *>(-1)) == 0;
#else
    user_regs_struct registers;
    if (::ptrace(PTRACE_GETREGS, child, nullptr, &registers) != 0)
        return false;
    registers.orig_rax = static_cast<unsigned long long>(-1);
    return ::ptrace(PTRACE_SETREGS, child, nullptr, &registers) == 0;
#endif
}

bool SetResult(pid_t child, long result)
{
#ifdef __arm__
    user_regs registers;
#else
    user_regs_struct registers;
#endif
    if (::ptrace(PTRACE_GETREGS, child, nullptr, &registers) != 0)
        return false;
#ifdef __arm__
    registers.uregs[0] = static_cast<unsigned long>(result);
#else
    registers.rax = static_cast<unsigned long long>(result);
#endif
    return ::ptrace(PTRACE_SETREGS, child, nullptr, &registers) == 0;
}

struct Verdict {
    enum { go_on, fail, die } what = go_on;
    int error = 0;
};

// A child that stops before it begins its work.
pid_t StartStopped(const std::function<void()> &work)
{
    const pid_t child = ::fork();
    if (child != 0)
        return child;
    if (::ptrace(PTRACE_TRACEME, 0, nullptr, nullptr) != 0)
        ::_exit(120);
    ::kill(::getpid(), SIGSTOP);
    work();
    // Not _exit: a sanitizer checks for leaks there, which it cannot do in a traced process.
    ::syscall(SYS_exit_group, 0);
    __builtin_unreachable();
}

std::vector<uintptr_t> StackOf(pid_t child, uintptr_t top)
{
    std::vector<uintptr_t> words(4096);
    iovec here = {words.data(), words.size() * sizeof(uintptr_t)};
    iovec there = {reinterpret_cast<void *>(top), here.iov_len};
    const ssize_t got = ::process_vm_readv(child, &here, 1, &there, 1, 0);
    words.resize(got > 0 ? static_cast<size_t>(got) / sizeof(uintptr_t) : 0);
    return words;
}

// Runs the work and lets `decide` choose at each system call. After the first one that was failed or killed, the rest
// runs untraced.
Ending RunTraced(const std::function<void()> &work, int seconds,
                 const std::function<Verdict(const SystemCall &)> &judge)
{
    Ending ending;
    const pid_t child = StartStopped(work);
    const TimeLimit limit(child, seconds);
    ::waitpid(child, &ending.status, 0);
    ::ptrace(PTRACE_SETOPTIONS, child, nullptr, reinterpret_cast<void *>(PTRACE_O_TRACESYSGOOD | PTRACE_O_EXITKILL));
    int index = 0;
    int failing = 0;  // the error that the call under way ends with
    int signal = 0;
    while (WIFSTOPPED(ending.status)) {
        ::ptrace(ending.reached && !failing ? PTRACE_CONT : PTRACE_SYSCALL, child, nullptr,
                 reinterpret_cast<void *>(static_cast<intptr_t>(signal)));
        if (::waitpid(child, &ending.status, 0) != child)
            break;
        signal = 0;
        if (!WIFSTOPPED(ending.status))
            break;
        if (WSTOPSIG(ending.status) != (SIGTRAP | 0x80)) {
            signal = WSTOPSIG(ending.status);
            continue;
        }
        if (failing) {
            SetResult(child, -failing);
            failing = 0;
            continue;
        }
        __ptrace_syscall_info info;
        if (::ptrace(PTRACE_GET_SYSCALL_INFO, child, reinterpret_cast<void *>(sizeof info), &info) <= 0 ||
            info.op != PTRACE_SYSCALL_INFO_ENTRY)
            continue;
        SystemCall call;
        call.index = ++index;
        call.number = static_cast<long>(info.entry.nr);
        call.site = (info.instruction_pointer * 31 + info.stack_pointer) * 1024 + info.entry.nr;
        const Verdict verdict = judge(call);
        if (verdict.what == Verdict::die) {
            ending.reached = true;
            ::kill(child, SIGKILL);
        } else if (verdict.what == Verdict::fail) {
            ending.reached = true;
            ending.stack = StackOf(child, static_cast<uintptr_t>(info.stack_pointer));
            // A close that fails has closed the descriptor.
            if (call.number == SYS_close || SkipCall(child))
                failing = verdict.error;
        }
    }
    ending.hung = timed_out;
    return ending;
}

constexpr int kMark = SYS_getsid;  // nothing else asks for this

constexpr int kLongest = 60;  // seconds for what is not supposed to fail

}  // namespace

bool CanTrace()
{
    bool entered = false;
    const Ending ending = RunTraced([] { ::syscall(SYS_getppid); }, kLongest,
                                    [&](const SystemCall &call) {
                                        entered = entered || call.number == SYS_getppid;
                                        return Verdict{};
                                    });
    return entered && ending.IsClean();
}

std::string SystemCall::Name() const
{
    const auto row = std::find_if(std::begin(kNames), std::end(kNames),
                                  [&](const NamedCall &named) { return named.number == number; });
    return row == std::end(kNames) ? "system call " + std::to_string(number) : row->name;
}

std::ostream &operator<<(std::ostream &out, const Ending &ending)
{
    if (ending.hung)
        return out << "did not end in time";
    if (WIFSIGNALED(ending.status))
        return out << "died of signal " << WTERMSIG(ending.status);
    return out << "ended with " << WEXITSTATUS(ending.status);
}

bool CanFail(const SystemCall &call)
{
    switch (call.number) {
    case SYS_brk:  // returns the end of the heap, whatever was asked for
    case SYS_exit_group:
    case SYS_rt_sigreturn:
    case SYS_getpid:
    case SYS_gettid:
    case SYS_getppid:
    case SYS_getuid:
    case SYS_geteuid:
    case SYS_getgid:
    case SYS_getegid:
#ifdef SYS_getuid32
    case SYS_getuid32:
    case SYS_geteuid32:
    case SYS_getgid32:
    case SYS_getegid32:
#endif
    case SYS_umask:
    case SYS_sync:
#ifdef __SANITIZE_ADDRESS__
        // The sanitizer ends the program when it gets no memory, or when it cannot run its own helpers.
#ifdef SYS_mmap2
    case SYS_mmap2:
#else
    case SYS_mmap:
#endif
    case SYS_munmap:
    case SYS_mprotect:
    case SYS_madvise:
#endif
    case SYS_rt_sigaction:  // with valid arguments, which the C library passes
    case SYS_rt_sigprocmask:
        return false;
    default:
        return true;
    }
}

void MarkCalls()
{
    ::syscall(kMark, 0);
}

std::vector<SystemCall> SystemCallsOf(const std::function<void()> &work)
{
    std::vector<SystemCall> calls;
    RunTraced(work, kLongest, [&](const SystemCall &call) {
        calls.push_back(call);
        return Verdict{};
    });
    if (!calls.empty() && calls.back().number == SYS_exit_group)
        calls.pop_back();
    const auto is_mark = [](const SystemCall &call) {
        return call.number == kMark;
    };
    const auto begin = std::find_if(calls.begin(), calls.end(), is_mark);
    if (begin != calls.end()) {
        calls.erase(std::find_if(begin + 1, calls.end(), is_mark), calls.end());
        calls.erase(calls.begin(), begin + 1);
    }
    return calls;
}

std::vector<SystemCall> DistinctCalls(const std::vector<SystemCall> &calls)
{
    std::vector<SystemCall> distinct;
    std::set<uint64_t> seen;
    for (const SystemCall &call : calls) {
        if (CanFail(call) && seen.insert(call.site).second)
            distinct.push_back(call);
    }
    return distinct;
}

Ending FailsAtCall(const SystemCall &which, int error, const std::function<void()> &work, int seconds)
{
    return RunTraced(work, seconds, [&](const SystemCall &call) {
        const bool due = call.index >= which.index && call.number == which.number;
        return due ? Verdict{Verdict::fail, error} : Verdict{};
    });
}

bool DiesAtCall(int n, const std::function<void()> &work)
{
    return RunTraced(work, kLongest,
                     [&](const SystemCall &call) { return call.index == n ? Verdict{Verdict::die} : Verdict{}; })
        .reached;
}

}  // namespace test
