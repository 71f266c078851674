// Text broken between words so that no line is longer than a terminal usually is.
#ifndef TAVOCTL_PARAGRAPH_H
#define TAVOCTL_PARAGRAPH_H

#include <string>
#include <utility>
#include <vector>

namespace tavoctl {

// The first line begins at column, the others after indent blanks.
std::string Paragraph(const std::string &text, std::size_t indent = 0, std::size_t column = 0);

// Names on the left, their meanings on the right.
std::string Described(const std::vector<std::pair<std::string, std::string>> &lines);

}  // namespace tavoctl

#endif
