// Aligned text and JSON from the same facts.
#include "frame/table.h"

#include "frame/containers.h"
#include "frame/json_document.h"
#include "frame/terminal.h"
#include "frame/text.h"

#include <nlohmann/json.hpp>

#include <algorithm>
#include <cctype>
#include <cstdio>
#include <cstdlib>
#include <cwchar>
#include <iterator>
#include <memory>
#include <new>

#include <libsmartcols.h>

namespace tavoctl {
namespace {

constexpr char column_separator[] = "  ";

std::string Heading(std::string name)
{
    for (char &c : name)
        c = c == '_' ? ' ' : static_cast<char>(std::toupper(static_cast<unsigned char>(c)));
    return name;
}

std::string Readable(Bytes bytes)
{
    constexpr const char *units[] = {"B", "KiB", "MiB", "GiB", "TiB", "PiB"};
    auto value = static_cast<double>(bytes.count);
    std::size_t unit = 0;
    for (; value >= 1024 && unit + 1 < std::size(units); ++unit)
        value /= 1024;
    char text[32];
    std::snprintf(text, sizeof text, unit == 0 ? "%.0f %s" : "%.1f %s", value, units[unit]);
    return text;
}

nlohmann::ordered_json NewDocument()
{
    return {{"format_version", format_version}};
}

// Bytes that are not UTF-8 show as the replacement character.
std::string Dump(const nlohmann::ordered_json &facts, bool one_line = false)
{
    return facts.dump(one_line ? -1 : 2, ' ', true, nlohmann::ordered_json::error_handler_t::replace);
}

// Words about health that are worth a colour.
const char *ColourOf(const std::string &word)
{
    constexpr std::pair<const char *, const char *> colours[] = {
        {"normal", "green"}, {"good", "green"},  {"degraded", "yellow"}, {"standby", "cyan"},
        {"failing", "red"},  {"crashed", "red"}, {"failed", "red"},      {"foreign", "yellow"},
    };
    for (const auto &[known, colour] : colours)
        if (word == known)
            return colour;
    return nullptr;
}

// Columns of a terminal that a text takes.
std::size_t WidthOf(const std::string &text)
{
    std::wstring wide(text.size(), L'\0');
    const std::size_t count = std::mbstowcs(wide.data(), text.c_str(), wide.size());
    const int width = count <= wide.size() ? ::wcswidth(wide.data(), count) : -1;
    return width >= 0 ? static_cast<std::size_t>(width) : text.size();
}

// A table of libsmartcols that is as wide as the terminal.
class Grid {
  public:
    Grid() : table_(scols_new_table())
    {
        if (!table_)
            throw std::bad_alloc();
        scols_table_enable_noencoding(table_.get(), 1);  // every text is printable already
        scols_table_set_column_separator(table_.get(), column_separator);
        scols_table_enable_colors(table_.get(), Terminal::HasColours());
        const int width = Terminal::Width();
        scols_table_set_termforce(table_.get(), width ? SCOLS_TERMFORCE_ALWAYS : SCOLS_TERMFORCE_NEVER);
        if (width)
            scols_table_set_termwidth(table_.get(), static_cast<std::size_t>(width));
    }

    void HideHeadings() { scols_table_enable_noheadings(table_.get(), 1); }

    void AddColumn(const std::string &heading, int flags)
    {
        if (!scols_table_new_column(table_.get(), heading.c_str(), 0, flags))
            throw std::bad_alloc();
    }

    libscols_line *AddLine(libscols_line *parent = nullptr)
    {
        libscols_line *line = scols_table_new_line(table_.get(), parent);
        if (!line)
            throw std::bad_alloc();
        return line;
    }

    static void Set(libscols_line *line, std::size_t column, const std::string &text)
    {
        if (scols_line_set_data(line, column, text.c_str()) != 0)
            throw std::bad_alloc();
        if (const char *colour = ColourOf(text))
            scols_cell_set_color(scols_line_get_cell(line, column), colour);
    }

    std::string Text() const
    {
        char *text = nullptr;
        if (scols_print_table_to_string(table_.get(), &text) != 0)
            throw std::bad_alloc();
        const std::unique_ptr<char, decltype(&std::free)> owner(text, std::free);
        std::string whole = text ? text : "";
        if (!whole.empty() && !whole.ends_with('\n'))
            whole += '\n';
        return whole;
    }

