// Every function that rewrites a settings file, with its result for one text.
#ifndef TESTS_FAULT_REWRITE_WRITERS_H
#define TESTS_FAULT_REWRITE_WRITERS_H

#include "tavo_file.h"
#include "tavo_section.h"

#include "support/owned_container.h"
#include "support/test.h"

namespace test {

inline const std::string kOldText = "\xEF\xBB\xBF# settings\nkey=old\n[net]\na=1\n;c\n" + std::string(300, '#') + "\n";

struct Writer {
    const char *name;
    const char *module;
    int (*write)(const char *path);
};

inline const TLIBSZHASH *NewPairs()
{
    static const Hash pairs = MakeHash({{"key", "new"}, {"more", std::string(500, 'm')}});
    return pairs.get();
}

#define WRITER(name, module, call)                                                                                     \
    {                                                                                                                  \
        name, module, [](const char *path) {                                                                           \
            return call;                                                                                               \
        }                                                                                                              \
    }

// Each returns 1 when it is done.
inline constexpr Writer kRewriters[] = {
    WRITER("SetKeyValue", "file_set_key_value", TLIBFileSetKeyValue(path, "key", "new", nullptr)),
    WRITER("RemoveKey", "file_remove_key", TLIBFileRemoveKey(path, "key")),
    WRITER("SetKeys", "file_set_keys", TLIBFileSetKeys(path, NewPairs(), nullptr)),
    WRITER("SetLine", "file_set_line", TLIBFileSetLine(path, 2, "key=x")),
    WRITER("SetLineByKey", "file_set_line_by_key", TLIBFileSetLineByKey(path, "key", "key=y")),
    WRITER("AddLine", "file_add_line", TLIBFileAddLine(path, 0, "end")),
    WRITER("AddLineByKey", "file_add_line_by_key", TLIBFileAddLineByKey(path, "key", "before")),
    WRITER("ReplaceSubStr", "file_replace_sub_str", TLIBFileReplaceSubStr(path, "old", "new")),
    WRITER("UTF8BomStrip", "file_utf8bom_strip", TLIBFileUTF8BomStrip(path)),
    WRITER("SetSection", "file_modify_section", ErrTLIBFileSetSection(path, "net", nullptr, NewPairs(), 1, nullptr)),
    WRITER("RemoveSection", "file_modify_section", ErrTLIBFileRemoveSection(path, "net")),
    WRITER("Comment", "file_comment", TLIBFileComment(path, "key")),
};

// Each returns 1 when it is done.
inline constexpr Writer kAppenders[] = {
    WRITER("AppendKey", "file_append_key", TLIBFileAppendKey(path, "added", "v", nullptr)),
    WRITER("AddSection", "file_add_section", ErrTLIBFileAddSection(path, "added", NewPairs(), nullptr) + 1),
};

#undef WRITER

// Every function that reads a settings file into a container.
struct Reader {
    const char *module;
    int (*read)(const char *path, TLIBSZHASH **hash, TLIBSZLIST **list);
};

#define READER(module, call)                                                                                           \
    {                                                                                                                  \
        module, []([[maybe_unused]] auto *path, [[maybe_unused]] auto **hash, [[maybe_unused]] auto **list) {          \
            return call;                                                                                               \
        }                                                                                                              \
    }

inline constexpr Reader kReaders[] = {
    READER("file_get_keys", TLIBFileGetKeys(path, nullptr, hash, "=")),
    READER("file_get_keys", TLIBFileGetKeys(path, *list, hash, "=")),
    READER("file_get_section", TLIBFileGetSection(path, "net", hash)),
    READER("file_enum_section", TLIBFileEnumSection(path, list)),
    READER("file_read_lines", TLIBFileReadLines(path, list)),
};

#undef READER

// Containers that have to grow; "key" is wanted.
struct Room {
    Owned<TLIBSZHASH> hash{MakeHash({}, 8)};
    Owned<TLIBSZLIST> list{MakeList({"key", std::string(470, 'x')})};
};

// On the file system of /etc/skel, TLIBFileComment begins its new file there, under this name.
inline constexpr const char *kScratch = "/etc/skel/tempErrTLIBFileComment";

// A folder in which rewrites are tried.
class Place : public ScratchDir {
  public:
    explicit Place(const std::string &parent) : ScratchDir(parent) { std::filesystem::create_directories("/etc/skel"); }

    std::vector<std::string> Names() const
    {
        std::vector<std::string> names = ScratchDir::Names();
        if (std::filesystem::exists(kScratch))
            names.push_back(kScratch);
        return names;
    }
};

// Anywhere, and in the appliance root on the file system of /etc/skel, too.
inline std::vector<std::string> Parents()
{
    return RootForm().empty() ? std::vector<std::string>{"/tmp"} : std::vector<std::string>{"/tmp", "/etc"};
}

}  // namespace test

#endif
