// One call of every exported function, with real arguments: what the tests of faults go through.
//
// A row is the name, what is known of the function, and its arguments: arguments.h has those that hold something. If they
// do not suffice, a body prepares them, makes the call through `run` and shows the outputs:
//
//     CALL(TLIBFileGetKeyValue, 0, kSettings, "runweb", Text<16>(), 16, 0),
//     BODY(TAVOErrorGetFile, kAnswers, {
//         TLIBErrSetEx(ERR_READ_FAILED, "module", 7);
//         run(f);
//     }),
#ifndef TESTS_FAULT_EVERY_CALL_CALL_H
#define TESTS_FAULT_EVERY_CALL_CALL_H

#include "tavosdk.h"

#include "support/test.h"

#include <type_traits>

namespace every_call {

enum : unsigned {
    kZeroFails = 1,     // 0 is the failure: pointers apart, functions that answer yes or no
    kNoCode = 2,        // the function has no codes, so a failure may leave none
    kAnswers = 4,       // a failed step is an answer of its own: skipped in a list, "not running", nothing to clear up
    kInChild = 8,       // changes its process, or ends it
    kMayAbort = 16,     // without a pipe it aborts, as documented
    kNoFaults = 32,     // waits or starts programs by design; faults inside have tests of their own
    kCreates = 64,      // makes the file first and then writes to it
    kHolds = 128,       // the process keeps what it opens and allocates
    kLeavesCode = 256,  // succeeds without a failed step, and leaves its code
    kSteps = 512        // rewrites several files, or one file several times; each rewrite is whole
};

// The outcome of a call, in memory that it shares with the test.
struct Report {
    bool done;    // the body has finished
    bool failed;  // by its result
    int code;
    int descriptors;  // open afterwards
    int live;         // blocks left allocated
    bool fired;       // an allocation was refused
    bool database;    // while Berkeley DB worked, which does not survive all of them
    char text[2048];  // result and outputs
};

class Trial {
  public:
    enum class Watch { nothing, system_calls, allocations };

    Trial(Report &report, Watch watch, int failing_allocation);
    ~Trial();
    Trial(const Trial &) = delete;
    Trial &operator=(const Trial &) = delete;

    // Makes the call, then shows its result and what it has left in its arguments.
    template <class Function, class... Args>
    auto operator()(Function &function, Args &&...args)
    {
        Begin();
        if constexpr (std::is_void_v<decltype(function(args...))>) {
            function(args...);
            End();
            (ShowArgument(args), ...);
        } else {
            auto result = function(args...);
            End();
            Note(result);
            (ShowArgument(args), ...);
            return result;
        }
    }

    void ZeroFails() { zero_fails_ = true; }

    // Adds an output to what is compared.
    void Show(std::string_view text);
    void Show(long long number);
    void Show(const TLIBSZLIST *list);
    void Show(const TLIBSZHASH *hash);
    void Show(const TAVOUSER *user);
    void Show(const TAVOGROUP *group);

  private:
    void Begin();
    void End();

    template <class Argument>
    void ShowArgument(const Argument &argument)
    {
        if constexpr (requires { argument.ShowIn(*this); })
            argument.ShowIn(*this);
        else if constexpr (requires { Show(argument.block); })
            Show(argument.block);  // a container
    }

    template <class Result>
    void Note(Result result)
    {
        if constexpr (std::is_pointer_v<Result>) {
            report_.failed = result == nullptr;
            if constexpr (std::is_same_v<std::remove_cv_t<std::remove_pointer_t<Result>>, char>)
                Show(result ? std::string_view(result) : "(null)");
            else
                Show(result ? "set" : "(null)");
        } else if constexpr (std::is_integral_v<Result>) {
            report_.failed = zero_fails_ ? result == 0 : static_cast<long long>(result) < 0;
            Show(static_cast<long long>(result));
        } else {
            Show(static_cast<long long>(result * 1000));
        }
    }

    Report &report_;
    Watch watch_;
    int failing_allocation_;
    bool zero_fails_ = false;
    size_t used_ = 0;
};

struct Call {
    const char *name;
    unsigned flags;
    void (*body)(Trial &run);
};

#define BODY(name, flags, ...)                                                                                         \
    {                                                                                                                  \
#name, flags, [](Trial & run) {                                                                                \
            auto &f = ::name;                                                                                          \
            __VA_ARGS__                                                                                                \
        }                                                                                                              \
    }
#define CALL(name, flags, ...) BODY(name, flags, { run(f __VA_OPT__(, ) __VA_ARGS__); })

// A family's calls, and their surroundings: files, devices, daemons. These are kept until the family is done.
struct Family {
    const char *name;
    std::vector<Call> calls;
    std::function<std::shared_ptr<void>()> prepare;
    std::vector<std::string> folders;  // what the calls may change; put back after each
};

inline void PrintTo(const Family &family, std::ostream *out)
{
    *out << family.name;
}

Family CoreFamily();
Family StorageFamily();
Family AccountFamily();
Family NetworkFamily();
Family ServiceFamily();

// True when the tracer failed a system call that a stand-in made for show.
bool WasFailed(long result);

}  // namespace every_call

#endif
