// The part of the daemon that keeps the rights of root.
#include "root_part.h"

#include "clock.h"
#include "host_table.h"
#include "list_file.h"
#include "own_addresses.h"
#include "report.h"

#include <algorithm>
#include <cerrno>
#include <csignal>

#include <poll.h>
#include <sys/signalfd.h>
#include <sys/socket.h>
#include <syslog.h>
#include <unistd.h>

namespace findhostd {
namespace {

enum class Heard { nothing, change, no_change, end };

// Handles one report. An attacker may control the other part, so every field is checked.
Heard HearOne(int reports, HostTable &table, OwnAddresses &addresses)
{
    Report report{};
    const ssize_t size = ::recv(reports, &report, sizeof report, MSG_DONTWAIT | MSG_TRUNC);
    if (size < 0)
        return errno == EAGAIN || errno == EINTR ? Heard::nothing : Heard::end;
    if (size == 0)
        return Heard::end;
    if (size != sizeof report)
        return Heard::no_change;
    if (report.kind == Report::query_sent) {
        table.NoteQuery(Now());
        return Heard::change;
    }
    if (report.kind != Report::host_found || !IsSound(report.host))
        return Heard::no_change;
    addresses.Refresh();
    if (!addresses.Near(report.interface, report.host.address))
        return Heard::no_change;
    return table.Put(report.host, report.interface, Now()) ? Heard::change : Heard::no_change;
}

bool IsAskedToEnd(int signals)
{
    signalfd_siginfo signal;
    return ::read(signals, &signal, sizeof signal) == sizeof signal && signal.ssi_signo != SIGHUP;
}

}  // namespace

bool KeepList(int reports, int signals)
{
    static HostTable table;
    static OwnAddresses addresses;
    constexpr int together = 64;      // reports before the signals are looked at again
    constexpr int64_t between = 250;  // ms: a flood makes four lists a second
    bool changed = false;
    int64_t next = 0;  // list, at the earliest
    for (;;) {
        pollfd ends[] = {{reports, POLLIN, 0}, {signals, POLLIN, 0}};
        const int64_t wait = changed ? std::clamp<int64_t>(next - Now(), 0, between) : -1;
        if (::poll(ends, 2, static_cast<int>(wait)) < 0 && errno != EINTR)
            return false;
        if (ends[1].revents && IsAskedToEnd(signals))
            return true;
        Heard heard = ends[0].revents ? Heard::no_change : Heard::nothing;
        for (int i = 0; i < together && heard != Heard::nothing && heard != Heard::end; ++i) {
            heard = HearOne(reports, table, addresses);
            changed = changed || heard == Heard::change;
        }
        if (changed && Now() >= next) {
            changed = false;
            next = Now() + between;
            if (!WriteList(table.Text(Now())))
                ::syslog(LOG_ERR, "cannot write the list of hosts: %m");
        }
        if (heard == Heard::end)
            return false;
    }
}

}  // namespace findhostd
