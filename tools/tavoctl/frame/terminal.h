// The terminal, if there is one: what standard output goes to, and the line about long work on standard error.
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

// One line on standard error about long work; nothing when that is not a terminal.
class Progress {
  public:
    explicit Progress(std::string what) : what_(std::move(what)) {}
    ~Progress();  // takes the line away
    Progress(const Progress &) = delete;
    Progress &operator=(const Progress &) = delete;

    static bool Visible();
    // "WHAT: state", in the place of what stood there.
    void Show(const std::string &state);

  private:
    std::string what_;
    bool shown_ = false;
};

}  // namespace tavoctl

#endif
