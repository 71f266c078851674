// The way from a command line to an exit status.
#include "frame/program.h"

#include "families.h"
#include "frame/failure.h"
#include "frame/host.h"

#include "tavo_error.h"

#include <algorithm>
#include <exception>
#include <iostream>
#include <new>
#include <utility>

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

int Report(const Failure &failure, bool json)
{
    std::cout.flush();
    std::cerr << (json ? failure.Json() : failure.Text()) << "\n";
    return failure.Status();
}

}  // namespace

const VerbEntry *Family::Find(const std::string &name) const
{
    const auto found =
        std::find_if(verbs_.begin(), verbs_.end(), [&](const VerbEntry &v) { return name == v.info.name; });
    return found == verbs_.end() ? nullptr : &*found;
}

std::string Family::Command(const VerbEntry &verb) const
{
    return std::string("tavoctl ") + name_ + (*verb.info.name ? " " : "") + verb.info.name;
}

ReadyVerb::ReadyVerb(const Family &family, const VerbEntry &entry)
    : verb_(entry.make()), arguments_(family.Command(entry))
{
    verb_->Declare(arguments_);
    const unsigned traits = entry.info.traits;
    if (traits & tells_before)
        arguments_.Flag("--dry-run", call_.dry_run, "change nothing and show the difference that it would make");
    if (traits & destroys)
        arguments_.Flag("--yes", call_.yes, "do it without asking");
    if (traits & changes)
        arguments_.Flag("--force-host", call_.force_host, "do it although this machine is no appliance");
    arguments_.Flag("--json", call_.json,
                    traits & changes ? "report a failure as JSON" : "print JSON; also report a failure so");
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

const Family *Program::Find(const std::string &name) const
{
    const auto found =
        std::find_if(families_.begin(), families_.end(), [&](const auto &f) { return name == f->Name(); });
    return found == families_.end() ? nullptr : found->get();
}

int Program::Run(std::vector<std::string> words) const
{
    const std::string first = words.empty() ? "" : words[0];
    if (IsHelp(first)) {
        std::cout << Help();
        return exit_done;
    }
    if (first == "--version")
        return Run({"version"});
    if (first == "--man-page") {
        std::cout << ManPage(*this);
        return exit_done;
    }
    if (first == "--complete") {
        for (const std::string &candidate : Complete(*this, Tail(words, 1)))
            std::cout << candidate << "\n";
        return exit_done;
    }
    const Family *family = Find(first);
    if (!family) {
        const std::string reason = first.empty() ? "a family is required" : "there is no family " + first;
        return Report(UsageFailure("understand the command line", reason, "see tavoctl --help"), false);
    }
    if (const VerbEntry *only = family->Find(""))
        return RunVerb(*family, *only, Tail(words, 1));
    const std::string second = words.size() > 1 ? words[1] : "";
    if (IsHelp(second)) {
        std::cout << FamilyHelp(*family);
        return exit_done;
    }
    const VerbEntry *verb = second.empty() ? nullptr : family->Find(second);
    if (!verb) {
        const std::string reason = second.empty() ? "a verb is required" : "there is no verb " + first + " " + second;
        return Report(UsageFailure("understand the command line", reason, "see tavoctl " + first + " --help"), false);
    }
    return RunVerb(*family, *verb, Tail(words, 2));
}

int Program::RunVerb(const Family &family, const VerbEntry &entry, std::vector<std::string> words) const
{
    ReadyVerb verb(family, entry);
    try {
        if (!verb.Declared().Parse(std::move(words))) {
            std::cout << VerbHelp(family, entry);
            return exit_done;
        }
        if ((entry.info.traits & changes) && !verb.Common().dry_run && !verb.Common().force_host)
            RefuseForeignHost();
        TLIBErrSet(ERR_SUCCESS);
        const int status = verb.Run();
        // An answer that did not arrive is no answer.
        if (!std::cout.flush())
            throw Failure{.attempted = "write to standard output", .reason = "it is full or closed"};
        return status;
    } catch (const Failure &failure) {
        return Report(failure, verb.Common().json);
    } catch (const std::bad_alloc &) {
        return Report({.attempted = "go on", .code = ERR_OUT_OF_MEMORY}, verb.Common().json);
    } catch (const std::exception &error) {
        return Report({.attempted = "go on", .reason = error.what()}, verb.Common().json);
    }
}

}  // namespace tavoctl
