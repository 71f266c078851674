// The facts that a reading verb shows: rows under columns, or the fields of one thing. Both print aligned text and, as
// the same facts, JSON.
#ifndef TAVOCTL_TABLE_H
#define TAVOCTL_TABLE_H

#include <cstdint>
#include <string>
#include <utility>
#include <variant>
#include <vector>

namespace tavoctl {

// A size: "465.8 GiB" in a table, the number of bytes in JSON.
struct Bytes {
    uint64_t count;
};

// One fact. The monostate is "not known": "-" in a table, null in JSON.
class Cell {
  public:
    Cell() = default;
    Cell(std::string text) : value_(std::move(text)) {}
    Cell(const char *text) : value_(std::string(text)) {}
    Cell(int number) : value_(int64_t{number}) {}
    Cell(int64_t number) : value_(number) {}
    Cell(bool truth) : value_(truth) {}
    Cell(Bytes bytes) : value_(bytes) {}
    Cell(std::vector<std::string> texts) : value_(std::move(texts)) {}

    bool IsNumber() const { return std::holds_alternative<int64_t>(value_) || std::holds_alternative<Bytes>(value_); }
    std::string Text() const;  // printable
    std::string Csv() const;   // byte for byte; quoted where that is needed
    const auto &Value() const { return value_; }

  private:
    std::variant<std::monostate, std::string, int64_t, bool, Bytes, std::vector<std::string>> value_;
};

// A text that is empty when it is not known.
inline Cell Known(const std::string &text)
{
    return text.empty() ? Cell() : Cell(text);
}

class Table {
  public:
    // The columns by their JSON names; the heading is that name in capitals.
    explicit Table(std::vector<std::string> columns) : columns_(std::move(columns)) {}

    void Add(std::vector<Cell> row) { rows_.push_back(std::move(row)); }
    bool Empty() const { return rows_.empty(); }

    std::string Text() const;  // numbers to the right; nothing at all without rows
    std::string Csv() const;   // comma-separated values with a line of the columns' names
    std::string Json() const;  // an array of objects

  private:
    std::vector<std::string> columns_;
    std::vector<std::vector<Cell>> rows_;
};

class Record {
  public:
    void Add(std::string name, Cell value);

    std::string Text() const;  // a field a line
    std::string Json() const;  // an object

  private:
    std::vector<std::pair<std::string, Cell>> fields_;
};

}  // namespace tavoctl

#endif
