// Files with sections: what is set is read back, what is removed is gone, and comments and other sections stay. The input
// is a section name, a key, a value and the text of a file, each ended by a 0xFE byte.
#include "tavo_section.h"

#include "core/detail/key_value_line.h"
#include "core/detail/line_reader.h"
#include "core/detail/list_owner.h"
#include "core/detail/section_header.h"
#include "input.h"

#include <cstdint>
#include <cstdio>
#include <filesystem>
#include <fstream>
#include <iterator>
#include <string>
#include <vector>

using fuzz::Check;
using fuzz::TakeField;

namespace {

// A file of this run, in a directory of its own: in memory, where a sync costs nothing.
struct Scratch {
    Scratch()
    {
        char name[] = "/dev/shm/section_fuzz.XXXXXX";
        directory = ::mkdtemp(name);
        path = directory + "/file";
    }
    ~Scratch() { std::filesystem::remove_all(directory); }

    std::string directory, path;
};

void Write(const std::string &path, const std::string &text)
{
    std::ofstream(path, std::ios::binary | std::ios::trunc) << text;
}

std::string Read(const std::string &path)
{
    std::ifstream in(path, std::ios::binary);
    return {std::istreambuf_iterator<char>(in), {}};
}

struct Counted {
    int headers = 0;                 // of the section
    std::vector<std::string> other;  // lines of other sections, and comments
};

Counted Count(std::string_view text, const std::string &name)
{
    Counted counted;
    bool inside = false;
    while (!text.empty()) {
        const std::string line(tavo::TakeWholeLine(text));
        if (tavo::IsSectionHeader(line))
            inside = tavo::HeadsSection(line, name);
        if (tavo::HeadsSection(line, name))
            ++counted.headers;
        else if (!inside || tavo::IsCommentLine(line))
            counted.other.push_back(line);
    }
    return counted;
}

void CheckPairs(const char *path, const std::string &name, const std::string &key, const std::string &value)
{
    tavo::HashOwner read(PshTLIBSzHashAlloc(512));
    Check(TLIBFileGetSection(path, name.c_str(), read.Addr()) == 1, "the one pair is there");
    const char *found = SzTLIBSzHashGetValue(read.Get(), key.c_str());
    Check(found && tavo::TrimSetting(value) == found, "with its value");
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const uint8_t *data, size_t size)
{
    static const Scratch scratch;
    const char *path = scratch.path.c_str();
    std::string_view rest(reinterpret_cast<const char *>(data), size);
    const std::string name = TakeField(rest).c_str(), key = TakeField(rest).c_str(), value = TakeField(rest).c_str();
    const std::string text = TakeField(rest);
    Write(scratch.path, text);

    tavo::ListOwner names(PslTLIBSzListAlloc(0));
    tavo::HashOwner any(PshTLIBSzHashAlloc(512));
    TLIBFileEnumSection(path, names.Addr());
    TLIBFileGetSection(path, name.c_str(), any.Addr());
    Check(Read(scratch.path) == text, "reading has changed the file");

    const Counted before = Count(text, name);
    tavo::HashOwner pairs(PshTLIBSzHashAlloc(512));
    TLIBSzHashSetValue(pairs.Addr(), key.c_str(), value.c_str());
    const bool writable = tavo::IsWritableKey(key) && tavo::IsWritableValue(value) && tavo::IsWritableSectionName(name);
    const int set = ErrTLIBFileSetSection(path, name.c_str(), nullptr, pairs.Get(), 1, nullptr);
    Check(set == (before.headers == 0 ? 0 : writable ? 1 : -1), "the result of Set");
    if (set == 1) {
        CheckPairs(path, name, key, value);
        const Counted after = Count(Read(scratch.path), name);
        Check(after.headers == before.headers && after.other == before.other, "other lines have changed");
    } else {
        Check(Read(scratch.path) == text, "nothing was set, but the file has changed");
    }

    const int removed = ErrTLIBFileRemoveSection(path, name.c_str());
    Check(removed == (before.headers > 0), "the result of Remove");
    const Counted left = Count(Read(scratch.path), name);
    Check(left.headers == 0 && left.other == before.other, "not only the section is gone");
    if (writable) {
        Check(ErrTLIBFileAddSection(path, name.c_str(), pairs.Get(), nullptr) == 0, "the result of Add");
        CheckPairs(path, name, key, value);
    }
    return 0;
}
