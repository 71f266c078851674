// tavoctl lock: the locks by which the appliance's programs take turns at its files.
#include "tavo_lock.h"

#include "families.h"
#include "frame/error_codes.h"
#include "frame/held_locks.h"
#include "frame/program_run.h"
#include "frame/text.h"

namespace tavoctl {
namespace {

constexpr Column<TLIBLOCKFILE> lock_columns[] = {
    {"lock", [](const TLIBLOCKFILE &lock) { return LockName(lock.szPath); }},
    {"mask", [](const TLIBLOCKFILE &lock) { return Hexadecimal(static_cast<int>(lock.fLockBit)); }, "hexadecimal"},
    {"file", [](const TLIBLOCKFILE &lock) { return std::string(lock.szPath); }},
};

std::vector<TLIBLOCKFILE> Locks()
{
    std::vector<TLIBLOCKFILE> locks;
    for (const TLIBLOCKFILE *lock = rgslckList; lock->fLockBit; ++lock)
        locks.push_back(*lock);
    return locks;
}

std::vector<std::string> LockNames()
{
    return Mapped(Locks(), [](const TLIBLOCKFILE &lock) { return LockName(lock.szPath); });
}

constexpr ArgumentKind lock_kind = {.name = "lock", .candidates = LockNames, .sample = "tavoinfo"};

// One lock by its name, or any number of them by their bits.
unsigned MaskOf(const std::string &word)
{
    unsigned known = 0;
    for (const TLIBLOCKFILE &lock : Locks()) {
        if (word == LockName(lock.szPath) || word == "lock_" + LockName(lock.szPath))
            return lock.fLockBit;
        known |= lock.fLockBit;
    }
    const auto mask = AnyNumberIn<unsigned>(word);
    if (!mask)
        throw UsageFailure("take the lock " + word, "there is no such lock",
                           DidYouMean(word, LockNames(), "tavoctl lock list shows them"));
    RefuseIf(!*mask || (*mask & ~known), "take the locks " + word, "the mask has other bits than locks",
             "tavoctl lock list shows them; --shared says how to take them");
    return *mask;
}

Action LockRun(Arguments &in)
{
    const auto locks = in.Text("LOCKS", lock_kind, "names, joined by commas, or the sum of their bits, such as 0x30");
    const auto shared = in.Flag("--shared", "with others who share");
    const auto timeout = in.Number("--timeout", "SECONDS", "how long to wait for them; 0: not at all (5)");
    const auto program = in.Program();
    return [=](Call &call) {
        unsigned mask = 0;
        for (const std::string &word : Split(*locks, ','))
            mask |= MaskOf(word);
        RefuseIf(!mask, "take a lock", "none was named", "tavoctl lock list shows them");
        const HeldLocks held(mask, *shared, timeout->value_or(usual_wait));
        call.status = RunInForeground(*program);
    };
}

}  // namespace

void AddLock(Program &program)
{
    Family &lock = program.Add("lock", "The locks by which programs take turns");
    lock.Add(
        "list", reads, Answer::List(lock_columns),
        [](Arguments &) -> Action { return [](Call &call) { call.List(lock_columns, Locks()); }; },
        R"(Lists the locks in the order in which they are taken.

tavoctl lock list)");
    lock.Add("run", changes | by_anybody | runs_program, Answer::Nothing(), LockRun,
             R"(Takes locks, all or none, runs PROGRAM
and releases them when it has ended. The exit status is the program's. Inside, `tavoctl conf set` would wait for a lock
that is held here.

tavoctl lock run tavoinfo -- vi /etc/tavoinfo.conf
tavoctl lock run --shared pw,gr -- tar cf accounts.tar /etc/passwd /etc/group
tavoctl lock run --timeout 0 0x840 -- true)");
}

}  // namespace tavoctl
