// tavoctl lock: the locks by which the appliance's programs take turns at its files.
#include "families.h"
#include "frame/error_codes.h"
#include "frame/failure.h"
#include "frame/held_locks.h"
#include "frame/program.h"
#include "frame/program_run.h"
#include "frame/table.h"

#include "tavo_lock.h"

#include <charconv>
#include <sstream>

namespace tavoctl {
namespace {

std::vector<std::string> LockNames()
{
    std::vector<std::string> names;
    for (const TLIBLOCKFILE *lock = rgslckList; lock->fLockBit; ++lock)
        names.push_back(LockName(lock->szPath));
    return names;
}

unsigned KnownMask()
{
    unsigned mask = 0;
    for (const TLIBLOCKFILE *lock = rgslckList; lock->fLockBit; ++lock)
        mask |= lock->fLockBit;
    return mask;
}

// One lock by its name, or any number of them by their bits.
unsigned MaskOf(const std::string &word)
{
    for (const TLIBLOCKFILE *lock = rgslckList; lock->fLockBit; ++lock)
        if (word == LockName(lock->szPath) || word == "lock_" + LockName(lock->szPath))
            return lock->fLockBit;
    const char *begin = word.c_str();
    const bool hexadecimal = word.starts_with("0x") || word.starts_with("0X");
    const char *end = begin + word.size();
    unsigned mask = 0;
    const auto [stop, error] = std::from_chars(begin + (hexadecimal ? 2 : 0), end, mask, hexadecimal ? 16 : 10);
    if (error != std::errc{} || stop != end)
        throw UsageFailure("take the lock " + word, "there is no such lock", "tavoctl lock list shows them");
    if (!mask || (mask & ~KnownMask()))
        throw UsageFailure("take the locks " + word, "the mask has other bits than locks",
                           "tavoctl lock list shows them; how to take them is said by --shared");
    return mask;
}

class LockList : public Verb {
  public:
    static constexpr VerbInfo info = {"list", reads, "Lists the locks in the order in which they are taken.",
                                      "tavoctl lock list"};

    int Run(const Call &call) override
    {
        Table table({"lock", "mask", "file"});
        for (const TLIBLOCKFILE *lock = rgslckList; lock->fLockBit; ++lock)
            table.Add({LockName(lock->szPath), Hexadecimal(static_cast<int>(lock->fLockBit)), lock->szPath});
        call.Print(table);
        return exit_done;
    }
};

class LockRun : public Verb {
  public:
    static constexpr VerbInfo info = {"run", changes,
                                      "Takes locks, all or none, runs PROGRAM and releases them when it has ended. The "
                                      "exit status is the program's. Inside, `tavoctl conf set` would wait for a lock "
                                      "that is held here.",
                                      "tavoctl lock run tavoinfo -- vi /etc/tavoinfo.conf\n"
                                      "tavoctl lock run --shared pw,gr -- tar cf accounts.tar /etc/passwd /etc/group\n"
                                      "tavoctl lock run --timeout 0 0x840 -- true"};

    void Declare(Arguments &arguments) override
    {
        arguments.Text("LOCKS", locks_, "names, joined by commas, or the sum of their bits, such as 0x30", LockNames);
        arguments.Flag("--shared", shared_, "with others who share");
        arguments.Number("--timeout", "SECONDS", wait_, "how long to wait for them; 0: not at all (5)");
        arguments.Program(program_);
    }

    int Run(const Call &) override
    {
        unsigned mask = 0;
        std::istringstream words(locks_);
        for (std::string word; std::getline(words, word, ',');)
            mask |= MaskOf(word);
        if (!mask)
            throw UsageFailure("take a lock", "none was named", "tavoctl lock list shows them");
        const HeldLocks locks(mask, shared_, wait_);
        return RunInForeground(program_);
    }

  private:
    std::string locks_;
    bool shared_ = false;
    int wait_ = usual_wait;
    std::vector<std::string> program_;
};

}  // namespace

void AddLock(Program &program)
{
    Family &lock = program.Add("lock", "The locks by which programs take turns");
    lock.Add<LockList>();
    lock.Add<LockRun>();
}

}  // namespace tavoctl
