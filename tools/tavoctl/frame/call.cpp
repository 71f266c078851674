// How a verb answers and asks.
#include "frame/failure.h"
#include "frame/table.h"
#include "frame/terminal_text.h"
#include "frame/verb.h"

#include <cstdio>
#include <iostream>

#include <unistd.h>

namespace tavoctl {
namespace {

template <class Facts>
void PrintFacts(const Facts &facts, bool json)
{
    if (json)
        std::cout << facts.Json() << "\n";
    else
        std::cout << facts.Text();
}

}  // namespace

void Call::Print(const Table &table) const
{
    PrintFacts(table, json);
}

void Call::Print(const Record &record) const
{
    PrintFacts(record, json);
}

void Call::PrintValue(const std::string &value, const Record &record) const
{
    if (json)
        PrintFacts(record, true);
    else
        std::cout << (::isatty(STDOUT_FILENO) ? Printable(value) : value) << "\n";
}

void Call::Confirm(const std::string &question) const
{
    if (yes || dry_run)
        return;
    if (!::isatty(STDIN_FILENO) || !::isatty(STDERR_FILENO))
        throw UsageFailure("go on without an answer to \"" + question + "\"", "nobody can be asked",
                           "say --yes to do it");
    std::cerr << Printable(question) << " [y/N] " << std::flush;
    std::string answer;
    std::getline(std::cin, answer);
    if (answer != "y" && answer != "Y" && answer != "yes")
        throw Failure{.attempted = "go on", .reason = "the answer was no", .status = exit_failed};
}

}  // namespace tavoctl
