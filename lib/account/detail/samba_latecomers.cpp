// What Samba's programs still write into a password file that was replaced while they waited for its lock.
#include "account/detail/samba_latecomers.h"

#include "core/detail/owner.h"

#include <algorithm>
#include <cerrno>
#include <ctime>
#include <map>
#include <optional>
#include <vector>

#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

namespace tavo {
namespace {

constexpr int kTries = 1000;
constexpr timespec kPause{0, 1000000};

struct SmbLine {
    std::string_view name;
    std::string_view uid;
    std::string_view rest;  // from the hashes on
    std::string_view whole;
};

std::vector<SmbLine> LinesOf(std::string_view text)
{
    std::vector<SmbLine> lines;
    while (!text.empty()) {
        const size_t end = text.find('\n');
        SmbLine line;
        line.whole = text.substr(0, end);
        text.remove_prefix(end == text.npos ? text.size() : end + 1);
        const size_t name_end = line.whole.find(':');
        const size_t uid_end = name_end == line.whole.npos ? name_end : line.whole.find(':', name_end + 1);
        if (uid_end != line.whole.npos) {
            line.name = line.whole.substr(0, name_end);
            line.uid = line.whole.substr(name_end + 1, uid_end - name_end - 1);
            line.rest = line.whole.substr(uid_end);
        }
        lines.push_back(line);
    }
    return lines;
}

std::optional<std::string> TextOf(int fd)
{
    struct stat st;
    if (::fstat(fd, &st) != 0)
        return std::nullopt;
    std::string text(static_cast<size_t>(st.st_size), '\0');
    size_t done = 0;
    while (done < text.size()) {
        const ssize_t length = ::pread(fd, text.data() + done, text.size() - done, static_cast<off_t>(done));
        if (length < 0 && errno == EINTR)
            continue;
        if (length <= 0)
            return std::nullopt;
        done += static_cast<size_t>(length);
    }
    return text;
}

// Only a process that alone has the file open gets a lease for writing. A file system without leases does not tell.
bool IsOpenElsewhere(int fd)
{
    if (::fcntl(fd, F_SETLEASE, F_WRLCK) != 0)
        return errno == EAGAIN;
    ::fcntl(fd, F_SETLEASE, F_UNLCK);
    return false;
}

// In place, as Samba's programs do it: they may have the file open by now.
void Rewrite(int fd, std::string_view text)
{
    size_t done = 0;
    while (done < text.size()) {
        const ssize_t length = ::pwrite(fd, text.data() + done, text.size() - done, static_cast<off_t>(done));
        if (length < 0 && errno == EINTR)
            continue;
        if (length <= 0)
            return;
        done += static_cast<size_t>(length);
    }
    if (::ftruncate(fd, static_cast<off_t>(text.size())) == 0)
        ::fsync(fd);
}

}  // namespace

std::string WithLateLines(std::string_view text, std::string_view before, std::string_view after)
{
    std::map<std::string_view, std::string_view> old;
    for (const SmbLine &line : LinesOf(before))
        old.emplace(line.name, line.rest);
    std::vector<SmbLine> lines = LinesOf(text);
    const auto find = [&](std::string_view name, std::string_view uid) {
        return std::find_if(lines.begin(), lines.end(), [&](const SmbLine &line) {
            return !line.name.empty() && line.uid == uid && (name.empty() || line.name == name);
        });
    };
    std::string added;
    for (const SmbLine &late : LinesOf(after)) {
        const auto was = old.find(late.name);
        if (late.name.empty() || (was != old.end() && was->second == late.rest))
            continue;
        auto line = find(late.name, late.uid);
        if (line == lines.end() && was != old.end())
            line = find({}, late.uid);
        if (line != lines.end())
            line->rest = late.rest;
        else if (was == old.end())
            added.append(late.whole) += '\n';
    }
    std::string result;
    for (const SmbLine &line : lines) {
        if (line.name.empty())
            result.append(line.whole) += '\n';
        else
            result.append(line.name).append(":").append(line.uid).append(line.rest) += '\n';
    }
    return result + added;
}

void CarryOverLateLines(int old_fd, int new_fd)
{
    const std::optional<std::string> before = TextOf(old_fd);
    struct flock whole = {};
    whole.l_type = F_UNLCK;
    whole.l_whence = SEEK_SET;
    ::fcntl(old_fd, F_OFD_SETLK, &whole);
    for (int tries = 0; tries < kTries && IsOpenElsewhere(old_fd); ++tries)
        ::nanosleep(&kPause, nullptr);
    const std::optional<std::string> after = TextOf(old_fd);
    if (!before || !after || *after == *before)
        return;
    const std::optional<std::string> text = TextOf(new_fd);
    if (!text)
        return;
    if (const std::string changed = WithLateLines(*text, *before, *after); changed != *text)
        Rewrite(new_fd, changed);
}

}  // namespace tavo
