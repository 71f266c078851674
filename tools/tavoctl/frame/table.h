// The facts that a verb shows: rows under columns, or the fields of one thing. Both print aligned text and, as the same
// facts, JSON.
#ifndef TAVOCTL_TABLE_H
#define TAVOCTL_TABLE_H

#include "frame/column.h"

#include <optional>
#include <string>
#include <utility>
#include <vector>

namespace tavoctl {

inline constexpr int format_version = 1;  // of every JSON document

struct TableStyle {
    bool headings = true;
    std::vector<std::string> columns = {};  // by name, in this order; empty: those in the list
};

class Table {
  public:
    explicit Table(std::vector<ColumnFacts> columns) : columns_(std::move(columns)) {}
    // A row below another one in a tree, by the index of that one.
    void Add(std::vector<Cell> row, int parent = -1);
    bool Empty() const { return rows_.empty(); }

    std::string Text(const TableStyle &style = {}) const;  // as wide as the terminal, or as it takes
    std::string Csv() const;                               // comma-separated values with a line of the columns' names
    std::string Json(bool one_line = false) const;         // {"format_version": 1, "items": [object, ...]}

  private:
    struct Row {
        std::vector<Cell> cells;
        int parent;
    };
    std::vector<std::size_t> Broken(const std::vector<std::size_t> &shown, bool tree) const;

    std::vector<ColumnFacts> columns_;
    std::vector<Row> rows_;
};

class Record {
  public:
    Record() = default;
    template <class Facts, std::size_t Count>
    Record(const Column<Facts> (&columns)[Count], const Facts &facts)
    {
        for (const Column<Facts> &column : columns)
            Add(column.facts.name, column.read(facts));
    }

    void Add(std::string name, Cell value);

    std::string Text() const;                       // a field a line
    std::string Json(bool one_line = false) const;  // an object

  private:
    std::vector<std::pair<std::string, Cell>> fields_;
};

// A change by a verb: a column of an object.
struct Change {
    std::string object;
    std::string column;
    Cell before;
    Cell after;
};

inline constexpr Column<Change> change_columns[] = {
    {"object", field<&Change::object>, "what is changed"},
    {"column", field<&Change::column>, "which of its facts"},
    {"old", field<&Change::before>, "null where there was none"},
    {"new", field<&Change::after>, "null where there is none any more"},
};

// One entry of a batch.
struct Entry {
    std::string object;
    std::string result;                     // "done", "planned" by a dry run, "unchanged", "failed"
    std::optional<std::string> code, name;  // of the library, for a failure
};

inline constexpr Column<Entry> entry_columns[] = {
    {"object", field<&Entry::object>, "what the entry is about"},
    {"result", field<&Entry::result>, "done, planned (in a dry run), unchanged, or failed"},
    {"code", field<&Entry::code>, "of a failure of the library"},
    {"name", field<&Entry::name>, "of that code"},
};

struct ChangeReport {
    std::vector<Change> changes;
    std::optional<std::vector<Entry>> entries = {};    // of a batch, in its order; a result is set for failures alone
    std::vector<std::pair<std::string, Cell>> chosen;  // ids and the like
    std::string diff;                                  // of the one file that was edited
    bool dry_run;

    bool Changed() const { return !changes.empty() || !diff.empty(); }
    std::string Text() const;
    std::string Json() const;

  private:
    std::string ResultOf(const Entry &entry) const;
};

}  // namespace tavoctl

#endif
