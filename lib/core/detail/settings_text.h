// Edits of a settings file's whole text. Lines that an edit is not about keep every byte.
#ifndef TAVO_CORE_DETAIL_SETTINGS_TEXT_H
#define TAVO_CORE_DETAIL_SETTINGS_TEXT_H

#include <optional>
#include <string>
#include <string_view>

namespace tavo {

// A line's place in a text, its newline included.
struct LineSpan {
    size_t begin;
    size_t length;
};

std::optional<LineSpan> LineByNumber(std::string_view text, int number);  // from 1
std::optional<LineSpan> LineByKey(std::string_view text, std::string_view key);

// The text with `line` in place of the span, or before it; empty when there is no such span.
std::optional<std::string> WithLine(std::string_view text, std::optional<LineSpan> span, std::string_view line);
std::optional<std::string> WithLineBefore(std::string_view text, std::optional<LineSpan> span, std::string_view line);

// Appends a line; a last line that lacks its newline gets it first, or the two would become one.
void AppendLine(std::string &text, std::string_view line);

// The text with `line` in place of the key's first line, without its later ones; without any, the line is appended.
std::string WithKey(std::string_view text, std::string_view key, std::string_view line);

// A line argument with its newline; empty when it holds another newline.
std::optional<std::string> OneLine(std::string_view argument);

}  // namespace tavo

#endif
