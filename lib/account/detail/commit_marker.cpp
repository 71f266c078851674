// Reads and writes the commit marker of the accounts.
#include "account/detail/commit_marker.h"

#include "tavo_error.h"

#include "account/detail/store_content.h"
#include "core/detail/open_file.h"
#include "core/detail/strict_number.h"
#include "core/detail/text_fields.h"

#include <algorithm>
#include <charconv>
#include <cinttypes>

namespace tavo {
namespace {

constexpr char kNewMarker[] = "/etc/.tavoaccount.commit.tmp";
constexpr std::string_view kEnd = "end";
constexpr const char *kKinds[] = {"make", "move", "remove"};

bool IsPlain(char byte)
{
    return byte > ' ' && byte != '%' && byte != 0x7F;
}

// A name may hold blanks; an empty one is still a field.
std::string Encoded(std::string_view text)
{
    if (text.empty())
        return "%";
    std::string encoded;
    for (const char byte : text) {
        if (IsPlain(byte) || static_cast<unsigned char>(byte) >= 0x80) {
            encoded += byte;
            continue;
        }
        char hex[4];
        std::snprintf(hex, sizeof hex, "%%%02X", static_cast<unsigned>(static_cast<unsigned char>(byte)));
        encoded += hex;
    }
    return encoded;
}

std::string Decoded(std::string_view field)
{
    std::string text;
    for (size_t at = 0; at < field.size() && field != "%"; ++at) {
        unsigned byte = 0;
        if (field[at] != '%') {
            text += field[at];
        } else if (at + 2 < field.size() &&
                   std::from_chars(field.data() + at + 1, field.data() + at + 3, byte, 16).ec == std::errc()) {
            text += static_cast<char>(byte);
            at += 2;
        }
    }
    return text;
}

bool ParseStep(const std::vector<std::string_view> &fields, Marker &marker)
{
    const std::string_view what = fields[0];
    if (what == "file" && fields.size() == 6)
        marker.files.push_back({LeadingNumber<unsigned>(fields[1]), Decoded(fields[2]), Decoded(fields[3]),
                                std::string(fields[4]), std::string(fields[5])});
    else if (what == "name" && fields.size() == 6)
        marker.names.push_back({fields[1] == "group", LeadingNumber<unsigned>(fields[2]),
                                LeadingNumber<unsigned>(fields[3]), Decoded(fields[4]), Decoded(fields[5])});
    else if (what == "home" && fields.size() == 7)
        marker.homes.push_back({fields[1] == kKinds[HomeStep::kMake]   ? HomeStep::kMake
                                : fields[1] == kKinds[HomeStep::kMove] ? HomeStep::kMove
                                                                       : HomeStep::kRemove,
                                Decoded(fields[2]), Decoded(fields[3]), LeadingNumber<int32_t>(fields[4]),
                                LeadingNumber<int32_t>(fields[5]), LeadingNumber<uint64_t>(fields[6])});
    else if (what == "stage" && fields.size() == 2)
        marker.stages.push_back(Decoded(fields[1]));
    else
        return false;
    return true;
}

}  // namespace

std::string FileIdentity(const char *path)
{
    struct stat st;
    if (::lstat(path, &st) != 0 || !S_ISREG(st.st_mode))
        return "-";
    char text[160];
    std::snprintf(text, sizeof text, "%" PRIuMAX ":%" PRIdMAX ":%" PRIdMAX ".%09ld", uintmax_t{st.st_ino},
                  intmax_t{st.st_size}, intmax_t{st.st_mtim.tv_sec}, long{st.st_mtim.tv_nsec});
    return text;
}

bool Marker::HasMoreThanFiles() const
{
    return !homes.empty() || !stages.empty() ||
           std::any_of(names.begin(), names.end(), [](const NameStep &name) { return name.pending != 0; });
}

void Marker::MakePending(unsigned target) noexcept
{
    for (NameStep &name : names)
        name.pending |= name.targets & target;
}

void Marker::DropDone()
{
    std::erase_if(names, [](const NameStep &name) { return name.pending == 0; });
    for (NameStep &name : names)
        name.targets = name.pending;
}

std::string FormatMarker(const Marker &marker)
{
    std::string text;
    for (const FileStep &file : marker.files)
        text += "file " + std::to_string(file.target) + ' ' + Encoded(file.temporary) + ' ' + Encoded(file.path) + ' ' +
                file.made + ' ' + file.before + '\n';
    for (const NameStep &name : marker.names)
        text += std::string("name ") + (name.is_group ? "group" : "user") + ' ' + std::to_string(name.targets) + ' ' +
                std::to_string(name.pending) + ' ' + Encoded(name.old_name) + ' ' + Encoded(name.new_name) + '\n';
    for (const HomeStep &home : marker.homes)
        text += std::string("home ") + kKinds[home.kind] + ' ' + Encoded(home.name) + ' ' + Encoded(home.new_name) +
                ' ' + std::to_string(home.uid) + ' ' + std::to_string(home.gid) + ' ' + std::to_string(home.inode) +
                '\n';
    for (const std::string &stage : marker.stages)
        text += "stage " + Encoded(stage) + '\n';
    return text.append(kEnd) += '\n';
}

bool ParseMarker(std::string_view text, Marker &marker)
{
    marker = {};
    while (!text.empty()) {
        const std::string_view line = TakeLine(text);
        if (line == kEnd)
            return true;
        const std::vector<std::string_view> fields = SplitFields(line);
        if (fields.empty() || !ParseStep(fields, marker))
            break;
    }
    marker = {};
    return false;
}

bool MarkerStands() noexcept
{
    return ::access(kCommitMarker, F_OK) == 0;
}

Code ReadMarker(Marker &marker)
{
    marker = {};
    struct stat st;
    if (::lstat(kCommitMarker, &st) != 0)
        return errno == ENOENT ? ERR_SUCCESS : ERR_READ_FAILED;
    std::string text;
    int64_t ignored = 0;
    const bool is_ours = S_ISREG(st.st_mode) && st.st_uid == 0 && (st.st_mode & 022) == 0;
    if (is_ours && !ReadTextFile(kCommitMarker, text, ignored))
        return ERR_READ_FAILED;
    if (!is_ours || !ParseMarker(text, marker))
        RemoveMarker();
    return 0;
}

bool WriteMarker(const std::string &text, bool durable) noexcept
{
    // The first one needs no second name: as long as its last line is missing it decides nothing.
    const bool replaces = MarkerStands();
    const char *path = replaces ? kNewMarker : kCommitMarker;
    ::unlink(path);
    Fd fd = OpenFd(path, O_WRONLY | O_CREAT | O_EXCL | O_NOFOLLOW, 0600);
    if (fd && WriteAll(fd.Get(), text) && (!durable || SyncFd(fd.Get())) && fd.Close() &&
        (!replaces || ::rename(kNewMarker, kCommitMarker) == 0))
        return true;
    const KeepErrno keep;
    ::unlink(path);
    return false;
}

void RemoveMarker() noexcept
{
    const KeepErrno keep;
    ::unlink(kCommitMarker);
}

}  // namespace tavo
