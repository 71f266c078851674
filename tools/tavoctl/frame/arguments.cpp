// The arguments and options of one verb, over CLI11.
#include "frame/arguments.h"

#include "frame/failure.h"

#include <CLI/CLI.hpp>

#include <algorithm>
#include <utility>

namespace tavoctl {

struct Arguments::Parts {
    std::string command;
    CLI::App app;
    std::vector<ArgumentText> texts;
    std::vector<std::string> *program = nullptr;

    template <class Value>
    CLI::Option *Add(ArgumentText text, Value &value)
    {
        CLI::Option *option = app.add_option(text.name, value);
        option->required(text.required);
        texts.push_back(std::move(text));
        return option;
    }
};

Arguments::Arguments(std::string command) : parts_(std::make_unique<Parts>())
{
    parts_->command = std::move(command);
    parts_->app.set_help_flag();
}

Arguments::~Arguments() = default;

void Arguments::Text(const std::string &name, std::string &value, const std::string &help, Candidates candidates)
{
    parts_->Add({name, name, help, true, true, false, candidates}, value);
}

void Arguments::OptionalText(const std::string &name, std::string &value, const std::string &help,
                             Candidates candidates)
{
    parts_->Add({name, name, help, true, false, false, candidates}, value);
}

void Arguments::Texts(const std::string &name, std::vector<std::string> &values, const std::string &help, int at_least,
                      Candidates candidates)
{
    CLI::Option *option = parts_->Add({name, name, help, true, at_least > 0, true, candidates}, values);
    option->expected(at_least, CLI::detail::expected_max_vector_size);
}

void Arguments::Option(const std::string &name, const std::string &value_name, std::string &value,
                       const std::string &help, Candidates candidates)
{
    parts_->Add({name, value_name, help, false, false, false, candidates}, value);
}

void Arguments::Option(const std::string &name, const std::string &value_name, std::optional<std::string> &value,
                       const std::string &help, Candidates candidates)
{
    parts_->Add({name, value_name, help, false, false, false, candidates}, value);
}

void Arguments::Number(const std::string &name, const std::string &value_name, int &value, const std::string &help,
                       int least, int most)
{
    parts_->Add({name, value_name, help, name[0] != '-', name[0] != '-', false, nullptr}, value)
        ->check(CLI::Range(least, most));
}

void Arguments::Flag(const std::string &name, bool &value, const std::string &help)
{
    parts_->app.add_flag(name, value);
    parts_->texts.push_back({name, "", help, false, false, false, nullptr});
}

void Arguments::Program(std::vector<std::string> &words)
{
    parts_->program = &words;
    parts_->app.prefix_command();
    parts_->texts.push_back({"PROGRAM", "PROGRAM", "the program, then its arguments", true, true, true, nullptr});
}

bool Arguments::Parse(std::vector<std::string> words)
{
    bool help = false;
    parts_->app.add_flag("-h,--help", help);
    std::string wrong;
    try {
        std::reverse(words.begin(), words.end());
        parts_->app.parse(std::move(words));
    } catch (const CLI::ParseError &error) {
        wrong = error.what();
    }
    if (help)
        return false;
    if (wrong.empty() && parts_->program) {
        *parts_->program = parts_->app.remaining();
        if (!parts_->program->empty() && parts_->program->front() == "--")
            parts_->program->erase(parts_->program->begin());
        if (parts_->program->empty())
            wrong = "PROGRAM is required";
    }
    if (!wrong.empty())
        throw UsageFailure("understand the command line", wrong, "see " + parts_->command + " --help");
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
    for (const bool positional : {true, false}) {
        for (const ArgumentText &text : parts_->texts)
            if (text.positional == positional)
                lines.emplace_back(positional || text.value.empty() ? text.name : text.name + " " + text.value,
                                   text.help);
    }
    lines.emplace_back("-h, --help", "this text");
    std::size_t width = 0;
    for (const auto &[name, help] : lines)
        width = std::max(width, name.size());
    std::string text;
    for (const auto &[name, help] : lines)
        text += "  " + name + std::string(width - name.size() + 2, ' ') + help + "\n";
    return text;
}

}  // namespace tavoctl
