// Composes command lines for the shell from fixed formats.
#include "core/detail/shell_command.h"

#include "core/detail/ascii.h"

#include <algorithm>
#include <vector>

namespace tavo {
namespace {

bool IsPlain(char byte)
{
    return IsLetter(byte) || IsDigit(byte) || std::string_view("_@%+=:,./-").find(byte) != std::string_view::npos;
}

// Quotes text for the space between two single quotes: a quote ends the first pair, is escaped, and opens another.
std::string WithinQuotes(std::string_view text)
{
    std::string quoted;
    for (const char byte : text) {
        if (byte == '\'')
            quoted += "'\\''";
        else
            quoted += byte;
    }
    return quoted;
}

class CommandLine final : public TextWriter {
  public:
    CommandLine(std::initializer_list<TextArg> args, std::initializer_list<bool> composed)
    {
        for (size_t i = 0; i < args.size(); ++i) {
            if (args.begin()[i].IsText())
                composed_.push_back(composed.begin()[i]);
        }
    }

    void Literal(std::string_view piece) override
    {
        if (std::count(piece.begin(), piece.end(), '\'') % 2 != 0)
            in_quotes_ = !in_quotes_;
        text_ += piece;
    }

    void Argument(std::string_view text) override
    {
        if (next_ < composed_.size() && composed_[next_++]) {
            text_ += text;
            return;
        }
        if (text.starts_with('-') || text.find('\0') != std::string_view::npos)
            refused_ = true;
        text_ += in_quotes_ ? WithinQuotes(text) : ShellQuoted(text);
    }

    std::optional<std::string> Take() { return refused_ ? std::nullopt : std::optional(std::move(text_)); }

  private:
    std::string text_;
    std::vector<bool> composed_;  // of each text argument
    size_t next_ = 0;
    bool in_quotes_ = false;
    bool refused_ = false;
};

}  // namespace

std::string ShellQuoted(std::string_view text)
{
    if (!text.empty() && std::all_of(text.begin(), text.end(), IsPlain))
        return std::string(text);
    return "'" + WithinQuotes(text) + "'";
}

std::optional<std::string> ComposeShellCommand(const char *format, std::initializer_list<TextArg> args,
                                               std::initializer_list<bool> composed)
{
    CommandLine line(args, composed);
    FormatText(line, format, args);
    return line.Take();
}

}  // namespace tavo
