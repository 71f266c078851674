// tavoctl state: settings, accounts, network and services as one document.
#include "families.h"
#include "frame/files.h"
#include "frame/text.h"
#include "state/state_document.h"
#include "state/state_plan.h"

#include <algorithm>

namespace tavoctl {
namespace {

std::vector<std::string> SectionNames()
{
    return {std::begin(state_sections), std::end(state_sections)};
}

// "users,groups"; all of them for "".
std::optional<Sections> SectionsOf(const std::string &list)
{
    const std::vector<std::string> names = list.empty() ? SectionNames() : Split(list, ',');
    if (std::any_of(names.begin(), names.end(),
                    [](const std::string &name) { return !Contains(state_sections, name); }))
        return {};
    return Sections(names.begin(), names.end());
}

constexpr ArgumentKind sections_kind = {
    .name = "sections",
    .allowed = "settings, users, groups, network, quotas, services, storage, joined by commas",
    .valid = [](const std::string &list) { return SectionsOf(list).has_value(); },
    .candidates = SectionNames,
    .sample = "users,groups",
    .wrong = "users,nonsense",
};

constexpr char document_help[] = "a document, or - for standard input";

auto Only(Arguments &in)
{
    return in.Option("--only", "SECTIONS", sections_kind, "only these sections, joined by commas");
}

StateJson Document(const std::string &path, const std::optional<std::string> &only)
{
    return ParseState(ReadWhole(path), *SectionsOf(only.value_or("")));
}

Action StateShow(Arguments &in)
{
    const auto secrets = in.Flag("--secrets", "with the hashes of the passwords");
    const auto only = Only(in);
    const auto path = in.Option("--output", "PATH", file_path, "a new file that only root can read (standard output)");
    return [=](Call &call) {
        const StateJson state = ReadState(call, *SectionsOf(only->value_or("")), *secrets);
        WriteWhole(path->value_or(""), state.dump(2, ' ', true) + "\n");
    };
}

Action StateDiff(Arguments &in)
{
    const auto only = Only(in);
    const auto path = in.Text("FILE", file_path, document_help);
    return [=](Call &call) {
        call.dry_run = true;
        const StateJson document = Document(*path, *only);
        const StatePlan plan(call, document);
        if (document.contains("storage"))
            CompareStorage(call, document["storage"]);
        call.List(change_columns, call.report.changes);
        plan.WarnOfRefused(call);
        call.status = call.report.changes.empty() ? exit_done : exit_failed;
    };
}

Action StateApply(Arguments &in)
{
    const auto only = Only(in);
    const auto no_probe = in.Flag("--no-probe", "do not ask by ARP first whether another host uses a new address");
    const auto path = in.Text("FILE", file_path, document_help);
    return [=](Call &call) { StatePlan(call, Document(*path, *only)).CarryOut(call, !*no_probe); };
}

}  // namespace

void AddState(Program &program)
{
    Family &state = program.Add("state", "The whole appliance as one document");
    state.Add("show", reads, Answer::Own(StateSchema, "#the-state-as-a-document"), StateShow,
              R"(Writes settings, users, groups, network, quotas, services and storage as
JSON, in the form that apply reads. Password hashes only when asked for: who has them can log in to Samba.

tavoctl state show > box.json
tavoctl state show --secrets --output /root/box.json
tavoctl state show --only users,groups)");
    state.Add("diff", reads, Answer::List(change_columns), StateDiff,
              R"(Lists what differs from a document, storage too; exit
status 1 when something does. What the document does not speak of is not compared.

tavoctl state diff box.json
tavoctl state diff --only network --json box.json)");
    state.Add("apply", changes, StateApply, R"(Brings the appliance to what a document says; what it does not speak
of stays, and so does storage. Everything is looked at before anything is changed. Settings, accounts and network are
each all or nothing; quotas and services go one by one, and those that fail are named.

tavoctl state apply --dry-run box.json
tavoctl state apply --only users,groups box.json)");
}

}  // namespace tavoctl
