// The texts of --help.
#include "frame/program.h"
#include "frame/text.h"

namespace tavoctl {

std::string Program::Help() const
{
    const auto lines = Mapped(families_, [](const auto &family) {
        return std::pair<std::string, std::string>(family->Name(), family->Purpose());
    });
    return "usage: tavoctl FAMILY VERB [OPTION]... [ARGUMENT]...\n"
           "Reads and changes the state of this appliance.\n\n" +
           Described(lines) +
           "\nSee tavoctl FAMILY --help, tavoctl FAMILY VERB --help.\n"
           "Exit status: 0 done, 1 failed, 2 wrong usage, 3 not found, 4 busy,\n"
           "5 permission denied.\n";
}

std::string FamilyHelp(const Family &family)
{
    const auto lines =
        Mapped(family.Verbs(), [](const VerbEntry &entry) { return std::pair(entry.name, entry.Summary()); });
    return std::string("usage: tavoctl ") + family.Name() + " VERB [OPTION]... [ARGUMENT]...\n" + family.Purpose() +
           "\n\n" + Described(lines);
}

std::string VerbHelp(const Family &family, const VerbEntry &entry)
{
    const ReadyVerb verb(family, entry);
    std::string text =
        Paragraph("usage: " + verb.Declared().Usage(), 7) + Paragraph(entry.purpose) + "\n" + verb.Declared().Help();
    if (entry.examples.empty())
        return text;
    text += "\nExamples:\n";
    for (const std::string &line : Split(entry.examples, '\n'))
        text += "  " + line + "\n";
    return text;
}

}  // namespace tavoctl
