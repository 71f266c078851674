// The steps that restore parts of the network, as data.
#include "network/detail/undo_step.h"

#include "core/detail/strict_number.h"
#include "core/detail/text_fields.h"

namespace tavo {
namespace {

constexpr std::string_view kUndoEnd = "end\n";  // of a record that was written to its end
constexpr std::string_view kUndoKinds = "fFosSOhcarewdnk";

bool TakePart(std::string_view &text, std::string_view length, std::string &part)
{
    const auto size = StrictNumber<size_t>(length);
    if (!size || *size > text.size())
        return false;
    part = text.substr(0, *size);
    text.remove_prefix(*size);
    return true;
}

}  // namespace

std::string UndoText(const std::vector<UndoStep> &steps)
{
    std::string text;
    for (const UndoStep &step : steps) {
        text += {step.kind, ' ', step.after_death ? '1' : '0'};
        for (const std::string *part : {&step.target, &step.value, &step.more})
            text += ' ' + std::to_string(part->size());
        text += '\n' + step.target + step.value + step.more + '\n';
    }
    return text.append(kUndoEnd);
}

std::optional<std::vector<UndoStep>> ParseUndo(std::string_view text)
{
    std::vector<UndoStep> steps;
    while (text != kUndoEnd) {
        const auto field = SplitFields(TakeLine(text));
        if (field.size() != 5 || field[0].size() != 1 || kUndoKinds.find(field[0]) == std::string_view::npos)
            return std::nullopt;
        UndoStep step{static_cast<UndoStep::Kind>(field[0][0]), {}, {}, {}, field[1] == "1"};
        if (!TakePart(text, field[2], step.target) || !TakePart(text, field[3], step.value) ||
            !TakePart(text, field[4], step.more) || !text.starts_with('\n'))
            return std::nullopt;
        text.remove_prefix(1);
        steps.push_back(std::move(step));
    }
    return steps;
}

}  // namespace tavo
