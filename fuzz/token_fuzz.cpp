// Tokens, trimming and UTF-8 against plain models and against each other.
#include "tavo_str.h"

#include "input.h"

#include <cstring>
#include <vector>

using fuzz::Check;

namespace {

std::vector<std::string> Split(const std::string &text, const std::string &delimiters)
{
    std::vector<std::string> parts(1);
    for (const char byte : text) {
        if (delimiters.find(byte) == delimiters.npos)
            parts.back() += byte;
        else
            parts.emplace_back();
    }
    return parts;
}

std::vector<std::string> Cut(char *(*next)(char **, const char *), std::string text, const std::string &delimiters)
{
    std::vector<std::string> parts;
    char *cursor = text.data();
    while (const char *part = next(&cursor, delimiters.c_str()))
        parts.push_back(part);
    return parts;
}

std::string Trim(std::string text)
{
    const auto white = [](char byte) {
        return byte == ' ' || byte == '\t' || byte == '\n' || byte == '\r';
    };
    while (!text.empty() && white(text.front()))
        text.erase(0, 1);
    while (!text.empty() && white(text.back()))
        text.pop_back();
    if (text.size() >= 2 && text.front() == '"' && text.back() == '"')
        text = text.substr(1, text.size() - 2);
    return text;
}

void CheckUtf8(const std::string &text, const std::string &other)
{
    const int characters = TLIBUnicodeUTF8StrCountChar(text.c_str());
    const int upper_length = TLIBUnicodeUTF8StrUpper(text.c_str(), nullptr, 0);
    Check((characters < 0) == (upper_length < 0), "both know what UTF-8 is");
    Check(TLIBUnicodeUTF8StrCaseCmp(text.c_str(), text.c_str()) == (characters < 0 ? -2 : 0), "equal to itself");
    const int order = TLIBUnicodeUTF8StrCaseCmp(text.c_str(), other.c_str());
    const int back = TLIBUnicodeUTF8StrCaseCmp(other.c_str(), text.c_str());
    Check(order == -2 ? back == -2 : back == -order, "the order does not depend on the side");
    if (upper_length < 0)
        return;
    std::vector<char> upper(static_cast<size_t>(upper_length));
    Check(TLIBUnicodeUTF8StrUpper(text.c_str(), upper.data(), upper_length) == upper_length, "the length asked for");
    Check(std::strlen(upper.data()) + 1 == upper.size(), "the length is that of the text");
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const uint8_t *data, size_t size)
{
    fuzz::Input input(data, size);
    const std::string delimiters = input.Text(4);
    const std::string other = input.Text(40);
    const std::string text = input.Rest();

    std::vector<std::string> parts = Split(text, delimiters);
    Check(Cut(TLIBStrSep, text, delimiters) == parts, "every part");
    std::erase(parts, std::string());
    Check(Cut(TLIBStrTok, text, delimiters) == parts, "every part that is not empty");

    std::string source = text;
    std::vector<char> target(text.size() + 1);
    const int length = TLIBStrTrimSpace(source.data(), target.data());
    Check(target.data() == Trim(text) && length == static_cast<int>(Trim(text).size()), "trimmed");
    Check(TLIBStrTrimSpace(source.data(), nullptr) == length && source.c_str() == Trim(text), "trimmed in place");

    CheckUtf8(text, other);
    return 0;
}
