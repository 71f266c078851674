// The arguments and options of one verb, over CLI11.
#include "frame/arguments.h"

#include "frame/failure.h"
#include "frame/lists.h"
#include "frame/text.h"

#include <CLI/CLI.hpp>

#include <utility>

namespace tavoctl {

struct Arguments::Parts {
    std::string command;
    CLI::App app;
    std::vector<ArgumentText> texts;
    std::vector<std::pair<bool, std::function<void()>>> readers;  // whether it is a flag's
    std::function<void(Words)> program;

    // The reader is called with the words, and only when there are some.
    CLI::Option *Add(ArgumentText text, std::function<void(const Words &)> reader)
    {
        CLI::Option *option = text.value.empty() ? app.add_flag(text.name) : app.add_option(text.name);
        option->required(text.required);
        const std::size_t index = texts.size();
        const bool flag = text.value.empty();
        texts.push_back(std::move(text));
        readers.emplace_back(flag, [this, index, option, reader = std::move(reader)] {
            if (option->count() == 0)
                return;
            for (const std::string &word : option->results())
                Check(texts[index], word);
            reader(option->results());
        });
        return option;
    }

    static void Check(const ArgumentText &text, const std::string &word)
    {
        std::string allowed = text.kind.allowed;
        for (const std::string &choice : text.choices)
            allowed += (allowed.empty() ? "" : ", ") + choice;
        const bool chosen = text.choices.empty() || Contains(text.choices, word);
        if (chosen && (!text.kind.valid || text.kind.valid(word)))
            return;
        throw Failure{.attempted = "take " + word + " as " + text.name,
                      .reason = "allowed: " + allowed,
                      .hint = DidYouMean(word, text.choices, text.kind.code ? " " : ""),
                      .code = text.kind.code,
                      .status = exit_usage};
    }

