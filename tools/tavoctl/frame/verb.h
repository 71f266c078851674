// Commands: `tavoctl FAMILY VERB`.
//
// A verb is a function that declares its arguments and returns the action for them:
//
//     Action ConfGet(Arguments &in)
//     {
//         const auto key = in.Text("KEY", setting_key, "the name of the setting");
//         const auto last = in.Flag("--last", "of a repeated key, the last value");
//         return [=](Call &call) {
//             call.Value(setting.value, setting_columns, setting);
//         };
//     }
//
// It is registered with its effect on the machine, its answer and its texts:
//
//     conf.Add("get", reads, Answer::One(setting_columns), ConfGet, R"(Prints the value of KEY.
//
//     tavoctl conf get runsamba)");
//
// docs/tavoctl.md has the whole of it. This header brings all that it takes: arguments, columns, tables and failures.
#ifndef TAVOCTL_VERB_H
#define TAVOCTL_VERB_H

#include "frame/arguments.h"
#include "frame/failure.h"
#include "frame/table.h"

#include <functional>
#include <string>
#include <vector>

namespace tavoctl {

// The effect of a verb on the machine. It decides which common options the verb has and who may call it.
enum Trait : unsigned {
    reads = 0,
    changes = 1,        // root only; --force-host: refused where the machine is not an appliance; --dry-run
    destroys = 4,       // --yes: asks first
    by_anybody = 8,     // changes only what its caller may change anyway
    runs_program = 16,  // its answer is that of a program of the caller's
};

// The JSON answer of a verb.
struct Answer {
    enum Form { nothing, one, list, document, change, own } form = nothing;
    std::vector<ColumnFacts> columns = {};
    std::vector<ColumnFacts> or_one = {};  // a list verb that can also show one thing
    std::string (*schema)() = nullptr;     // of a JSON document of the verb's own
    const char *page = "";                 // of the manual that describes it
    bool has_entries = false;              // a change that says what became of each entry of a batch

    template <class Facts_, std::size_t Count>
    static Answer One(const Column<Facts_> (&columns)[Count])
    {
        return {one, Facts(columns), {}};
    }
    template <class Facts_, std::size_t Count>
    static Answer List(const Column<Facts_> (&columns)[Count])
    {
        return {list, Facts(columns), {}};
    }
    // A list that goes to a file or another program rather than to a terminal.
    template <class Facts_, std::size_t Count>
    static Answer Document(const Column<Facts_> (&columns)[Count])
    {
        return {document, Facts(columns), {}};
    }
    template <class Facts_, std::size_t Count>
    Answer OrOne(const Column<Facts_> (&columns_of_one)[Count]) const
    {
        return {form, columns, Facts(columns_of_one)};
    }
    static Answer Own(std::string (*schema)(), const char *page) { return {own, {}, {}, schema, page}; }
    // A change of several things, each with its own result.
    static Answer Batch() { return {.form = change, .has_entries = true}; }
    static Answer Nothing() { return {nothing, {}, {}}; }
};

// How the verb was called: the common options, and how it answers.
struct Call {
    bool json = false;
    bool dry_run = false;
    bool yes = false;
    bool force_host = false;
    bool verbose = false;
    TableStyle style = {};

    int status = exit_done;
    ChangeReport report = {};

    // To standard output: as a table, or as JSON with --json.
    template <class Facts_, std::size_t Count>
    void List(const Column<Facts_> (&columns)[Count], const std::vector<Facts_> &records) const
    {
        Print(TableOf(columns, records));
    }
    template <class Facts_, std::size_t Count>
    void One(const Column<Facts_> (&columns)[Count], const Facts_ &record) const
    {
        Print(Record(columns, record));
    }
    // One value for scripts: unchanged, but printable when it goes to a terminal. The record has the same value in
    // JSON.
    template <class Facts_, std::size_t Count>
    void Value(const std::string &value, const Column<Facts_> (&columns)[Count], const Facts_ &record) const
    {
        PrintValue(value, Record(columns, record));
    }

    // Facts that take long to find out are read only for chosen columns.
    template <class Facts_, std::size_t Count>
    Table TableOf(const Column<Facts_> (&columns)[Count], const std::vector<Facts_> &records) const
    {
        Table table(Facts(columns));
        for (const Facts_ &record : records)
            table.Add(Mapped(columns, [&](const Column<Facts_> &column) {
                return IsWanted(column.facts) ? column.read(record) : Cell();
            }));
        return table;
    }

    // The columns in which an object is going to differ; where it is not there yet, or will not be, all that it has.
    template <class Facts_, std::size_t Count>
    void Compare(const std::string &object, const Column<Facts_> (&columns)[Count], const std::optional<Facts_> &before,
                 const std::optional<Facts_> &after)
    {
        for (const Column<Facts_> &column : columns)
            if (column.facts.place != in_one)
                Change(object, column.facts.name, before ? column.read(*before) : Cell(),
                       after ? column.read(*after) : Cell());
    }
    void Change(const std::string &object, const std::string &column, const Cell &before, const Cell &after);
    // An entry of a batch, whose result the JSON tells. One that fails does not keep the others from being done: its
    // changes go, its failure has a line on standard error, and the first failure is the exit status.
    void BeginEntry(const std::string &object);
    void FailEntry(const std::string &object, const Failure &failure);

    // To standard error: as text, or as JSON with --json.
    void Print(const Failure &failure) const;

    // Records a chosen value, such as an id; a field of the JSON beside "changed".
    void Tell(const std::string &name, const Cell &value) { report.chosen.emplace_back(name, value); }

    // Returns whether there is something to do: not with --dry-run, and not when nothing was going to change. Asks the
    // question as Confirm does.
    bool Proceed(const std::string &question = {}) const;

    // Asks "QUESTION [y/N]" unless --yes was given; throws a Failure unless the answer is yes, or when there is no
    // terminal.
    void Confirm(const std::string &question) const;

    void Print(const Table &table) const;
    void Print(const Record &record) const;
    // For people alone: facts of the whole above a list.
    void Print(const Record &record, const Table &table) const;
    void PrintValue(const std::string &value, const Record &record) const;

  private:
    bool IsWanted(const ColumnFacts &column) const;
};

// Throws a Failure.
using Action = std::function<void(Call &)>;

}  // namespace tavoctl

#endif
