// What a command is: `tavoctl FAMILY VERB`.
#ifndef TAVOCTL_VERB_H
#define TAVOCTL_VERB_H

#include "frame/arguments.h"
#include "frame/exit_status.h"

#include <string>

namespace tavoctl {

class Record;
class Table;

// What a verb does to the machine; this decides which of the common options it has.
enum Trait : unsigned {
    reads = 0,
    changes = 1,       // --force-host: refused where the machine is no appliance
    tells_before = 2,  // --dry-run: shows what it would change
    destroys = 4,      // --yes: asks first
};

struct VerbInfo {
    const char *name;  // "" for a family that is one command
    unsigned traits;
    const char *purpose;   // a sentence or more, without a line feed at the end
    const char *examples;  // a command a line
};

// How the verb was called: the common options, and how it answers.
struct Call {
    bool json = false;
    bool dry_run = false;
    bool yes = false;
    bool force_host = false;

    // To standard output: as a table, or as JSON with --json.
    void Print(const Table &table) const;
    void Print(const Record &record) const;
    // One value for scripts: as it is, and printable when it goes to a terminal. The record says the same in JSON.
    void PrintValue(const std::string &value, const Record &record) const;

    // Asks "QUESTION [y/N]" unless --yes was given; throws a Failure when the answer is no or nobody can be asked.
    void Confirm(const std::string &question) const;
};

class Verb {
  public:
    Verb() = default;
    virtual ~Verb() = default;
    Verb(const Verb &) = delete;
    Verb &operator=(const Verb &) = delete;

    virtual void Declare(Arguments &) {}
    // Returns the exit status; throws a Failure. It is silent where it has only succeeded.
    virtual int Run(const Call &call) = 0;
};

}  // namespace tavoctl

#endif
