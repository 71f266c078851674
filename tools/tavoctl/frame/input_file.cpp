// Files that callers name.
#include "frame/input_file.h"

#include "frame/failure.h"

#include <cerrno>
#include <cstdlib>
#include <fstream>
#include <iostream>
#include <iterator>

#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

namespace tavoctl {
namespace {

class OpenFile {
  public:
    explicit OpenFile(int fd) : fd_(fd) {}
    ~OpenFile()
    {
        if (fd_ > STDIN_FILENO)
            ::close(fd_);
    }
    OpenFile(const OpenFile &) = delete;
    OpenFile &operator=(const OpenFile &) = delete;
    int Get() const { return fd_; }

  private:
    int fd_;
};

}  // namespace

std::string ReadWhole(const std::string &path)
{
    const std::string attempted = "read " + path;
    const bool piped = path == "-";
    // Without O_NONBLOCK a FIFO would wait for its writer.
    const OpenFile file(piped ? STDIN_FILENO : ::open(path.c_str(), O_RDONLY | O_CLOEXEC | O_NONBLOCK | O_NOCTTY));
    struct stat state = {};
    if (file.Get() < 0 || ::fstat(file.Get(), &state) != 0)
        throw SystemFailure(attempted, errno);
    if (S_ISDIR(state.st_mode))
        throw SystemFailure(attempted, EISDIR);
    if (!S_ISREG(state.st_mode) && !(piped && (S_ISFIFO(state.st_mode) || S_ISSOCK(state.st_mode))))
        throw UsageFailure(attempted, "not a regular file", "send other input through a pipe, as -");
    const auto refuse = [&] {
        throw UsageFailure(attempted, "larger than 16 MiB", "split it");
    };
    if (state.st_size > static_cast<off_t>(most_input))
        refuse();
    std::string text;
    char bytes[65536];
    for (;;) {
        const ssize_t count = ::read(file.Get(), bytes, sizeof bytes);
        if (count < 0 && errno == EINTR)
            continue;
        if (count < 0)
            throw SystemFailure(attempted, errno);
        if (count == 0)
            return text;
        text.append(bytes, static_cast<std::size_t>(count));
        if (text.size() > most_input)
            refuse();
    }
}

void WriteWhole(const std::string &path, const std::string &text)
{
    if (path.empty()) {
        std::cout << text;
        return;
    }
    const int fd = ::open(path.c_str(), O_WRONLY | O_CREAT | O_EXCL | O_NOFOLLOW | O_CLOEXEC, 0600);
    std::size_t written = 0;
    while (fd >= 0 && written < text.size()) {
        const ssize_t count = ::write(fd, text.data() + written, text.size() - written);
        if (count < 0 && errno != EINTR)
            break;
        written += count > 0 ? static_cast<std::size_t>(count) : 0;
    }
    const bool whole = fd >= 0 && written == text.size() && ::fsync(fd) == 0;
    const int error = errno;
    if (fd >= 0) {
        ::close(fd);
        if (!whole)
            ::unlink(path.c_str());
    }
    if (!whole)
        throw SystemFailure("write " + path, error);
}

void ReplaceFile(const std::string &path, const std::string &text)
{
    const std::string attempted = "write " + path;
    if (text.empty()) {
        if (::unlink(path.c_str()) != 0 && errno != ENOENT)
            throw SystemFailure(attempted, errno);
        return;
    }
    std::string temp = path + ".XXXXXX";
    struct stat st;
    const mode_t mode = ::stat(path.c_str(), &st) == 0 ? st.st_mode & 0777 : 0644;
    const int fd = ::mkostemp(temp.data(), O_CLOEXEC);
    if (fd < 0)
        throw SystemFailure(attempted, errno);
    std::size_t done = 0;
    while (done < text.size()) {
        const ssize_t put = ::write(fd, text.data() + done, text.size() - done);
        if (put < 0 && errno != EINTR)
            break;
        done += put > 0 ? static_cast<std::size_t>(put) : 0;
    }
    const bool whole = done == text.size() && ::fchmod(fd, mode) == 0 && ::fsync(fd) == 0;
    const int error = errno;
    ::close(fd);
    if (whole && ::rename(temp.c_str(), path.c_str()) == 0)
        return;
    const int last = whole ? errno : error;
    ::unlink(temp.c_str());
    throw SystemFailure(attempted, last);
}

std::string FileText(const std::string &path)
{
    std::ifstream in(path, std::ios::binary);
    return std::string((std::istreambuf_iterator<char>(in)), {});
}

}  // namespace tavoctl
