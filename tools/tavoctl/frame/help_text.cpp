// The texts of --help.
#include "frame/program.h"

#include <algorithm>
#include <sstream>

namespace tavoctl {
namespace {

std::string Line(const std::string &name, std::size_t width, const std::string &purpose)
{
    // The first sentence says enough in a list.
    return "  " + name + std::string(width - name.size() + 2, ' ') + purpose.substr(0, purpose.find('.')) + "\n";
}

// Broken between words so that no line is longer than a terminal usually is.
std::string Paragraph(const std::string &text)
{
    constexpr std::size_t width = 80;
    std::string lines;
    std::size_t column = 0;
    std::istringstream words(text);
    for (std::string word; words >> word;) {
        const bool breaks = column && column + 1 + word.size() > width;
        lines += (breaks ? "\n" : column ? " " : "") + word;
        column = (breaks || !column ? 0 : column + 1) + word.size();
    }
    return lines + "\n";
}

}  // namespace

std::string Program::Help() const
{
    std::string text = "usage: tavoctl FAMILY VERB [OPTION]... [ARGUMENT]...\n"
                       "Reads and changes the state of this appliance.\n\n";
    for (const auto &family : families_)
        text += Line(family->Name(), 10, family->Purpose());
    text += "\nSee tavoctl FAMILY --help, tavoctl FAMILY VERB --help.\n"
            "Exit status: 0 done, 1 failed, 2 wrong usage, 3 not found, 4 busy.\n";
    return text;
}

std::string FamilyHelp(const Family &family)
{
    std::string text = std::string("usage: tavoctl ") + family.Name() + " VERB [OPTION]... [ARGUMENT]...\n" +
                       family.Purpose() + "\n\n";
    std::size_t width = 0;
    for (const VerbEntry &entry : family.Verbs())
        width = std::max(width, std::string(entry.info.name).size());
    for (const VerbEntry &entry : family.Verbs())
        text += Line(entry.info.name, width, entry.info.purpose);
    return text;
}

std::string VerbHelp(const Family &family, const VerbEntry &entry)
{
    const ReadyVerb verb(family, entry);
    std::string text =
        "usage: " + verb.Declared().Usage() + "\n" + Paragraph(entry.info.purpose) + "\n" + verb.Declared().Help();
    if (*entry.info.examples) {
        text += "\nExamples:\n  ";
        for (const char *c = entry.info.examples; *c; ++c)
            text += *c == '\n' ? std::string("\n  ") : std::string(1, *c);
        text += "\n";
    }
    return text;
}

}  // namespace tavoctl
