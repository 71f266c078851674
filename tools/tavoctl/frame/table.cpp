// Aligned text and JSON from the same facts.
#include "frame/table.h"

#include "frame/terminal_text.h"

#include <nlohmann/json.hpp>

#include <algorithm>
#include <cctype>
#include <cstdio>
#include <iterator>

namespace tavoctl {
namespace {

std::string Heading(std::string name)
{
    for (char &c : name)
        c = c == '_' ? ' ' : static_cast<char>(std::toupper(static_cast<unsigned char>(c)));
    return name;
}

std::string Joined(const std::vector<std::string> &texts)
{
    std::string joined;
    for (const std::string &text : texts)
        joined += (joined.empty() ? "" : ",") + text;
    return joined;
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

// The text in a column of that width; the last column of a line has no blanks behind it.
std::string Padded(const std::string &text, std::size_t width, bool to_the_right, bool last)
{
    const std::string blanks(width - std::min(width, Columns(text)), ' ');
    return to_the_right ? blanks + text : last ? text : text + blanks;
}

nlohmann::ordered_json ToJson(const Cell &cell)
{
    return std::visit(
        [](const auto &value) -> nlohmann::ordered_json {
            if constexpr (std::is_same_v<std::decay_t<decltype(value)>, std::monostate>)
                return nullptr;
            else if constexpr (std::is_same_v<std::decay_t<decltype(value)>, Bytes>)
                return value.count;
            else
                return value;
        },
        cell.Value());
}

// Bytes that are no UTF-8 show as the replacement character.
std::string Dump(const nlohmann::ordered_json &facts)
{
    return facts.dump(2, ' ', true, nlohmann::ordered_json::error_handler_t::replace);
}

}  // namespace

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
        return texts->empty() ? "-" : Printable(Joined(*texts));
    return "-";
}

std::string Cell::Csv() const
{
    std::string text;
    if (const auto *bytes = std::get_if<std::string>(&value_))
        text = *bytes;
    else if (const auto *texts = std::get_if<std::vector<std::string>>(&value_))
        text = Joined(*texts);
    else if (!std::holds_alternative<std::monostate>(value_))
        text = Text();
    if (text.find_first_of(",\"\r\n") == std::string::npos)
        return text;
    std::string quoted = "\"";
    for (const char c : text)
        quoted += c == '"' ? std::string("\"\"") : std::string(1, c);
    return quoted + "\"";
}

std::string Table::Text() const
{
    if (rows_.empty())
        return {};
    std::vector<std::vector<std::string>> lines(1);
    for (const std::string &column : columns_)
        lines[0].push_back(Heading(column));
    for (const auto &row : rows_) {
        lines.emplace_back();
        for (const Cell &cell : row)
            lines.back().push_back(cell.Text());
    }

    std::vector<std::size_t> widths(columns_.size());
    std::vector<bool> numbers(columns_.size());
    for (std::size_t i = 0; i < columns_.size(); ++i) {
        for (const auto &line : lines)
            widths[i] = std::max(widths[i], Columns(line[i]));
        numbers[i] = std::all_of(rows_.begin(), rows_.end(), [i](const auto &row) { return row[i].IsNumber(); });
    }

    std::string text;
    for (const auto &line : lines) {
        for (std::size_t i = 0; i < columns_.size(); ++i) {
            const bool last = i + 1 == columns_.size();
            text += Padded(line[i], widths[i], numbers[i], last) + (last ? "\n" : "  ");
        }
    }
    return text;
}

std::string Table::Csv() const
{
    std::string text;
    for (std::size_t i = 0; i < columns_.size(); ++i)
        text += (i ? "," : "") + columns_[i];
    for (const auto &row : rows_) {
        text += "\n";
        for (std::size_t i = 0; i < row.size(); ++i)
            text += (i ? "," : "") + row[i].Csv();
    }
    return text + "\n";
}

std::string Table::Json() const
{
    auto rows = nlohmann::ordered_json::array();
    for (const auto &row : rows_) {
        auto object = nlohmann::ordered_json::object();
        for (std::size_t i = 0; i < columns_.size(); ++i)
            object[columns_[i]] = ToJson(row[i]);
        rows.push_back(std::move(object));
    }
    return Dump(rows);
}

// Not in the header: there the compiler for 32-bit ARM warns of parts of the fact that its kind does not have.
void Record::Add(std::string name, Cell value)
{
    fields_.emplace_back(std::move(name), std::move(value));
}

std::string Record::Text() const
{
    std::size_t width = 0;
    for (const auto &[name, value] : fields_)
        width = std::max(width, name.size());
    std::string text;
    for (const auto &[name, value] : fields_) {
        std::string label = name;
        std::replace(label.begin(), label.end(), '_', ' ');
        text += Padded(label + ":", width + 1, false, false) + "  " + value.Text() + "\n";
    }
    return text;
}

std::string Record::Json() const
{
    auto object = nlohmann::ordered_json::object();
    for (const auto &[name, value] : fields_)
        object[name] = ToJson(value);
    return Dump(object);
}

}  // namespace tavoctl
