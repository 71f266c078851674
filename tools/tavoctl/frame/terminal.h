// The terminal that standard output goes to, if it is one.
#ifndef TAVOCTL_TERMINAL_H
#define TAVOCTL_TERMINAL_H

#include <string>

namespace tavoctl {

class Terminal {
  public:
    // Columns of the terminal; 0 where standard output is not one, and nothing limits a line.
    static int Width();

    // Colours are for people: never off a terminal, nor where NO_COLOR is set.
    static bool HasColours();

    // Text of every language has a width only where LC_CTYPE is a UTF-8 locale.
    static void UseUtf8();

    // Prints the text, through $PAGER when it is longer than the terminal is high.
    static void Page(const std::string &text);
};

}  // namespace tavoctl

#endif