  private:
    std::unique_ptr<libscols_table, By<scols_unref_table>> table_;
};

}  // namespace

// Not in the header: there the compiler for 32-bit ARM warns of parts of the fact that its kind does not have.
Cell::Cell(std::string text) : value_(std::move(text))
{
}
Cell::Cell(const char *text) : value_(std::string(text))
{
}
Cell::Cell(std::vector<std::string> texts) : value_(std::move(texts))
{
}

std::string Cell::Text() const
{
    if (const auto *text = std::get_if<std::string>(&value_))
        return Printable(*text);
    if (const auto *number = std::get_if<int64_t>(&value_))
        return std::to_string(*number);
    if (const auto *truth = std::get_if<bool>(&value_))
        return *truth ? "yes" : "no";
    if (const auto *bytes = std::get_if<Bytes>(&value_))
        return Readable(*bytes);
    if (const auto *texts = std::get_if<std::vector<std::string>>(&value_))
        return texts->empty() ? "-" : Printable(Joined(*texts, ","));
    return "-";
}

std::string Cell::Csv() const
{
    std::string text;
    if (const auto *plain = std::get_if<std::string>(&value_))
        text = *plain;
    else if (const auto *texts = std::get_if<std::vector<std::string>>(&value_))
        text = Joined(*texts, ",");
    else if (const auto *bytes = std::get_if<Bytes>(&value_))
        text = std::to_string(bytes->count);
    else if (!std::holds_alternative<std::monostate>(value_))
        text = Text();
    if (text.find_first_of(",\"\r\n") == std::string::npos)
        return text;
    std::string quoted = "\"";
    for (const char c : text)
        quoted += c == '"' ? std::string("\"\"") : std::string(1, c);
    return quoted + "\"";
}

void Table::Add(std::vector<Cell> row, int parent)
{
    rows_.push_back({std::move(row), parent});
}

// As few columns with free text as it takes for the table to fit the terminal, the widest first: a name or a code is hard
// to read on two lines.
std::vector<std::size_t> Table::Broken(const std::vector<std::size_t> &shown, bool tree) const
{
    constexpr std::size_t separator = std::size(column_separator) - 1;
    constexpr std::size_t enough = 16;
    std::vector<std::pair<std::size_t, std::size_t>> free;  // width and column
    std::size_t total = 0;
    for (const std::size_t i : shown) {
        std::size_t width = Heading(columns_[i].name).size();
        for (const Row &row : rows_)
            width = std::max(width, WidthOf(row.cells[i].Text()));
        total += width + separator;
        const Kind kind = columns_[i].kind;
        if ((kind == Kind::text || kind == Kind::texts || kind == Kind::any) && !(tree && i == shown[0]))
            free.emplace_back(width, i);
    }
    std::sort(free.rbegin(), free.rend());
    const std::size_t room = static_cast<std::size_t>(Terminal::Width()) + separator;
    std::vector<std::size_t> broken;
    for (const auto &[width, column] : free) {
        if (total <= room)
            break;
        broken.push_back(column);
        total -= std::min(total, width > enough ? width - enough : 0);
    }
    return broken;
}

std::string Table::Text(const TableStyle &style) const
{
    std::vector<std::size_t> shown;
    for (const std::string &name : style.columns)
        for (std::size_t i = 0; i < columns_.size(); ++i)
            if (name == columns_[i].name)
                shown.push_back(i);
    for (std::size_t i = 0; i < columns_.size() && style.columns.empty(); ++i)
        if (columns_[i].place == in_list)
            shown.push_back(i);
    if (rows_.empty()) {
        std::string line;
        for (const std::size_t i : shown)
            line += (line.empty() ? "" : column_separator) + Heading(columns_[i].name);
        return style.headings ? line + "\n" : "";
    }

    const bool tree = std::any_of(rows_.begin(), rows_.end(), [](const Row &row) { return row.parent >= 0; });
    const std::vector<std::size_t> broken = Broken(shown, tree);
    Grid grid;
    if (!style.headings)
        grid.HideHeadings();
    for (const std::size_t i : shown) {
        const bool right = std::all_of(rows_.begin(), rows_.end(), [i](const Row &r) { return r.cells[i].IsNumber(); });
        const int flag = tree && i == shown[0] ? SCOLS_FL_TREE : Contains(broken, i) && !right ? SCOLS_FL_WRAP : 0;
        grid.AddColumn(style.headings ? Heading(columns_[i].name) : "", flag | (right ? SCOLS_FL_RIGHT : 0));
    }
    std::vector<libscols_line *> lines;
    for (const Row &row : rows_) {
        libscols_line *const parent = row.parent < 0 ? nullptr : lines[static_cast<std::size_t>(row.parent)];
        lines.push_back(grid.AddLine(parent));
        for (std::size_t i = 0; i < shown.size(); ++i)
            Grid::Set(lines.back(), i, row.cells[shown[i]].Text());
    }
    return grid.Text();
}

std::string Table::Csv() const
{
    std::string text;
    for (const ColumnFacts &column : columns_)
        text += (text.empty() ? "" : ",") + std::string(column.name);
    for (const Row &row : rows_) {
        text += "\n";
        for (std::size_t i = 0; i < row.cells.size(); ++i)
            text += (i ? "," : "") + row.cells[i].Csv();
    }
    return text + "\n";
}

std::string Table::Json(bool one_line) const
{
    auto items = nlohmann::ordered_json::array();
    for (const Row &row : rows_) {
        auto object = nlohmann::ordered_json::object();
        for (std::size_t i = 0; i < columns_.size(); ++i)
            if (columns_[i].place != in_one)
                object[columns_[i].name] = ToJson(row.cells[i]);
        items.push_back(std::move(object));
    }
    nlohmann::ordered_json document = NewDocument();
    document["items"] = std::move(items);
    return Dump(document, one_line);
}

void Record::Add(std::string name, Cell value)
{
    fields_.emplace_back(std::move(name), std::move(value));
}

std::string Record::Text() const
{
    Grid grid;
    grid.HideHeadings();
    grid.AddColumn("", 0);
    grid.AddColumn("", SCOLS_FL_WRAP);
    for (const auto &[name, value] : fields_) {
        std::string label = name + ":";
        std::replace(label.begin(), label.end(), '_', ' ');
        libscols_line *const line = grid.AddLine();
        Grid::Set(line, 0, label);
        Grid::Set(line, 1, value.Text());
    }
    return grid.Text();
}

std::string Record::Json(bool one_line) const
{
    nlohmann::ordered_json document = NewDocument();
    for (const auto &[name, value] : fields_)
        document[name] = ToJson(value);
    return Dump(document, one_line);
}

std::string ChangeReport::Text() const
{
    if (!diff.empty() || changes.empty())
        return diff;
    Table table(Facts(change_columns));
    for (const Change &change : changes)
        table.Add({change.object, change.column, change.before, change.after});
    return table.Text();
}

std::string ChangeReport::Json() const
{
    nlohmann::ordered_json document = NewDocument();
    document["changed"] = Changed();
    if (dry_run)
        document["dry_run"] = true;
    for (const auto &[name, value] : chosen)
        document[name] = ToJson(value);
    auto list = nlohmann::ordered_json::array();
    for (const Change &change : changes)
        list.push_back({{"object", change.object},
                        {"column", change.column},
                        {"old", ToJson(change.before)},
                        {"new", ToJson(change.after)}});
    document["changes"] = std::move(list);
    if (entries) {
        auto results = nlohmann::ordered_json::array();
        for (const Entry &entry : *entries)
            results.push_back({{"object", entry.object},
                               {"result", ResultOf(entry)},
                               {"code", ToJson(entry.code)},
                               {"name", ToJson(entry.name)}});
        document["entries"] = std::move(results);
    }
    if (!diff.empty())
        document["diff"] = diff;
    return Dump(document);
}

std::string ChangeReport::ResultOf(const Entry &entry) const
{
    if (!entry.result.empty())
        return entry.result;
    const bool differs = std::any_of(changes.begin(), changes.end(),
                                     [&](const Change &change) { return change.object == entry.object; });
    return !differs ? "unchanged" : dry_run ? "planned" : "done";
}

}  // namespace tavoctl
