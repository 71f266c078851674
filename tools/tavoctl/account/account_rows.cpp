// Lists of accounts in files.
#include "account/account_rows.h"

#include "account/account_verbs.h"

#include <nlohmann/json.hpp>

#include <algorithm>

namespace tavoctl {
namespace {

constexpr std::string_view byte_order_mark = "\xEF\xBB\xBF";

[[noreturn]] void Refuse(const std::string &reason)
{
    throw UsageFailure("read the list", reason);
}

void CheckColumn(const std::string &column, const std::vector<std::string> &columns)
{
    if (!Contains(columns, column))
        Refuse("there is no field \"" + column + "\"");
}

// Removes one record of comma-separated values from the beginning of the text. A quoted value may hold line ends.
std::vector<std::string> TakeRecord(std::string_view &text, int &line)
{
    std::vector<std::string> values(1);
    bool quoted = false;
    std::size_t i = 0;
    for (; i < text.size(); ++i) {
        const char c = text[i];
        if (quoted && c == '"' && i + 1 < text.size() && text[i + 1] == '"') {
            values.back() += '"';
            ++i;
        } else if (c == '"' && (quoted || values.back().empty())) {
            quoted = !quoted;
        } else if (!quoted && c == ',') {
            values.emplace_back();
        } else if (!quoted && c == '\n') {
            break;
        } else if (quoted || c != '\r') {
            values.back() += c;
        }
        line += c == '\n';
    }
    if (quoted)
        Refuse("a quotation mark is not closed before the end");
    text.remove_prefix(std::min(i + 1, text.size()));
    ++line;
    return values;
}

std::vector<AccountRow> ParseCsv(std::string_view text, const std::vector<std::string> &columns)
{
    int line = 1;
    const std::vector<std::string> heads = TakeRecord(text, line);
    for (const std::string &head : heads) {
        CheckColumn(head, columns);
        if (std::count(heads.begin(), heads.end(), head) > 1)
            Refuse("duplicate column \"" + head + "\"");
    }
    std::vector<AccountRow> rows;
    while (!text.empty()) {
        AccountRow row = {line, {}};
        const std::vector<std::string> values = TakeRecord(text, line);
        if (values.size() == 1 && values[0].empty())
            continue;
        if (values.size() != heads.size())
            Refuse(row.Where() + " has " + std::to_string(values.size()) + " fields and not " +
                   std::to_string(heads.size()));
        for (std::size_t i = 0; i < heads.size(); ++i)
            row.fields.emplace(heads[i], values[i]);
        rows.push_back(std::move(row));
    }
    return rows;
}

std::string JsonText(const nlohmann::json &value, const AccountRow &row)
{
    if (value.is_string())
        return value.get<std::string>();
    if (value.is_number_integer())
        return std::to_string(value.get<int64_t>());
    if (value.is_boolean())
        return value.get<bool>() ? "yes" : "no";
    if (!value.is_array())
        Refuse(row.Where() + " holds a value that fits no field");
    std::string joined;
    for (const nlohmann::json &item : value)
        joined += (joined.empty() ? "" : ",") + JsonText(item, row);
    return joined;
}

std::vector<AccountRow> ParseJson(std::string_view text, const std::vector<std::string> &columns)
{
    nlohmann::json list = nlohmann::json::parse(text, nullptr, false);
    if (list.is_object() && list.contains("items"))  // as export writes it
        list = nlohmann::json(list["items"]);
    if (!list.is_array())
        Refuse("neither a JSON array nor an object with \"items\"");
    std::vector<AccountRow> rows;
    for (const nlohmann::json &object : list) {
        AccountRow row = {static_cast<int>(rows.size()) + 1, {}};
        if (!object.is_object())
            Refuse(row.Where() + " is not an object");
        for (const auto &[column, value] : object.items()) {
            CheckColumn(column, columns);
            if (!value.is_null())
                row.fields.emplace(column, JsonText(value, row));
        }
        rows.push_back(std::move(row));
    }
    return rows;
}

}  // namespace

const std::string *AccountRow::Find(const std::string &column) const
{
    const auto found = fields.find(column);
    return found == fields.end() ? nullptr : &found->second;
}

std::string AccountRow::Where() const
{
    return "row " + std::to_string(number);
}

std::vector<AccountRow> ParseAccountRows(std::string_view text, const std::vector<std::string> &columns)
{
    if (text.starts_with(byte_order_mark))
        text.remove_prefix(byte_order_mark.size());
    if (text.find('\0') != std::string_view::npos)
        Refuse("it is not text");
    const std::size_t begin = text.find_first_not_of(" \t\r\n");
    if (begin == std::string_view::npos)
        return {};
    const bool json = text[begin] == '[' || text[begin] == '{';
    std::vector<AccountRow> rows = json ? ParseJson(text, columns) : ParseCsv(text, columns);
    for (const AccountRow &row : rows)
        if (const std::string *name = row.Find("name"); !name || name->empty())
            Refuse(row.Where() + " has no name");
    return rows;
}

void Export(const Call &call, const Table &table, const std::optional<std::string> &path)
{
    WriteWhole(path.value_or(""), call.json ? table.Json() + "\n" : table.Csv());
}

}  // namespace tavoctl
