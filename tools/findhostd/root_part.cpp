// The part of the daemon that keeps the rights of root.
#include "root_part.h"

#include "host_table.h"
#include "list_file.h"
#include "report.h"

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

// One report. The other part may have been taken over by somebody from the network: nothing of it is believed unseen.
Heard HearOne(int reports, HostTable &table)
{
    Report report{};
    const ssize_t size = ::recv(reports, &report, sizeof report, MSG_DONTWAIT | MSG_TRUNC);
    if (size < 0)
        return errno == EAGAIN || errno == EINTR ? Heard::nothing : Heard::end;
    if (size == 0)
        return Heard::end;
    if (size != sizeof report)
        return Heard::no_change;
    if (report.kind == Report::query_sent)
        table.Clear();
    if (report.kind == Report::query_sent || report.kind == Report::query_again)
        return Heard::change;
    if (report.kind != Report::host_found || !IsSound(report.host))
        return Heard::no_change;
    return table.Put(report.host, report.interface) ? Heard::change : Heard::no_change;
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
    constexpr int together = 64;  // reports that make one list: a flood makes no more than a list for so many
    for (;;) {
        pollfd ends[] = {{reports, POLLIN, 0}, {signals, POLLIN, 0}};
        if (::poll(ends, 2, -1) < 0 && errno != EINTR)
            return false;
        if (ends[1].revents && IsAskedToEnd(signals))
            return true;
        if (!ends[0].revents)
            continue;
        bool changed = false;
        Heard heard = Heard::no_change;
        for (int i = 0; i < together && heard != Heard::nothing && heard != Heard::end; ++i) {
            heard = HearOne(reports, table);
            changed = changed || heard == Heard::change;
        }
        if (changed && !WriteList(table.Text()))
            ::syslog(LOG_ERR, "cannot write the list of hosts: %m");
        if (heard == Heard::end)
            return false;
    }
}

}  // namespace findhostd
