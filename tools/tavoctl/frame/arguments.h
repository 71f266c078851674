// The arguments and options of one verb: declared and read in one place, used for parsing, the help text, the man page
// and completion.
#ifndef TAVOCTL_ARGUMENTS_H
#define TAVOCTL_ARGUMENTS_H

#include <cstdint>
#include <limits>
#include <memory>
#include <optional>
#include <string>
#include <vector>

namespace tavoctl {

// Names that may be given; for completion.
using Candidates = std::vector<std::string> (*)();

// The valid values of an argument, checked before a verb runs, so that a message names a wrong one and the allowed
// values.
struct ArgumentKind {
    const char *name = "text";                     // for programs, in the list of verbs
    const char *allowed = "";                      // completes "allowed: "
    bool (*valid)(const std::string &) = nullptr;  // nullptr: any text is
    Candidates candidates = nullptr;               // nullptr: file names
    int code = 0;                                  // the library's code for a wrong one; 0: none
    const char *sample = "x";                      // a valid one, of something that is not there
    const char *wrong = nullptr;                   // one that is not valid; nullptr where there is none
};

inline constexpr ArgumentKind any_text = {};
inline constexpr ArgumentKind file_path = {.name = "file", .sample = "/no/such/file"};

// The declaration of one argument ("KEY") or option ("--file").
struct ArgumentText {
    std::string name;
    std::string value;  // the name of the value, "" for a flag
    std::string help;
    bool positional;
    bool required;
    bool many;
    ArgumentKind kind;
    std::vector<std::string> choices;  // when nothing else is allowed
    std::string sample;                // a valid one
};

// The value of an argument, once the command line was read.
template <class Value>
class Given {
  public:
    explicit Given(Value initial = {}) : value_(std::make_shared<Value>(std::move(initial))) {}
    const Value &operator*() const { return *value_; }
    const Value *operator->() const { return value_.get(); }
    void Set(Value value) const { *value_ = std::move(value); }

  private:
    std::shared_ptr<Value> value_;
};

using Words = std::vector<std::string>;
inline constexpr int64_t most_seconds = std::numeric_limits<int32_t>::max();

// A name that begins with "--" is an option, any other an argument by its place.
class Arguments {
  public:
    explicit Arguments(std::string command);  // "tavoctl conf set"
    ~Arguments();
    Arguments(const Arguments &) = delete;
    Arguments &operator=(const Arguments &) = delete;

    Given<std::string> Text(const char *name, const ArgumentKind &kind, std::string help);
    Given<std::optional<std::string>> OptionalText(const char *name, const ArgumentKind &kind, std::string help);
    // From at_least values on; they are the last arguments by place.
    Given<Words> Texts(const char *name, const ArgumentKind &kind, std::string help, int at_least = 1);
    Given<std::optional<std::string>> Option(const char *name, const char *value_name, const ArgumentKind &kind,
                                             std::string help);
    // One of these words.
    Given<std::string> Choice(const char *name, Words choices, std::string help);
    Given<std::optional<std::string>> OptionalChoice(const char *name, const char *value_name, Words choices,
                                                     std::string help);
    // A required argument, or an option.
    Given<std::optional<int64_t>> Number(const char *name, const char *value_name, std::string help, int64_t least = 0,
                                         int64_t most = most_seconds);
    Given<bool> Flag(const char *name, std::string help);
    // A program with its own arguments: everything from the first word on that the declarations before do not take.
    Given<Words> Program();

    // Throws a Failure for a wrong command line. False: help was asked for and nothing is to be done.
    bool Parse(Words words);

    const std::vector<ArgumentText> &Texts() const;
    std::string Usage() const;  // "tavoctl conf set [OPTION]... KEY VALUE"
    std::string Help() const;   // the options and arguments, described

  private:
    struct Parts;
    std::unique_ptr<Parts> parts_;
};

}  // namespace tavoctl

#endif
