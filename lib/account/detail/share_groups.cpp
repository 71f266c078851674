// Renames and removes groups in the privilege lists of the shared folders.
#include "account/detail/share_groups.h"

#include "account/detail/account_name.h"
#include "core/detail/appliance_paths.h"
#include "core/detail/file_rewrite.h"
#include "core/detail/text_fields.h"

#include <algorithm>

namespace tavo {
namespace {

constexpr std::string_view kLists[] = {"readonly", "readwrite", "deny"};
constexpr std::string_view kBlanks = " \t\r\"";

// The names between the commas; a name that goes takes one comma with it, all others stay as they are spelled.
std::string ChangeList(std::string_view list, const TLIBSZHASH *names)
{
    std::string changed;
    const char *separator = "";
    for (bool more = true; more;) {
        const size_t comma = list.find(',');
        const std::string_view item = list.substr(0, comma);
        const std::string_view name = Trimmed(item, kBlanks);
        more = comma != list.npos;
        list.remove_prefix(more ? comma + 1 : list.size());
        const char *value = nullptr;
        if (name.starts_with('@'))
            if (const std::optional<std::string> key = AccountKey(name))
                value = SzTLIBSzHashGetValue(names, key->c_str());
        if (value && !*value)
            continue;
        changed.append(separator);
        separator = ",";
        if (!value) {
            changed.append(item);
            continue;
        }
        const size_t at = static_cast<size_t>(name.data() - item.data());
        changed.append(item.substr(0, at)).append("@").append(value).append(item.substr(at + name.size()));
    }
    return changed;
}

std::string ChangeLine(std::string_view line, const TLIBSZHASH *names)
{
    const size_t equals = line.find('=');
    if (equals == line.npos ||
        std::find(std::begin(kLists), std::end(kLists), Trimmed(line.substr(0, equals), kBlanks)) == std::end(kLists))
        return std::string(line);
    // The quotation marks and blanks around the list are not part of its first and last name.
    const std::string_view value = line.substr(equals + 1);
    const std::string_view list = Trimmed(value, kBlanks);
    if (list.empty())
        return std::string(line);
    const size_t at = static_cast<size_t>(list.data() - line.data());
    return std::string(line.substr(0, at)) + ChangeList(list, names) + std::string(line.substr(at + list.size()));
}

}  // namespace

std::string ChangeShareGroups(std::string_view text, const TLIBSZHASH *names)
{
    std::string changed;
    while (!text.empty()) {
        const bool ended = text.find('\n') != text.npos;
        changed.append(ChangeLine(TakeLine(text), names)).append(ended ? "\n" : "");
    }
    return changed;
}

Code ChangeGroupsInShares(const TLIBSZHASH *names)
{
    FileRewrite file;
    const Code code = file.Open(kShareFile);
    if (code != 0)
        return file.IsMissing() ? Code() : code;
    std::string text;
    if (!file.Read(text))
        return ERR_READ_FAILED;
    const std::string changed = ChangeShareGroups(text, names);
    return changed == text ? Code() : file.Replace(changed);
}

}  // namespace tavo
