// The way from a command line to an exit status.
#include "frame/program.h"

#include "tavo_error.h"

#include "families.h"
#include "frame/host.h"
#include "frame/text.h"

#include <algorithm>
#include <cctype>
#include <exception>
#include <iostream>
#include <new>

#include <unistd.h>

namespace tavoctl {
namespace {

std::vector<std::string> Tail(const std::vector<std::string> &words, std::size_t from)
{
    return {words.begin() + static_cast<std::ptrdiff_t>(std::min(from, words.size())), words.end()};
}

bool IsHelp(const std::string &word)
{
    return word == "-h" || word == "--help" || word == "help";
}

int Report(const Failure &failure, const Call &call)
{
    const Failure known = WithPermissions(failure);
    std::cout.flush();
    call.Print(known);
    return known.Status();
}

int ReportUsage(const std::string &reason, const std::string &hint)
{
    return Report(UsageFailure("understand the command line", reason, hint), {});
}

// An answer that did not arrive is not an answer.
void RefuseLostOutput()
{
    FailIf(!std::cout.flush(), "write to standard output", "it is full or closed");
}

int Show(const std::string &text)
{
    try {
        std::cout << text;
        RefuseLostOutput();
        return exit_done;
    } catch (const Failure &failure) {
        return Report(failure, {});
    }
}

// Before a verb runs: on this machine, by this user?
void RefuseWithoutRights(const VerbEntry &entry, const Call &call)
{
    if (!(entry.traits & changes) || call.dry_run)
        return;
    if (!call.force_host)
        RefuseForeignHost();
    FailIf(!(entry.traits & by_anybody) && ::geteuid() != 0, "change this machine", "permission denied",
           "run it as root", exit_denied);
}

void PrintReport(const Call &call)
{
    if (call.json)
        std::cout << call.report.Json() << "\n";
    else
        std::cout << (::isatty(STDOUT_FILENO) ? Printable(call.report.Text(), true) : call.report.Text());
}

// The columns that --output names.
std::vector<std::string> ChosenColumns(const std::string &list, const std::vector<ColumnFacts> &columns)
{
    const auto known = Mapped<std::string>(columns, &ColumnFacts::name);
    std::vector<std::string> chosen;
    for (std::string &name : Split(list, ',')) {
        for (char &c : name)
            c = c == ' ' ? '_' : static_cast<char>(std::tolower(static_cast<unsigned char>(c)));
        if (!Contains(known, name))
            throw UsageFailure("take " + name + " as --output", "there is no such column",
                               DidYouMean(name, known, "allowed: " + Joined(known, ", ")));
        chosen.push_back(name);
    }
    RefuseIf(chosen.empty(), "take " + list + " as --output", "no column is named", "allowed: " + Joined(known, ", "));
    return chosen;
}

}  // namespace

std::string VerbEntry::Summary() const
{
    // The full stop of "802.3ad" ends nothing.
    const std::size_t stop = std::min(purpose.find(". "), purpose.find(".\n"));
    std::string sentence = purpose.substr(0, stop);
    std::replace(sentence.begin(), sentence.end(), '\n', ' ');
    return sentence.ends_with('.') ? sentence.substr(0, sentence.size() - 1) : sentence;
}

void Family::Add(const char *name, unsigned traits, Answer answer, Action (*declare)(Arguments &),
                 std::string_view text)
{
    const std::size_t gap = std::min(text.find("\n\n"), text.size());
    verbs_.push_back({name, traits, std::move(answer), std::string(text.substr(0, gap)),
                      std::string(text.substr(std::min(gap + 2, text.size()))), declare});
}

std::vector<std::string> Family::VerbNames() const
{
    return Mapped(verbs_, &VerbEntry::name);
}

const VerbEntry *Family::Find(const std::string &name) const
{
    const auto found = std::find_if(verbs_.begin(), verbs_.end(), [&](const VerbEntry &v) { return name == v.name; });
    return found == verbs_.end() ? nullptr : &*found;
}

std::string Family::Command(const VerbEntry &verb) const
{
    return std::string("tavoctl ") + name_ + (verb.name.empty() ? "" : " ") + verb.name;
}

ReadyVerb::ReadyVerb(const Family &family, const VerbEntry &entry)
    : arguments_(family.Command(entry)), action_(entry.declare(arguments_))
{
    const unsigned traits = entry.traits;
    if (entry.ReportsChanges())
        dry_run_ = arguments_.Flag("--dry-run", "change nothing and show what would change");
    if (traits & destroys)
        yes_ = arguments_.Flag("--yes", "do it without asking");
    if (traits & changes)
        force_host_ = arguments_.Flag("--force-host", "do it although this machine is not an appliance");
    json_ = arguments_.Flag("--json", entry.ReportsChanges() ? "print what was changed, or a failure, as JSON"
                                      : (traits & changes)   ? "report a failure as JSON"
                                                             : "print JSON; also report a failure so");
    if (entry.answer.form == Answer::list) {
        output_ = arguments_.Option("--output", "COLUMNS", any_text, "the columns of the table, joined by commas");
        no_headings_ = arguments_.Flag("--noheadings", "print the table without its headings");
    }
    verbose_ = arguments_.Flag("--verbose", "name the place in the library where a failure was found");
}

Call ReadyVerb::Called() const
{
    Call call;
    call.json = *json_;
    call.dry_run = call.report.dry_run = *dry_run_;
    call.yes = *yes_;
    call.force_host = *force_host_;
    call.verbose = *verbose_;
    call.style.headings = !*no_headings_;
    return call;
}

Program::Program()
{
    for (AddFamily *add : families)
        add(*this);
}

Family &Program::Add(const char *name, const char *purpose)
{
    return *families_.emplace_back(std::make_unique<Family>(name, purpose));
}

std::vector<std::string> Program::FamilyNames() const
{
    return Mapped<std::string>(families_, &Family::Name);
}

const Family *Program::Find(const std::string &name) const
{
    const auto found =
        std::find_if(families_.begin(), families_.end(), [&](const auto &f) { return name == f->Name(); });
    return found == families_.end() ? nullptr : found->get();
}

int Program::Run(std::vector<std::string> words) const
{
    const std::string first = words.empty() ? "" : words[0];
    if (IsHelp(first))
        return Show(Help());
    if (first == "--version")
        return Run({"version"});
    if (RunForTools(words))
        return Show("");
    const Family *family = Find(first);
    if (!family) {
        const std::string reason = first.empty() ? "a family is required" : "there is no family " + first;
        return ReportUsage(reason, DidYouMean(first, FamilyNames(), "see tavoctl --help"));
    }
    if (const VerbEntry *only = family->Find(""))
        return RunVerb(*family, *only, Tail(words, 1));
    const std::string second = words.size() > 1 ? words[1] : "";
    if (IsHelp(second))
        return Show(FamilyHelp(*family));
    const VerbEntry *verb = second.empty() ? nullptr : family->Find(second);
    if (!verb) {
        const std::string reason = second.empty() ? "a verb is required" : "there is no verb " + first + " " + second;
        return ReportUsage(reason, DidYouMean(second, family->VerbNames(), "see tavoctl " + first + " --help"));
    }
    return RunVerb(*family, *verb, Tail(words, 2));
}

// Requests of other programs: the build, shells, tests.
bool Program::RunForTools(const std::vector<std::string> &words) const
{
    const std::string first = words.empty() ? "" : words[0];
    if (first == "--man-pages" && words.size() == 2)
        WriteManPages(*this, words[1]);
    else if (first == "--man-page")
        std::cout << ManPage(*this);
    else if (first == "--registry")
        std::cout << RegistryJson(*this) << "\n";
    else if (first == "--manual")
        std::cout << ManualText(*this);
    else if (first == "--schemas" && words.size() == 2)
        WriteSchemas(*this, words[1]);
    else if (first == "--complete")
        for (const std::string &candidate : Complete(*this, Tail(words, 1)))
            std::cout << candidate << "\n";
    else
        return false;
    return true;
}

int Program::RunVerb(const Family &family, const VerbEntry &entry, std::vector<std::string> words) const
{
    Call call;
    ReadyVerb verb(family, entry);
    try {
        try {
            if (!verb.Declared().Parse(std::move(words)))
                return Show(VerbHelp(family, entry));
        } catch (const Failure &) {
            call = verb.Called();
            throw;
        }
        call = verb.Called();
        if (verb.Output())
            call.style.columns = ChosenColumns(*verb.Output(), entry.answer.columns);
        RefuseWithoutRights(entry, call);
        if (entry.answer.has_entries)
            call.report.entries.emplace();
        TLIBErrSet(ERR_SUCCESS);
        verb.Run()(call);
        if (entry.ReportsChanges() && (call.json || call.dry_run))
            PrintReport(call);
        RefuseLostOutput();
        return call.status;
    } catch (const Failure &failure) {
        return Report(failure, call);
    } catch (const std::bad_alloc &) {
        return Report({.attempted = "go on", .code = ERR_OUT_OF_MEMORY}, call);
    } catch (const std::exception &error) {
        return Report({.attempted = "go on", .reason = error.what()}, call);
    }
}

}  // namespace tavoctl
