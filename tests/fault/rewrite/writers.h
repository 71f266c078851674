// Every function that rewrites a settings file, with what it makes of one text.
#ifndef TESTS_FAULT_REWRITE_WRITERS_H
#define TESTS_FAULT_REWRITE_WRITERS_H

#include "support/string_hash.h"
#include "tavo_file.h"
#include "tavo_section.h"

#include <string>

namespace test {

inline const std::string kOldText = "\xEF\xBB\xBF# settings\nkey=old\n[net]\na=1\n;c\n" + std::string(300, '#') + "\n";

struct Writer {
    const char *name;
    const char *module;
    int (*write)(const char *path);
};

inline const StringHash &NewPairs()
{
    static const StringHash pairs(Pairs{{"key", "new"}, {"more", std::string(500, 'm')}});
    return pairs;
}

// Each gives 1 when it is done.
inline constexpr Writer kRewriters[] = {
    {"SetKeyValue", "file_set_key_value",
     [](const char *path) {
         return TLIBFileSetKeyValue(path, "key", "new", nullptr);
     }},
    {"RemoveKey", "file_remove_key",
     [](const char *path) {
         return TLIBFileRemoveKey(path, "key");
     }},
    {"SetKeys", "file_set_keys",
     [](const char *path) {
         return TLIBFileSetKeys(path, NewPairs().Get(), nullptr);
     }},
    {"SetLine", "file_set_line",
     [](const char *path) {
         return TLIBFileSetLine(path, 2, "key=x");
     }},
    {"SetLineByKey", "file_set_line_by_key",
     [](const char *path) {
         return TLIBFileSetLineByKey(path, "key", "key=y");
     }},
    {"AddLine", "file_add_line",
     [](const char *path) {
         return TLIBFileAddLine(path, 0, "end");
     }},
    {"AddLineByKey", "file_add_line_by_key",
     [](const char *path) {
         return TLIBFileAddLineByKey(path, "key", "before");
     }},
    {"ReplaceSubStr", "file_replace_sub_str",
     [](const char *path) {
         return TLIBFileReplaceSubStr(path, "old", "new");
     }},
    {"UTF8BomStrip", "file_utf8bom_strip",
     [](const char *path) {
         return TLIBFileUTF8BomStrip(path);
     }},
    {"SetSection", "file_modify_section",
     [](const char *path) {
         return ErrTLIBFileSetSection(path, "net", nullptr, NewPairs().Get(), 1, nullptr);
     }},
    {"RemoveSection", "file_modify_section",
     [](const char *path) {
         return ErrTLIBFileRemoveSection(path, "net");
     }},
    {"Comment", "file_comment",
     [](const char *path) {
         return TLIBFileComment(path, "key");
     }},
};

// Each gives 1 when it is done.
inline constexpr Writer kAppenders[] = {
    {"AppendKey", "file_append_key",
     [](const char *path) {
         return TLIBFileAppendKey(path, "added", "v", nullptr);
     }},
    {"AddSection", "file_add_section",
     [](const char *path) {
         return ErrTLIBFileAddSection(path, "added", NewPairs().Get(), nullptr) + 1;
     }},
};

}  // namespace test

#endif
