// Text broken between words.
#include "frame/paragraph.h"

#include <algorithm>
#include <sstream>

namespace tavoctl {
namespace {

constexpr std::size_t line_width = 80;
constexpr std::size_t widest_name = 24;

}  // namespace

std::string Paragraph(const std::string &text, std::size_t indent, std::size_t column)
{
    std::string lines;
    bool begins = true;
    std::istringstream words(text);
    for (std::string word; words >> word; begins = false) {
        const bool breaks = !begins && column + 1 + word.size() > line_width;
        lines += (breaks ? "\n" + std::string(indent, ' ') : begins ? "" : " ") + word;
        column = (breaks ? indent : begins ? column : column + 1) + word.size();
    }
    return lines + "\n";
}

std::string Described(const std::vector<std::pair<std::string, std::string>> &lines)
{
    std::size_t width = 0;
    for (const auto &[name, about] : lines)
        width = std::max(width, std::min(name.size(), widest_name));
    std::string text;
    for (const auto &[name, about] : lines) {
        const std::size_t indent = width + 4;
        text += "  " + name;
        text += name.size() > width ? "\n" + std::string(indent, ' ') : std::string(indent - 2 - name.size(), ' ');
        text += Paragraph(about, indent, indent);
    }
    return text;
}

}  // namespace tavoctl
