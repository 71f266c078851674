// Finds processes by their line in the process table.
#include "tavo_proc.h"

#include "core/detail/guard.h"
#include "core/detail/open_file.h"
#include "core/detail/process_list.h"
#include "core/detail/run_command.h"
#include "core/detail/shell_command.h"

#include <charconv>
#include <cstring>
#include <string>

namespace {

// grep's time grows with the square of the pattern's length.
constexpr size_t kLongestPattern = 1024;

// Scratch file; removed when the search ends.
class ScratchFile {
  public:
    explicit ScratchFile(std::string path) : path_(std::move(path))
    {
        // A file of an earlier process with our pid is removed; files of other users are left alone.
        struct stat st;
        if (::lstat(path_.c_str(), &st) == 0 && st.st_uid == ::geteuid() && !S_ISDIR(st.st_mode))
            ::unlink(path_.c_str());
        fd_ = tavo::OpenFd(path_.c_str(), O_WRONLY | O_CREAT | O_EXCL | O_NOFOLLOW, 0600);
        is_taken_ = !fd_ && errno == EEXIST;
        if (is_taken_)
            fd_ = tavo::Fd(::mkostemp((path_ += ".XXXXXX").data(), O_CLOEXEC));
    }
    ~ScratchFile()
    {
        tavo::KeepErrno keep;
        if (fd_)
            TLIBSysRemove(path_.c_str());
    }
    ScratchFile(const ScratchFile &) = delete;
    ScratchFile &operator=(const ScratchFile &) = delete;

    explicit operator bool() const { return static_cast<bool>(fd_); }
    bool IsTaken() const { return is_taken_; }
    const std::string &Path() const { return path_; }

    // Opens the file under its name, if the name still leads to the file that was created.
    tavo::File Reopen() const
    {
        tavo::Fd fd = tavo::OpenRegular(path_.c_str(), O_RDONLY | O_NOFOLLOW);
        struct stat created, named;
        if (!fd || ::fstat(fd_.Get(), &created) != 0 || ::fstat(fd.Get(), &named) != 0 ||
            created.st_dev != named.st_dev || created.st_ino != named.st_ino)
            return tavo::File();
        tavo::File stream(::fdopen(fd.Get(), "re"));
        if (stream)
            fd.Release();
        return stream;
    }

  private:
    std::string path_;
    tavo::Fd fd_;
    bool is_taken_ = false;  // another user's file has the usual name
};

// The matches, line by line.
class Search {
  public:
    Search(const std::string &pattern, pid_t *pids, int capacity)
        : plain_("grep " + pattern), quoted_("grep '" + pattern + "'"), pids_(pids), capacity_(capacity)
    {
    }

    // A line without a pid (a title, a complaint of grep) is not a process.
    void Add(std::string_view line)
    {
        if (line.find(plain_) != std::string_view::npos || line.find(quoted_) != std::string_view::npos) {
            listed_ = true;
            return;
        }
        line.remove_prefix(std::min(line.find_first_not_of(" \t"), line.size()));
        pid_t pid = 0;
        if (std::from_chars(line.data(), line.data() + line.size(), pid).ec != std::errc() || pid < 1)
            return;
        listed_ = true;
        if (count_ < capacity_)
            pids_[count_] = pid;
        ++count_;
    }

    // The search itself is a process that matches: no line at all means that no processes were listed.
    bool HasListed() const { return listed_; }
    int Count() const { return count_; }

  private:
    std::string plain_;
    std::string quoted_;
    pid_t *pids_;
    int capacity_;
    int count_ = 0;
    bool listed_ = false;
};

void AddLines(std::FILE *stream, Search &search)
{
    char *line = nullptr;
    size_t size = 0;
    ssize_t length;
    while ((length = ::getline(&line, &size, stream)) >= 0)
        search.Add({line, static_cast<size_t>(length)});
    const bool all = std::feof(stream) != 0;
    std::free(line);
    if (!all)
        throw std::bad_alloc();  // an incomplete list would hide running processes
}

// Used where ps fails.
int FindInProcessTable(const std::string &pattern, Search &search)
{
    for (const tavo::Process &process : tavo::ListProcesses()) {
        const std::string line = ProcessLine(process);
        if (line.find(pattern) != std::string::npos)
            search.Add(line);
    }
    return search.Count();
}

int FindByPs(const std::string &pattern, pid_t *pids, int capacity)
{
    Search search(pattern, pids, capacity);
    const ScratchFile scratch("/tmp/tempTLIBPs" + std::to_string(::getpid()));
    if (!scratch)
        return scratch.IsTaken() ? FindInProcessTable(pattern, search) : Fail(ERR_READ_FAILED);
    if (const auto command = tavo::ShellCommand("/bin/ps -I | /bin/grep '%s' > %s 2>&1", pattern, scratch.Path()))
        tavo::RunCommandQuietly(*command);
    const tavo::File found = scratch.Reopen();
    if (!found)
        return Fail(ERR_READ_FAILED);
    AddLines(found.Get(), search);
    // Most machines' ps does not know -I.
    return search.HasListed() ? search.Count() : FindInProcessTable(pattern, search);
}

}  // namespace

extern "C" int TLIBPs(const char *szPattern, pid_t *rgPid, int nPid)
{
    if (!szPattern || ::strnlen(szPattern, kLongestPattern + 1) > kLongestPattern || (!rgPid && nPid > 0))
        return Fail(ERR_BAD_PARAMETERS);
    return Guard([&] { return FindByPs(szPattern, rgPid, nPid); });
}
