// The arguments and options of one verb: declared once, used for parsing, the help text, the man page and completion.
#ifndef TAVOCTL_ARGUMENTS_H
#define TAVOCTL_ARGUMENTS_H

#include <limits>
#include <memory>
#include <optional>
#include <string>
#include <vector>

namespace tavoctl {

// Names that may stand at a place; for completion only.
using Candidates = std::vector<std::string> (*)();

// What the declarations say of one argument ("KEY") or option ("--file").
struct ArgumentText {
    std::string name;
    std::string value;  // the name of the value, "" for a flag
    std::string help;
    bool positional;
    bool required;
    bool many;
    Candidates candidates;
};

// A name that begins with "--" is an option, any other an argument by its place. The variables keep their values where
// an option is not given, and must outlive Parse.
class Arguments {
  public:
    explicit Arguments(std::string command);  // "tavoctl conf set"
    ~Arguments();
    Arguments(const Arguments &) = delete;
    Arguments &operator=(const Arguments &) = delete;

    void Text(const std::string &name, std::string &value, const std::string &help, Candidates candidates = nullptr);
    void OptionalText(const std::string &name, std::string &value, const std::string &help,
                      Candidates candidates = nullptr);
    // From at_least values on; they are the last arguments by place.
    void Texts(const std::string &name, std::vector<std::string> &values, const std::string &help, int at_least = 1,
               Candidates candidates = nullptr);
    // An option that takes a value of this name.
    void Option(const std::string &name, const std::string &value_name, std::string &value, const std::string &help,
                Candidates candidates = nullptr);
    // Nothing when it is not given, which is not the same as an empty text.
    void Option(const std::string &name, const std::string &value_name, std::optional<std::string> &value,
                const std::string &help, Candidates candidates = nullptr);
    void Number(const std::string &name, const std::string &value_name, int &value, const std::string &help,
                int least = 0, int most = std::numeric_limits<int>::max());
    void Flag(const std::string &name, bool &value, const std::string &help);
    // A program with its own arguments: everything from the first word on that is not taken by the declarations before.
    void Program(std::vector<std::string> &words);

    // Throws a Failure for a wrong command line. False: help was asked for and nothing is to be done.
    bool Parse(std::vector<std::string> words);

    const std::vector<ArgumentText> &Texts() const;
    std::string Usage() const;  // "tavoctl conf set [OPTIONS] KEY VALUE"
    std::string Help() const;   // the options and arguments, described

  private:
    struct Parts;
    std::unique_ptr<Parts> parts_;
};

}  // namespace tavoctl

#endif
