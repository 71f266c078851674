// Settings files: every line means to us what the plain token rule makes of it, and what is set is read back while all
// other lines stay as they are. The input is a key, a value and the text of a file, each ended by a 0xFE byte.
#include "tavo_file.h"
#include "tavo_str.h"

#include "core/detail/key_value_line.h"
#include "core/detail/line_format.h"
#include "core/detail/line_reader.h"
#include "core/detail/owner.h"
#include "core/detail/settings_text.h"
#include "input.h"

#include <cstdint>
#include <vector>

#include <sys/mman.h>

using fuzz::Check;
using fuzz::TakeField;

namespace {

std::string Trimmed(std::string text)
{
    TLIBStrTrimSpace(text.data(), nullptr);
    return text.c_str();
}

// The documented rule: the first token between equal signs, trimmed.
bool SetsByTokens(const std::string &line, const std::string &key)
{
    if (key.empty() || line.starts_with('#') || line.starts_with(';') || line.find('=') == line.npos)
        return false;
    std::string copy = line;
    char *cursor = copy.data();
    const char *token = TLIBIStrTok(&cursor, "=");
    return token && Trimmed(token) == key;
}

std::vector<std::string> Lines(std::string_view text)
{
    std::vector<std::string> lines;
    while (!text.empty())
        lines.emplace_back(tavo::TakeWholeLine(text));
    return lines;
}

std::vector<std::string> OtherLines(std::string_view text, const std::string &key)
{
    std::vector<std::string> others;
    for (const std::string &line : Lines(text)) {
        if (!tavo::LineSetsKey(line, key))
            others.push_back(line.ends_with('\n') ? line : line + "\n");
    }
    return others;
}

void CheckLines(const std::string &text, const std::string &key)
{
    for (const std::string &line : Lines(text)) {
        const std::string plain = line.c_str();  // up to a NUL byte
        Check(tavo::LineSetsKey(plain, key) == SetsByTokens(plain, key), "the token rule says otherwise");
        Check(TLIBILineKeyMatch(plain.c_str(), key.c_str()) == tavo::LineSetsKey(plain, key), "the exported form");
    }
}

void CheckReader(const std::string &text)
{
    const tavo::Fd file(::memfd_create("text", MFD_CLOEXEC));
    Check(::write(file.Get(), text.data(), text.size()) == static_cast<ssize_t>(text.size()), "memory file");
    ::lseek(file.Get(), 0, SEEK_SET);
    tavo::LineReader reader(file.Get());
    std::vector<std::string> read;
    for (std::string_view line; reader.Next(line);)
        read.emplace_back(line);
    Check(read == Lines(text), "read line by line it is another text");
}

void CheckRoundTrip(const std::string &text, const std::string &key, const std::string &value)
{
    const std::string line = tavo::FormatLine(nullptr, key, value).value();
    const std::string changed = tavo::WithKey(text, key, line);
    int setting = 0;
    for (const std::string &each : Lines(changed)) {
        if (!tavo::LineSetsKey(each, key))
            continue;
        ++setting;
        Check(tavo::LineValue(each) == Trimmed(value), "the value comes back");
    }
    Check(setting == 1, "one line sets the key");
    Check(OtherLines(changed, key) == OtherLines(text, key), "other lines have changed");
    Check(tavo::WithKey(changed, key, line) == changed, "setting it again changes nothing");
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const uint8_t *data, size_t size)
{
    std::string_view rest(reinterpret_cast<const char *>(data), size);
    const std::string key = TakeField(rest).c_str(), value = TakeField(rest).c_str(), text = TakeField(rest);
    CheckLines(text, key);
    CheckReader(text);
    if (tavo::IsWritableKey(key) && tavo::IsWritableValue(value))
        CheckRoundTrip(text, key, value);
    return 0;
}
