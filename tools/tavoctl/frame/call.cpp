// How a verb answers and asks.
#include "frame/error_codes.h"
#include "frame/terminal.h"
#include "frame/text.h"
#include "frame/verb.h"

#include <iostream>

#include <unistd.h>

namespace tavoctl {

void Call::Print(const Table &table) const
{
    if (json)
        std::cout << table.Json() << "\n";
    else
        Terminal::Page(table.Text(style));
}

void Call::Print(const Record &record) const
{
    if (json)
        std::cout << record.Json() << "\n";
    else
        Terminal::Page(record.Text());
}

void Call::Print(const Record &record, const Table &table) const
{
    Terminal::Page(record.Text() + "\n" + table.Text(style));
}

void Call::PrintValue(const std::string &value, const Record &record) const
{
    if (json)
        Print(record);
    else
        std::cout << (::isatty(STDOUT_FILENO) ? Printable(value) : value) << "\n";
}

bool Call::IsWanted(const ColumnFacts &column) const
{
    return column.place != in_one || Contains(style.columns, column.name);
}

void Call::Print(const Failure &failure) const
{
    std::cerr << (json ? failure.Json() : failure.Text(verbose)) + "\n";
}

void Call::Change(const std::string &object, const std::string &column, const Cell &before, const Cell &after)
{
    if (!(before == after))
        report.changes.push_back({object, column, before, after});
}

void Call::BeginEntry(const std::string &object)
{
    report.entries->push_back({.object = object, .result = {}, .code = {}, .name = {}});
}

void Call::FailEntry(const std::string &object, const Failure &failure)
{
    for (Entry &entry : *report.entries)
        if (entry.object == object) {
            entry.result = "failed";
            if (failure.code) {
                entry.code = Hexadecimal(failure.code);
                entry.name = ErrorName(failure.code);
            }
        }
    std::erase_if(report.changes, [&](const tavoctl::Change &change) { return change.object == object; });
    Print(failure);
    if (status == exit_done)
        status = failure.Status();
}

bool Call::Proceed(const std::string &question) const
{
    if (dry_run || !report.Changed())
        return false;
    if (!question.empty())
        Confirm(question);
    return true;
}

void Call::Confirm(const std::string &question) const
{
    if (yes || dry_run)
        return;
    RefuseIf(!::isatty(STDIN_FILENO) || !::isatty(STDERR_FILENO), "go on without an answer to \"" + question + "\"",
             "there is no terminal to ask at", "--yes does it without asking");
    std::cerr << Printable(question) << " [y/N] " << std::flush;
    std::string answer;
    std::getline(std::cin, answer);
    FailIf(answer != "y" && answer != "Y" && answer != "yes", "go on", "the answer was no");
}

}  // namespace tavoctl
