// tavoctl disk: the verdict on a drive, and its self-tests.
#include "frame/files.h"
#include "frame/terminal.h"
#include "storage/device.h"
#include "storage/disk_verbs.h"
#include "storage/smart_pages.h"

#include <algorithm>
#include <cerrno>
#include <chrono>
#include <thread>

#include <linux/hdreg.h>
#include <sys/ioctl.h>

namespace tavoctl {
namespace {

constexpr unsigned char short_test = 1;
constexpr unsigned char long_test = 2;
constexpr unsigned char stop_test = 127;

void ReadPage(const std::string &disk, unsigned char (&page)[512], const std::string &attempted)
{
    FailIf(SmartDataRead(disk.c_str(), page, 0) != 0, attempted, "the drive does not give its SMART data");
}

SelfTest ReadSelfTest(const std::string &disk, const std::string &attempted)
{
    unsigned char page[512] = {};
    ReadPage(disk, page, attempted);
    return ParseSelfTest(page);
}

struct Smart {
    unsigned char command = 0xB0;
    unsigned char number;  // of the test or the log
    unsigned char feature;
    unsigned char pages;
    unsigned char page[512];
};

constexpr unsigned char execute_off_line = 0xD4;
constexpr unsigned char read_log = 0xD5;

void Send(const std::string &disk, Smart &request, const std::string &attempted)
{
    const Descriptor drive(TAVOIDiskRawOpen(disk.c_str()));
    Must(drive.IsOpen(), attempted);
    if (::ioctl(drive.Get(), HDIO_DRIVE_CMD, &request) != 0)
        throw SystemFailure(attempted, errno);
}

// The drive does it by itself.
void RunTest(const std::string &disk, unsigned char test, const std::string &attempted)
{
    Smart request = {.number = test, .feature = execute_off_line, .pages = 0, .page = {}};
    Send(disk, request, attempted);
}

ErrorLog ReadErrors(const std::string &disk, const std::string &attempted)
{
    constexpr unsigned char summary = 1;
    Smart request = {.number = summary, .feature = read_log, .pages = 1, .page = {}};
    Send(disk, request, attempted);
    return ParseErrorLog(request.page);
}

void WaitForTest(const std::string &disk, const std::string &attempted)
{
    Progress progress(DeviceName(disk));
    for (;; std::this_thread::sleep_for(std::chrono::seconds(2))) {
        const SelfTest test = ReadSelfTest(disk, attempted);
        if (!test.running) {
            FailIf(test.result != "passed", attempted, "the test " + test.result);
            return;
        }
        progress.Show("self-test " + std::to_string(test.percent) + " %");
    }
}

}  // namespace

DiskHealth ReadHealth(const std::string &disk, bool wake)
{
    const std::string attempted = "read the health of " + disk;
    DiskHealth health = {.disk = DeviceName(disk)};
    RefuseUnreadable(disk, attempted);
    if (!MayRead(disk, wake)) {
        health.reason = "it is in standby, or does not tell whether it sleeps";
        return health;
    }
    try {
        const std::vector<SmartAttribute> attributes = ReadSmart(disk, attempted);
        const SelfTest test = ReadSelfTest(disk, attempted);
        const Verdict verdict = Judge(attributes, test);
        health.verdict = verdict.verdict;
        health.reason = Maybe(verdict.reason);
        health.self_test = test.result;
        if (test.running)
            health.percent = test.percent;
        constexpr int power_on_hours = 9;
        constexpr uint64_t hours = 0xFFFFFF;  // above them some drives count milliseconds
        if (const auto raw = RawOf(attributes, power_on_hours))
            health.hours = *raw & hours;
    } catch (const Failure &failure) {
        health.reason = failure.reason;
        return health;
    }
    try {
        health.errors = ReadErrors(disk, attempted).count;
    } catch (const Failure &) {
        // Not every drive keeps a log.
    }
    return health;
}

Action DiskHealthList(Arguments &in)
{
    const auto words = in.Texts("DISK", disk_kind, disk_help, 0);
    const auto wake = in.Flag("--wake", wake_help);
    return [=](Call &call) {
        const std::vector<std::string> paths = DiskPaths(*words);
        const auto disks = Mapped(paths.empty() ? DiskPaths() : paths,
                                  [&](const std::string &path) { return ReadHealth(path, *wake); });
        call.List(health_columns, disks);
        const bool fails =
            std::any_of(disks.begin(), disks.end(), [](const DiskHealth &disk) { return disk.verdict == "failing"; });
        if (fails)
            call.status = exit_failed;
    };
}

Action DiskErrors(Arguments &in)
{
    const auto word = in.Text("DISK", disk_kind, disk_help);
    const auto wake = in.Flag("--wake", wake_help);
    return [=](Call &call) {
        const std::string disk = DiskPath(*word);
        const std::string attempted = "read the error log of " + disk;
        RefuseToWake(disk, *wake, attempted);
        call.List(error_columns, ReadErrors(disk, attempted).last);
    };
}

Action DiskTest(Arguments &in)
{
    const auto word = in.Text("DISK", disk_kind, disk_help);
    const auto quick = in.Flag("--short", "a few minutes");
    const auto thorough = in.Flag("--long", "all of the disk, for hours");
    const auto stop = in.Flag("--stop", "end the test that runs");
    const auto wait = in.Flag("--wait", "until the test has ended; fails when it has not passed");
    return [=](Call &call) {
        const std::string disk = DiskPath(*word);
        const std::string attempted = "test " + disk;
        RefuseIf(*quick + *thorough + *stop != 1 || (*stop && *wait), attempted,
                 "say one of --short, --long and --stop");
        const SelfTest before = ReadSelfTest(disk, attempted);
        BusyIf(before.running && !*stop, attempted,
               "a test runs, " + std::to_string(before.percent) + " % of it are done",
               "tavoctl disk test --stop ends it");
        if (before.running || !*stop)
            call.Change(disk, "self_test", before.result, *stop ? "stopped" : *quick ? "short" : "long");
        if (!*stop) {
            const int minutes = *quick ? before.short_minutes : before.long_minutes;
            call.Tell("minutes", minutes > 0 ? std::optional(minutes) : std::nullopt);
        }
        if (call.Proceed())
            RunTest(disk, *stop ? stop_test : *quick ? short_test : long_test, attempted);
        if (*wait && !call.dry_run)
            WaitForTest(disk, attempted);
    };
}

}  // namespace tavoctl
