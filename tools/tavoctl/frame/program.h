// The program: its families and verbs, and the way from a command line to an exit status.
#ifndef TAVOCTL_PROGRAM_H
#define TAVOCTL_PROGRAM_H

#include "frame/verb.h"

#include <memory>
#include <string>
#include <vector>

namespace tavoctl {

struct VerbEntry {
    VerbInfo info;
    std::unique_ptr<Verb> (*make)();
};

class Family {
  public:
    Family(const char *name, const char *purpose) : name_(name), purpose_(purpose) {}

    // NewVerb is a Verb with a static constexpr VerbInfo named info.
    template <class NewVerb>
    void Add()
    {
        verbs_.push_back({NewVerb::info, []() -> std::unique_ptr<Verb> {
                              return std::make_unique<NewVerb>();
                          }});
    }

    const char *Name() const { return name_; }
    const char *Purpose() const { return purpose_; }
    const std::vector<VerbEntry> &Verbs() const { return verbs_; }
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
    const Call &Common() const { return call_; }
    int Run() { return verb_->Run(call_); }

  private:
    std::unique_ptr<Verb> verb_;
    Call call_;
    Arguments arguments_;
};

class Program {
  public:
    Program();

    Family &Add(const char *name, const char *purpose);
    const std::vector<std::unique_ptr<Family>> &Families() const { return families_; }
    const Family *Find(const std::string &name) const;

    int Run(std::vector<std::string> words) const;

  private:
    int RunVerb(const Family &family, const VerbEntry &entry, std::vector<std::string> words) const;
    std::string Help() const;

    std::vector<std::unique_ptr<Family>> families_;
};

std::string FamilyHelp(const Family &family);
std::string VerbHelp(const Family &family, const VerbEntry &entry);

// The man page, in man(7) macros.
std::string ManPage(const Program &program);

// What may stand in the place of the last word, one candidate each.
std::vector<std::string> Complete(const Program &program, std::vector<std::string> words);

}  // namespace tavoctl

#endif
