// Edits of a settings file's whole text. All other lines keep every byte.
#ifndef TAVO_CORE_DETAIL_SETTINGS_TEXT_H
#define TAVO_CORE_DETAIL_SETTINGS_TEXT_H

#include <optional>
#include <string>
#include <string_view>

namespace tavo {

// A line's place in a text, including its newline.
struct LineSpan {
    size_t begin;
    size_t length;
};

std::optional<LineSpan> LineByNumber(std::string_view text, int number);  // from 1
std::optional<LineSpan> LineByKey(std::string_view text, std::string_view key);

// Returns the text with `line` in place of the span, or before it; empty when there is no such span.
std::optional<std::string> WithLine(std::string_view text, std::optional<LineSpan> span, std::string_view line);
std::optional<std::string> WithLineBefore(std::string_view text, std::optional<LineSpan> span, std::string_view line);

// Appends a line. A last line without its newline gets it first; otherwise the two would become one.
void AppendLine(std::string &text, std::string_view line);

// Returns the text with `line` in place of the key's first line and without its later ones; without any, the line is
// appended.
std::string WithKey(std::string_view text, std::string_view key, std::string_view line);

// Returns a line argument with its newline; empty when it contains another newline.
std::optional<std::string> OneLine(std::string_view argument);

}  // namespace tavo

#endif
