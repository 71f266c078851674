// tavoctl raid: rebuilds and scrubs, started, slowed and waited for.
#include "frame/files.h"
#include "frame/terminal.h"
#include "storage/arrays.h"
#include "storage/device.h"
#include "storage/raid_verbs.h"

#include <chrono>
#include <thread>

namespace tavoctl {
namespace {

using Clock = std::chrono::steady_clock;

// A member that cannot be written everywhere stays active: the kernel lists its bad sectors, and has no copy for them.
void RefuseBadBlocks(const RAIDINFO &array, const std::string &attempted)
{
    for (const std::string &member : Members(array, RAID_MEMBER_ACTIVE))
        FailIf(!KernelText(ArrayFile(array.szPath, "dev-" + DeviceName(member) + "/bad_blocks")).value_or("").empty(),
               attempted, member + " has sectors that could not be written, and the array no copy for them",
               "pull it; then tavoctl raid replace gives the array another disk");
}

void WaitFrom(Clock::time_point start, const std::string &path, int64_t timeout)
{
    constexpr int most_quiet = 10;
    const std::string attempted = "wait for " + path;
    Progress progress(DeviceName(path));
    int quiet = 0;  // rounds in which nothing went on
    for (;; std::this_thread::sleep_for(std::chrono::seconds(1))) {
        const Array array = ReadArray(path);
        const bool busy = array->fRebuilding != 0;
        quiet = busy ? 0 : quiet + 1;
        if (!busy && array->nStatus == RAID_STATUS_NORMAL)
            return RefuseBadBlocks(*array, attempted);
        // A spare that has just come is rebuilt onto after a moment.
        const bool begins = array->nStatus == RAID_STATUS_DEGRADED && !Members(*array, RAID_MEMBER_SPARE).empty();
        FailIf(!busy && !(begins && quiet < most_quiet), attempted, std::string("it is ") + StatusText(array->nStatus));
        BusyIf(timeout > 0 && Clock::now() - start >= std::chrono::seconds(timeout), attempted, "the time is up");
        const auto rebuild = RebuildOf(*array);
        progress.Show(ActionOf(*array) + " " + (rebuild ? rebuild->Text() : "begins"));
    }
}

// Until the kernel does something else than comparing.
void WaitForScrub(const std::string &path)
{
    Progress progress(DeviceName(path));
    for (;; std::this_thread::sleep_for(std::chrono::seconds(1))) {
        const Array array = ReadArray(path);
        if (ActionOf(*array) != "check")
            return;
        const auto state = RebuildOf(*array);
        progress.Show("check " + (state ? state->Text() : "begins"));
    }
}

int64_t MismatchesOf(const std::string &path)
{
    return std::atoll(KernelText(ArrayFile(path, "mismatch_cnt")).value_or("0").c_str());
}

}  // namespace

void WaitForArray(const std::string &path, int64_t timeout)
{
    WaitFrom(Clock::now(), path, timeout);
}

Action RaidWait(Arguments &in)
{
    const auto words = in.Texts("ARRAY", array_kind, array_help);
    const auto timeout = in.Number("--timeout", "SECONDS", "give up after so long; 0: never (0)");
    return [=](Call &) {
        const Clock::time_point start = Clock::now();
        for (const std::string &word : *words)
            WaitFrom(start, ArrayPath(word), timeout->value_or(0));
    };
}

Action RaidScrub(Arguments &in)
{
    const auto word = in.Text("ARRAY", array_kind, array_help);
    const auto wait = in.Flag("--wait", "until it has ended, and say how many sectors do not match");
    const auto stop = in.Flag("--stop", "end the scrub that runs");
    return [=](Call &call) {
        const Array array = ReadArray(ArrayPath(*word));
        const std::string path = array->szPath;
        const std::string attempted = (*stop ? "end the scrub of " : "scrub ") + path;
        const std::string action = ActionOf(*array);
        RefuseIf(*stop && *wait, attempted, "--stop excludes --wait");
        FailIf((array->fLevel & (RAID_LEVEL_0 | RAID_LEVEL_LINEAR)) != 0, attempted,
               "a " + LevelText(array->fLevel) + " has nothing to compare");
        const bool runs = action == "check";
        BusyIf(!*stop && !runs && !action.empty(), attempted, "it is being rebuilt (" + action + ")",
               "tavoctl raid wait waits for the end");
        if (runs == *stop)
            call.Change(path, "action", Maybe(action), *stop ? std::nullopt : std::optional(std::string("check")));
        if (call.Proceed())
            SetKernelText(ArrayFile(path, "sync_action"), *stop ? "idle" : "check", attempted);
        if (!*wait || call.dry_run)
            return;
        WaitForScrub(path);
        const int64_t count = MismatchesOf(path);
        call.Tell("mismatches", count);
        if (count > 0)
            Warn(std::to_string(count) + " sectors of " + path + " do not match");
    };
}

Action RaidSpeed(Arguments &in)
{
    const auto word = in.Text("ARRAY", array_kind, array_help);
    const auto least = in.Number("--least", "KIB", "a second, also beside other work; 0: the system's", 0, 10'000'000);
    const auto most = in.Number("--most", "KIB", "a second, when nothing else goes on; 0: the system's", 0, 10'000'000);
    return [=](Call &call) {
        const Array array = ReadArray(ArrayPath(*word));
        const std::string attempted = std::string("set the speed of ") + array->szPath;
        RefuseIf(!*least && !*most, attempted, "--least or --most is required");
        RefuseIf(least->value_or(0) > 0 && most->value_or(0) > 0 && **least > **most, attempted,
                 "--least is more than --most");
        const struct {
            const char *column, *file;
            std::optional<int64_t> wanted;
        } settings[] = {{"least_speed", "sync_speed_min", *least}, {"most_speed", "sync_speed_max", *most}};
        const auto file = [&](const auto &setting) { return ArrayFile(array->szPath, setting.file); };
        const auto text = [](int64_t wanted) { return wanted ? std::to_string(wanted) : "system"; };
        for (const auto &setting : settings) {
            // "200000 (system)", "1000 (local)"
            const std::string now = KernelText(file(setting)).value_or("");
            const bool own = now.ends_with("(local)");
            const std::string number = now.substr(0, now.find(' '));
            if (setting.wanted)
                call.Change(array->szPath, setting.column, own ? number : "system", text(*setting.wanted));
        }
        if (!call.Proceed())
            return;
        for (const auto &setting : settings)
            if (setting.wanted)
                SetKernelText(file(setting), text(*setting.wanted), attempted);
    };
}

}  // namespace tavoctl
