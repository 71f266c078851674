// A record's columns, declared once: the table on the terminal, the JSON, its schema and the manual come from them.
#ifndef TAVOCTL_COLUMN_H
#define TAVOCTL_COLUMN_H

#include "frame/lists.h"

#include <concepts>
#include <cstdint>
#include <optional>
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
    using Value = std::variant<std::monostate, std::string, int64_t, bool, Bytes, std::vector<std::string>>;

    Cell() = default;
    Cell(std::string text);
    Cell(const char *text);
    Cell(bool truth) : value_(truth) {}
    Cell(Bytes bytes) : value_(bytes) {}
    Cell(std::vector<std::string> texts);
    template <std::integral Number>
    Cell(Number number) : value_(static_cast<int64_t>(number))
    {
    }
    template <class Known>
    Cell(const std::optional<Known> &known)
    {
        if (known)
            value_ = Cell(*known).value_;
    }

    bool IsNumber() const { return std::holds_alternative<int64_t>(value_) || std::holds_alternative<Bytes>(value_); }
    std::string Text() const;  // printable
    std::string Csv() const;   // byte for byte; quoted where that is needed
    const Value &Get() const { return value_; }
    bool operator==(const Cell &other) const { return Csv() == other.Csv(); }

  private:
    Value value_;
};

// A text that is not known when it is empty.
inline std::optional<std::string> Maybe(std::string text)
{
    return text.empty() ? std::nullopt : std::optional(std::move(text));
}

// An id: the library's records have signed ones.
inline uint32_t Id(int32_t id)
{
    return static_cast<uint32_t>(id);
}

enum class Kind : unsigned char { text, number, truth, bytes, texts, any };

// Where a column is shown. Each place includes those after it.
enum Place : unsigned char {
    in_list,     // in the table of a list
    in_details,  // only in JSON, with --output, and in the details of one thing
    in_one,      // only with --output and in the details of one thing: it takes long to find out
};

struct ColumnFacts {
    const char *name;   // in JSON; the heading is the same in capitals
    const char *about;  // for the schema and the manual; may be empty where the name says it
    Kind kind;
    bool maybe;  // may be null
    Place place;
    const char *unit;  // "" for none
};

template <class Value>
struct KindOf {
    static constexpr Kind kind = std::same_as<Value, bool>                       ? Kind::truth
                                 : std::integral<Value>                          ? Kind::number
                                 : std::same_as<Value, Bytes>                    ? Kind::bytes
                                 : std::same_as<Value, std::vector<std::string>> ? Kind::texts
                                 : std::same_as<Value, Cell>                     ? Kind::any
                                                                                 : Kind::text;
    static constexpr bool maybe = false;
};
template <class Value>
struct KindOf<std::optional<Value>> {
    static constexpr Kind kind = KindOf<Value>::kind;
    static constexpr bool maybe = true;
};

// {"uid", field<&User::uid>, "the user id"}: the type in JSON is that of what the reader returns.
template <class Record>
struct Column {
    template <class Reader>
    constexpr Column(const char *name, Reader, const char *about = "", Place place = in_list, const char *unit = "")
        : facts{name,
                about,
                KindOf<std::decay_t<std::invoke_result_t<Reader, const Record &>>>::kind,
                KindOf<std::decay_t<std::invoke_result_t<Reader, const Record &>>>::maybe,
                place,
                unit},
          read([](const Record &record) { return Cell(Reader{}(record)); })
    {
    }

    ColumnFacts facts;
    Cell (*read)(const Record &);
};

// Reads a member of the record.
template <auto member>
struct Field {
    constexpr const auto &operator()(const auto &record) const { return record.*member; }
};
template <auto member>
inline constexpr Field<member> field = {};

template <class Record, std::size_t Count>
std::vector<ColumnFacts> Facts(const Column<Record> (&columns)[Count])
{
    return Mapped(columns, &Column<Record>::facts);
}

template <class Record, std::size_t Count>
std::vector<std::string> Names(const Column<Record> (&columns)[Count])
{
    return Mapped<std::string>(columns, [](const Column<Record> &column) { return column.facts.name; });
}

}  // namespace tavoctl

#endif
