// Watching: looks, prints what has changed, waits.
#include "frame/watch.h"

#include <csignal>
#include <ctime>
#include <iostream>

#include <unistd.h>

namespace tavoctl {
namespace {

constexpr char redraw[] = "\x1b[H\x1b[J";

volatile std::sig_atomic_t asked_to_end = 0;

// Sleeps of the library go on in spite of a signal's handler; a second one ends the program where it is.
void EndOnRequest()
{
    struct sigaction action = {};
    action.sa_handler = [](int) { asked_to_end = 1; };
    action.sa_flags = static_cast<int>(SA_RESETHAND);
    for (const int number : {SIGINT, SIGTERM})
        ::sigaction(number, &action, nullptr);
}

// Sleeps, unless a signal asks to end.
void Pause(int seconds)
{
    timespec left = {seconds, 0};
    while (!asked_to_end && ::nanosleep(&left, &left) != 0)
        ;
}

}  // namespace

void Watch(const Call &call, int pause_seconds, const std::function<Table()> &look)
{
    EndOnRequest();
    const bool terminal = ::isatty(STDOUT_FILENO) && !call.json;
    std::optional<std::string> last;
    for (; !asked_to_end && std::cout; Pause(pause_seconds)) {
        const Table table = look();
        std::string text = table.Text();
        if (asked_to_end || (!terminal && text == last))
            continue;
        if (terminal)
            std::cout << redraw;
        else if (last && !call.json)
            std::cout << "\n";
        if (call.json)
            std::cout << table.Json(true) << "\n" << std::flush;
        else
            std::cout << table.Text(call.style) << std::flush;
        last = std::move(text);
    }
}

}  // namespace tavoctl