    std::string UnknownOption(const Words &words) const
    {
        std::vector<std::string> names;
        for (const ArgumentText &text : texts)
            if (!text.positional)
                names.push_back(text.name);
        for (const std::string &word : words) {
            if (word == "--")
                break;
            const std::string name = word.substr(0, word.find('='));
            if (name.size() > 1 && name[0] == '-' && !Contains(names, name))
                return DidYouMean(name, names, "");
        }
        return "";
    }
};

namespace {

ArgumentText TextOf(const std::string &name, const std::string &value, const std::string &help,
                    const ArgumentKind &kind, bool required, bool many = false, Words choices = {})
{
    const std::string sample = choices.empty() ? kind.sample : choices[0];
    return {name, value, help, name[0] != '-', required, many, kind, std::move(choices), sample};
}

int64_t ParseNumber(const std::string &name, const std::string &word, int64_t least, int64_t most)
{
    const auto number = NumberIn<int64_t>(word);
    RefuseIf(!number || *number < least || *number > most, "take " + word + " as " + name,
             "allowed: a number from " + std::to_string(least) + " to " + std::to_string(most));
    return *number;
}

}  // namespace

Arguments::Arguments(std::string command) : parts_(std::make_unique<Parts>())
{
    parts_->command = std::move(command);
    parts_->app.set_help_flag();
}

Arguments::~Arguments() = default;

Given<std::string> Arguments::Text(const char *name, const ArgumentKind &kind, std::string help)
{
    Given<std::string> given;
    parts_->Add(TextOf(name, name, help, kind, true), [given](const Words &words) { given.Set(words[0]); });
    return given;
}

Given<std::optional<std::string>> Arguments::OptionalText(const char *name, const ArgumentKind &kind, std::string help)
{
    return Option(name, name, kind, std::move(help));
}

Given<Words> Arguments::Texts(const char *name, const ArgumentKind &kind, std::string help, int at_least)
{
    Given<Words> given;
    parts_->Add(TextOf(name, name, help, kind, at_least > 0, true), [given](const Words &words) { given.Set(words); })
        ->expected(at_least, CLI::detail::expected_max_vector_size)
        ->allow_extra_args();
    return given;
}

Given<std::optional<std::string>> Arguments::Option(const char *name, const char *value_name, const ArgumentKind &kind,
                                                    std::string help)
{
    Given<std::optional<std::string>> given;
    parts_->Add(TextOf(name, value_name, help, kind, false), [given](const Words &words) { given.Set(words[0]); });
    return given;
}

Given<std::string> Arguments::Choice(const char *name, Words choices, std::string help)
{
    Given<std::string> given;
    parts_->Add(TextOf(name, name, help, any_text, true, false, std::move(choices)),
                [given](const Words &words) { given.Set(words[0]); });
    return given;
}

Given<std::optional<std::string>> Arguments::OptionalChoice(const char *name, const char *value_name, Words choices,
                                                            std::string help)
{
    Given<std::optional<std::string>> given;
    parts_->Add(TextOf(name, value_name, help, any_text, false, false, std::move(choices)),
                [given](const Words &words) { given.Set(words[0]); });
    return given;
}

Given<std::optional<int64_t>> Arguments::Number(const char *name, const char *value_name, std::string help,
                                                int64_t least, int64_t most)
{
    Given<std::optional<int64_t>> given;
    ArgumentKind kind = any_text;
    kind.name = "number";
    kind.wrong = "many";
    ArgumentText text = TextOf(name, value_name, help, kind, name[0] != '-');
    text.sample = std::to_string(least);
    parts_->Add(std::move(text), [=](const Words &words) { given.Set(ParseNumber(name, words[0], least, most)); });
    return given;
}

Given<bool> Arguments::Flag(const char *name, std::string help)
{
    Given<bool> given;
    parts_->Add(TextOf(name, "", help, any_text, false), [given](const Words &) { given.Set(true); });
    return given;
}

Given<Words> Arguments::Program()
{
    Given<Words> given;
    parts_->program = [given](Words words) { given.Set(std::move(words)); };
    parts_->app.prefix_command();
    parts_->texts.push_back(TextOf("PROGRAM", "PROGRAM", "the program, then its arguments", any_text, true, true));
    return given;
}

bool Arguments::Parse(Words words)
{
    bool help = false;
    parts_->app.add_flag("-h,--help", help);
    std::string wrong, hint;
    try {
        Words reversed(words.rbegin(), words.rend());
        parts_->app.parse(std::move(reversed));
    } catch (const CLI::ParseError &error) {
        wrong = error.what();
        hint = parts_->UnknownOption(words);
    }
    if (help)
        return false;
    if (wrong.empty() && parts_->program) {
        Words program = parts_->app.remaining();
        if (!program.empty() && program.front() == "--")
            program.erase(program.begin());
        if (program.empty())
            wrong = "PROGRAM is required";
        parts_->program(std::move(program));
    }
    RefuseIf(!wrong.empty(), "understand the command line", wrong,
             hint.empty() ? "see " + parts_->command + " --help" : hint);
    // Flags first: a failure of the others is reported as --json says.
    for (const bool flags : {true, false})
        for (std::size_t i = 0; i < parts_->readers.size(); ++i)
            if (parts_->readers[i].first == flags)
                parts_->readers[i].second();
    return true;
}

const std::vector<ArgumentText> &Arguments::Texts() const
{
    return parts_->texts;
}

std::string Arguments::Usage() const
{
    std::string usage = parts_->command + " [OPTION]...";
    for (const ArgumentText &text : parts_->texts) {
        if (!text.positional)
            continue;
        const std::string word = text.name == "PROGRAM" ? "[--] PROGRAM [ARGUMENT]..." : text.name;
        const std::string dots = text.many && text.name != "PROGRAM" ? "..." : "";
        usage += text.required ? " " + word + dots : " [" + word + "]" + dots;
    }
    return usage;
}

std::string Arguments::Help() const
{
    std::vector<std::pair<std::string, std::string>> lines;
    for (const bool positional : {true, false})
        for (const ArgumentText &text : parts_->texts)
            if (text.positional == positional)
                lines.emplace_back(positional || text.value.empty() ? text.name : text.name + " " + text.value,
                                   text.help);
    lines.emplace_back("-h, --help", "this text");
    return Described(lines);
}

}  // namespace tavoctl
