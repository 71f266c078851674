// A text as its lines.
#ifndef TESTS_SUPPORT_TEXT_LINES_H
#define TESTS_SUPPORT_TEXT_LINES_H

#include "support/test.h"

namespace test {

// Without their newlines. A last line that ends without one counts, too.
inline std::vector<std::string> Lines(const std::string &text)
{
    std::vector<std::string> lines;
    std::istringstream in(text);
    for (std::string line; std::getline(in, line);)
        lines.push_back(line);
    return lines;
}

}  // namespace test

#endif
