// Changes names in the user lists of Samba's settings file.
#include "core/detail/smb_user_lists.h"

#include <algorithm>
#include <array>

namespace tavo {
namespace {

constexpr std::array<std::string_view, 5> kLists{"validusers", "invalidusers", "readlist", "writelist", "adminusers"};
constexpr std::string_view kSeparators = ", \t\\\r\n";  // a backslash continues the line

// Samba accepts parameter names in any case and with any blanks.
bool IsUserList(std::string_view name)
{
    std::string plain;
    for (const char byte : name)
        if (byte != ' ' && byte != '\t')
            plain += byte >= 'A' && byte <= 'Z' ? static_cast<char>(byte - 'A' + 'a') : byte;
    return std::find(kLists.begin(), kLists.end(), plain) != kLists.end();
}

// Finds the end of the line that begins at `at`, continuation lines included.
size_t EndOfLogicalLine(std::string_view text, size_t at)
{
    for (;;) {
        const size_t newline = text.find('\n', at);
        if (newline == text.npos)
            return text.size();
        size_t last = newline;
        if (last > at && text[last - 1] == '\r')
            --last;
        if (last == at || text[last - 1] != '\\')
            return newline + 1;
        at = newline + 1;
    }
}

// One name of a list as written: with "@" or "+" (a group) and quotes around it or around its name.
struct Entry {
    std::string_view spelled;
    std::string_view name;
    bool is_group = false;
};

Entry ReadEntry(std::string_view text)
{
    Entry entry;
    size_t end = 0;
    bool quoted = false;
    for (; end < text.size() && (quoted || kSeparators.find(text[end]) == kSeparators.npos); ++end)
        if (text[end] == '"')
            quoted = !quoted;
    entry.spelled = text.substr(0, end);
    entry.name = entry.spelled;
    if (entry.name.starts_with('"'))
        entry.name.remove_prefix(1);
    while (entry.name.find_first_of("@+&") == 0) {
        entry.is_group = true;
        entry.name.remove_prefix(1);
    }
    if (entry.name.starts_with('"'))
        entry.name.remove_prefix(1);
    if (entry.name.ends_with('"'))
        entry.name.remove_suffix(1);
    return entry;
}

std::string Respelled(const Entry &entry, const std::string &name)
{
    const size_t at = static_cast<size_t>(entry.name.data() - entry.spelled.data());
    std::string before(entry.spelled.substr(0, at));
    std::string after(entry.spelled.substr(at + entry.name.size()));
    if (name.find(' ') != name.npos && before.find('"') == before.npos) {
        before += '"';
        after.insert(0, 1, '"');
    }
    return before + name + after;
}

std::string ChangeList(std::string_view list, const NameChange &change)
{
    std::string out;
    size_t first_name = std::string::npos;  // where the first kept name begins
    while (!list.empty()) {
        const size_t gap = std::min(list.find_first_not_of(kSeparators), list.size());
        out.append(list.substr(0, gap));
        list.remove_prefix(gap);
        if (list.empty())
            break;
        const Entry entry = ReadEntry(list);
        list.remove_prefix(entry.spelled.size());
        const std::optional<std::string> name = change(entry.name, entry.is_group);
        if (!name || !name->empty()) {
            first_name = std::min(first_name, out.size());
            out += name ? Respelled(entry, *name) : std::string(entry.spelled);
        } else if (const size_t comma = out.find_last_not_of(" \t");
                   comma != out.npos && out[comma] == ',' && first_name != out.npos) {
            out.resize(comma);  // with the comma before it
        } else {
            list.remove_prefix(std::min(list.find_first_not_of(", \t"), list.size()));  // or the one after it
        }
    }
    return out;
}

}  // namespace

std::string ChangeSmbUserLists(std::string_view text, const NameChange &change)
{
    std::string out;
    for (size_t at = 0; at < text.size();) {
        const size_t end = EndOfLogicalLine(text, at);
        const std::string_view line = text.substr(at, end - at);
        const size_t equals = line.find('=');
        const size_t begin = line.find_first_not_of(" \t");
        const bool comment = begin != line.npos && (line[begin] == '#' || line[begin] == ';');
        if (equals == line.npos || comment || !IsUserList(line.substr(0, equals)))
            out.append(line);
        else
            out.append(line.substr(0, equals + 1)).append(ChangeList(line.substr(equals + 1), change));
        at = end;
    }
    return out;
}

}  // namespace tavo
