// Completion: the program knows its verbs, so the shell asks it.
#include "frame/program.h"

#include <algorithm>

namespace tavoctl {
namespace {

// The candidates for the last of the verb's words.
std::vector<std::string> OfVerb(const Arguments &declared, const std::vector<std::string> &words)
{
    std::vector<const ArgumentText *> places;
    std::vector<std::string> options;
    for (const ArgumentText &text : declared.Texts())
        if (text.positional)
            places.push_back(&text);
        else
            options.push_back(text.name);

    std::size_t place = 0;
    const ArgumentText *pending = nullptr;  // an option that waits for its value
    for (std::size_t i = 0; i + 1 < words.size(); ++i) {
        const auto named = std::find_if(declared.Texts().begin(), declared.Texts().end(),
                                        [&](const ArgumentText &text) { return text.name == words[i]; });
        if (pending)
            pending = nullptr;
        else if (named != declared.Texts().end() && !named->positional)
            pending = named->value.empty() ? nullptr : &*named;
        else
            ++place;
    }
    if (!pending && words.back().starts_with("-"))
        return options;
    if (!pending && !places.empty()) {
        const ArgumentText *last = places.back();
        pending = place < places.size() ? places[place] : last->many ? last : nullptr;
    }
    if (!pending)
        return {};
    return pending->kind.candidates ? pending->kind.candidates() : pending->choices;
}

std::vector<std::string> AllOf(const Program &program, const std::vector<std::string> &words)
{
    if (words.size() == 1)
        return program.FamilyNames();
    const Family *family = program.Find(words[0]);
    if (!family)
        return {};
    const VerbEntry *only = family->Find("");
    if (!only && words.size() == 2)
        return family->VerbNames();
    const VerbEntry *entry = only ? only : family->Find(words[1]);
    if (!entry)
        return {};
    const ReadyVerb verb(*family, *entry);
    return OfVerb(verb.Declared(), {words.begin() + (only ? 1 : 2), words.end()});
}

}  // namespace

std::vector<std::string> Complete(const Program &program, std::vector<std::string> words)
{
    if (words.empty())
        words.emplace_back();
    std::vector<std::string> names = AllOf(program, words);
    std::erase_if(names, [&](const std::string &name) { return !name.starts_with(words.back()); });
    return names;
}

}  // namespace tavoctl
