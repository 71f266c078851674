// Files and folders: those that callers name, and those of the kernel.
#include "frame/files.h"

#include "frame/containers.h"
#include "frame/failure.h"

#include <algorithm>
#include <cerrno>
#include <cstdint>
#include <cstdlib>
#include <fstream>
#include <iostream>
#include <iterator>
#include <memory>
#include <string_view>

#include <dirent.h>
#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

namespace tavoctl {
namespace {

bool WriteAll(int fd, const std::string &text)
{
    for (std::size_t done = 0; done < text.size();) {
        const ssize_t put = ::write(fd, text.data() + done, text.size() - done);
        if (put < 0 && errno != EINTR)
            return false;
        done += put > 0 ? static_cast<std::size_t>(put) : 0;
    }
    return true;
}

void RefuseLarge(const std::string &attempted, uint64_t size)
{
    RefuseIf(size > most_input, attempted, "larger than 16 MiB", "split it");
}

}  // namespace

Descriptor::~Descriptor()
{
    if (fd_ > STDERR_FILENO)
        ::close(fd_);
}

void RefuseNoText(const std::string &path)
{
    struct stat state = {};
    if (::stat(path.c_str(), &state) != 0)
        return;
    RefuseIf(!S_ISREG(state.st_mode), "read " + path, "not a regular file");
    RefuseLarge("read " + path, static_cast<uint64_t>(state.st_size));
}

std::string ReadWhole(const std::string &path)
{
    const std::string attempted = "read " + path;
    const bool piped = path == "-";
    // Without O_NONBLOCK a FIFO would wait for its writer.
    const Descriptor file(piped ? STDIN_FILENO : ::open(path.c_str(), O_RDONLY | O_CLOEXEC | O_NONBLOCK | O_NOCTTY));
    struct stat state = {};
    if (!file.IsOpen() || ::fstat(file.Get(), &state) != 0)
        throw SystemFailure(attempted, errno);
    RefuseIf(!S_ISREG(state.st_mode) && !(piped && (S_ISFIFO(state.st_mode) || S_ISSOCK(state.st_mode))), attempted,
             "not a regular file", "send other input through a pipe, as -");
    RefuseLarge(attempted, static_cast<uint64_t>(state.st_size));
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
        RefuseLarge(attempted, text.size());
    }
}

void WriteWhole(const std::string &path, const std::string &text)
{
    if (path.empty()) {
        std::cout << text;
        return;
    }
    const Descriptor file(::open(path.c_str(), O_WRONLY | O_CREAT | O_EXCL | O_NOFOLLOW | O_CLOEXEC, 0600));
    if (file.IsOpen() && WriteAll(file.Get(), text) && ::fsync(file.Get()) == 0)
        return;
    const int error = errno;
    if (file.IsOpen())
        ::unlink(path.c_str());
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
    const Descriptor file(::mkostemp(temp.data(), O_CLOEXEC));
    if (!file.IsOpen())
        throw SystemFailure(attempted, errno);
    if (WriteAll(file.Get(), text) && ::fchmod(file.Get(), mode) == 0 && ::fsync(file.Get()) == 0 &&
        ::rename(temp.c_str(), path.c_str()) == 0)
        return;
    const int error = errno;
    ::unlink(temp.c_str());
    throw SystemFailure(attempted, error);
}

std::string FileText(const std::string &path)
{
    std::ifstream in(path, std::ios::binary);
    return std::string((std::istreambuf_iterator<char>(in)), {});
}

std::optional<std::string> KernelText(const std::string &path)
{
    std::ifstream file(path);
    std::string line;
    if (!std::getline(file, line))
        return std::nullopt;
    return line;
}

void SetKernelText(const std::string &path, const std::string &text, const std::string &attempted)
{
    const Descriptor file(::open(path.c_str(), O_WRONLY | O_CLOEXEC));
    if (!file.IsOpen() || ::write(file.Get(), text.data(), text.size()) != static_cast<ssize_t>(text.size()))
        throw SystemFailure(attempted, errno);
}

std::vector<std::string> FolderNames(const std::string &path)
{
    const std::string attempted = "list " + path;
    const std::unique_ptr<DIR, By<::closedir>> folder(::opendir(path.c_str()));
    if (!folder) {
        if (errno == ENOENT || errno == ENOTDIR)
            return {};
        throw SystemFailure(attempted, errno);
    }
    std::vector<std::string> names;
    for (errno = 0; const dirent *entry = ::readdir(folder.get()); errno = 0)
        if (const std::string_view name = entry->d_name; name != "." && name != "..")
            names.emplace_back(name);
    if (errno != 0)
        throw SystemFailure(attempted, errno);
    std::sort(names.begin(), names.end());
    return names;
}

}  // namespace tavoctl
