// The configuration file of an interface, and edits of several settings at once.
#include "network/detail/interface_file.h"

#include "tavo_file.h"

#include "core/detail/file_rewrite.h"
#include "core/detail/keep_fault.h"
#include "core/detail/key_value_line.h"
#include "core/detail/line_reader.h"

#include <algorithm>
#include <cerrno>
#include <vector>

#include <sys/stat.h>

namespace tavo {
namespace {

void AppendSetting(std::string &text, const SettingChange &change)
{
    text.append(change.key).append("=").append(*change.value).append("\n");
}

}  // namespace

std::string InterfaceFile(std::string_view interface)
{
    return std::string(kInterfaceFolder).append("ifcfg-").append(interface);
}

std::string EditSettings(std::string_view text, std::span<const SettingChange> changes)
{
    std::string edited;
    std::vector<bool> done(changes.size());
    while (!text.empty()) {
        const std::string_view line = TakeWholeLine(text);
        const std::string_view key = LineKey(line);
        const auto change = std::find_if(changes.begin(), changes.end(),
                                         [&](const SettingChange &one) { return !key.empty() && one.key == key; });
        if (change == changes.end()) {
            edited.append(WithoutNewline(line)).append("\n");
            continue;
        }
        const auto index = static_cast<size_t>(change - changes.begin());
        if (change->value && !done[index])
            AppendSetting(edited, *change);
        done[index] = true;
    }
    for (size_t index = 0; index < changes.size(); ++index) {
        if (changes[index].value && !done[index])
            AppendSetting(edited, changes[index]);
    }
    return edited;
}

int RewriteSettings(const std::string &path, std::span<const SettingChange> changes)
{
    FileRewrite rewrite;
    std::string text;
    if (const int code = rewrite.Open(path.c_str()); code != 0 && !rewrite.IsMissing())
        return code;
    if (!rewrite.IsMissing() && !rewrite.Read(text))
        return ERR_READ_FAILED;
    return rewrite.Replace(EditSettings(text, changes), 0644);
}

std::optional<std::string> TryReadSetting(const std::string &path, const char *key)
{
    const KeepFault keep;
    char value[256];
    const int length = TLIBFileGetKeyValue(path.c_str(), key, value, sizeof value, 0);
    if (length > 0)
        return std::string(value, static_cast<size_t>(length - 1));
    struct stat st;
    const bool absent = TLIBErrGet() == ERR_KEY_NOT_FOUND || (::stat(path.c_str(), &st) != 0 && errno == ENOENT);
    return absent ? std::optional<std::string>("") : std::nullopt;
}

std::string ReadSetting(const std::string &path, const char *key)
{
    return TryReadSetting(path, key).value_or("");
}

}  // namespace tavo
