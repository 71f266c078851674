// The program: its families and verbs, and the way from a command line to an exit status.
#ifndef TAVOCTL_PROGRAM_H
#define TAVOCTL_PROGRAM_H

#include "frame/verb.h"

#include <string_view>

namespace tavoctl {

struct VerbEntry {
    std::string name;  // "" for a family that is one command
    unsigned traits;
    Answer answer;
    std::string purpose;
    std::string examples;  // a command a line
    Action (*declare)(Arguments &);

    std::string Summary() const;  // the first sentence, without its full stop
    bool ReportsChanges() const { return answer.form == Answer::change; }
};

class Family {
  public:
    Family(const char *name, const char *purpose) : name_(name), purpose_(purpose) {}

    // The text is what the verb does, an empty line, and examples, a command a line.
    void Add(const char *name, unsigned traits, Answer answer, Action (*declare)(Arguments &), std::string_view text);
    // A verb that answers with what it has changed.
    void Add(const char *name, unsigned traits, Action (*declare)(Arguments &), std::string_view text)
    {
        Add(name, traits, {.form = Answer::change}, declare, text);
    }

    const char *Name() const { return name_; }
    const char *Purpose() const { return purpose_; }
    const std::vector<VerbEntry> &Verbs() const { return verbs_; }
    std::vector<std::string> VerbNames() const;
    const VerbEntry *Find(const std::string &name) const;
    // "tavoctl conf set"
    std::string Command(const VerbEntry &verb) const;

  private:
    const char *name_;
    const char *purpose_;
    std::vector<VerbEntry> verbs_;
};

// A verb ready to be parsed: its own arguments and the common options that its traits give it.
class ReadyVerb {
  public:
    ReadyVerb(const Family &family, const VerbEntry &entry);

    Arguments &Declared() { return arguments_; }
    const Arguments &Declared() const { return arguments_; }
    // The common options, once the arguments are parsed.
    Call Called() const;
    const std::optional<std::string> &Output() const { return *output_; }
    const Action &Run() const { return action_; }

  private:
    Arguments arguments_;
    Action action_;
    Given<bool> json_, dry_run_, yes_, force_host_, verbose_, no_headings_;
    Given<std::optional<std::string>> output_;
};

class Program {
  public:
    Program();

    Family &Add(const char *name, const char *purpose);
    const std::vector<std::unique_ptr<Family>> &Families() const { return families_; }
    std::vector<std::string> FamilyNames() const;
    const Family *Find(const std::string &name) const;

    int Run(std::vector<std::string> words) const;

  private:
    int RunVerb(const Family &family, const VerbEntry &entry, std::vector<std::string> words) const;
    bool RunForTools(const std::vector<std::string> &words) const;
    std::string Help() const;

    std::vector<std::unique_ptr<Family>> families_;
};

std::string FamilyHelp(const Family &family);
std::string VerbHelp(const Family &family, const VerbEntry &entry);

// The man page, in man(7) macros: of the program, or of one family.
std::string ManPage(const Program &program);
std::string ManPage(const Family &family);
// The pages of all families into a folder, tavoctl-conf.1 and so on.
void WriteManPages(const Program &program, const std::string &folder);

// The candidates for the last word.
std::vector<std::string> Complete(const Program &program, std::vector<std::string> words);

// The JSON Schema of a verb's answer, or of a failure for no verb.
std::string SchemaOf(const Family *family, const VerbEntry *entry);
// Of an object with some of these columns, at least the required ones.
std::string SchemaOfRecord(const std::vector<ColumnFacts> &columns, const std::vector<std::string> &required);
// Writes all of them into a folder, a file each: conf-get.json, error.json.
void WriteSchemas(const Program &program, const std::string &folder);

// The verbs with their traits and arguments as JSON.
std::string RegistryJson(const Program &program);

// The part of the manual that lists the verbs and the fields of their answers.
std::string ManualText(const Program &program);

}  // namespace tavoctl

#endif
