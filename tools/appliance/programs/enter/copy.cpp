// Makes the files of a private copy, and removes them again.
#include "enter.h"

#include <cerrno>
#include <cstdlib>

#include <dirent.h>
#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

namespace enter {

std::string unfinished;

namespace {

std::string ReadLink(const std::string &path)
{
    char target[4096];
    const ssize_t length = ::readlink(path.c_str(), target, sizeof target);
    Must(length >= 0, "read the link", path);
    return {target, static_cast<size_t>(length)};
}

void CopyBytes(int in, int out, const std::string &name)
{
    char buffer[65536];
    for (ssize_t got; (got = ::read(in, buffer, sizeof buffer)) != 0;) {
        Must(got > 0, "read", name);
        for (ssize_t done = 0; done < got;) {
            const ssize_t put = ::write(out, buffer + done, static_cast<size_t>(got - done));
            Must(put > 0, "write the copy of", name);
            done += put;
        }
    }
}

}  // namespace

std::vector<std::string> NamesIn(const std::string &path)
{
    DIR *directory = ::opendir(path.c_str());
    Must(directory, "read", path);
    std::vector<std::string> names;
    while (const dirent *found = ::readdir(directory)) {
        const std::string_view name = found->d_name;
        if (name != "." && name != "..")
            names.emplace_back(name);
    }
    ::closedir(directory);
    return names;
}

void CopyFile(const std::string &from, const std::string &to)
{
    const int in = ::open(from.c_str(), O_RDONLY | O_CLOEXEC);
    Must(in >= 0, "open", from);
    struct stat facts;
    Must(::fstat(in, &facts) == 0, "look at", from);
    const int out = ::open(to.c_str(), O_WRONLY | O_CREAT | O_EXCL | O_CLOEXEC, facts.st_mode & 0777);
    Must(out >= 0, "create", to);
    CopyBytes(in, out, from);
    ::close(in);
    Must(::close(out) == 0, "write", to);
}

void MakeEntry(const Entry &entry, const std::string &tree, const std::string &place)
{
    const std::string from = tree + "/" + entry.path;
    const std::string to = place + "/" + entry.path;
    if (entry.kind == 'l') {
        Must(::symlink(ReadLink(from).c_str(), to.c_str()) == 0, "link", to);
        return;
    }
    if (entry.kind == 'f')
        CopyFile(from, to);
    else
        Must(::mkdir(to.c_str(), 0755) == 0 || errno == EEXIST, "make", to);
    // Where only one user id is mapped everything belongs to root; TAVO_ROOT_LACKS says "uids" then.
    if (entry.uid != 0 || entry.gid != 0)
        static_cast<void>(::lchown(to.c_str(), entry.uid, entry.gid) == 0);
    Must(::chmod(to.c_str(), entry.mode) == 0, "set the mode of", to);
}

void MakeParents(const std::string &place, std::string_view path)
{
    for (size_t slash = path.find('/', 1); slash != std::string_view::npos; slash = path.find('/', slash + 1)) {
        const std::string parent = place + std::string(path.substr(0, slash));
        Must(::mkdir(parent.c_str(), 0755) == 0 || errno == EEXIST, "make", parent);
    }
}

void MakePlaceFor(const std::string &from, const std::string &to)
{
    struct stat facts;
    Must(::stat(from.c_str(), &facts) == 0, "find", from);
    if (S_ISDIR(facts.st_mode)) {
        Must(::mkdir(to.c_str(), 0755) == 0 || errno == EEXIST, "make", to);
        return;
    }
    const int place = ::open(to.c_str(), O_WRONLY | O_CREAT | O_CLOEXEC, 0644);
    const int error = errno;
    const bool there = place >= 0 || ::access(to.c_str(), F_OK) == 0;
    errno = error;
    Must(there, "make", to);
    ::close(place);
}

// Files become hard links where the file system allows it; `skip` is the root itself when it is below `from`, and the
// build system's own folders, which are not needed inside.
void LinkTree(const std::string &from, const std::string &to, const std::string &skip)
{
    struct stat facts;
    Must(::lstat(from.c_str(), &facts) == 0, "look at", from);
    if (S_ISLNK(facts.st_mode)) {
        Must(::link(from.c_str(), to.c_str()) == 0 || ::symlink(ReadLink(from).c_str(), to.c_str()) == 0, "link", to);
    } else if (S_ISDIR(facts.st_mode)) {
        Must(::mkdir(to.c_str(), 0755) == 0 || errno == EEXIST, "make", to);
        for (const std::string &name : NamesIn(from)) {
            const std::string inner = from + "/" + name;
            if (inner != skip && name != "CMakeFiles" && name != ".git")
                LinkTree(inner, to + "/" + name, skip);
        }
        Must(::chmod(to.c_str(), facts.st_mode & 07777) == 0, "set the mode of", to);
    } else if (S_ISREG(facts.st_mode)) {
        if (::link(from.c_str(), to.c_str()) != 0)
            CopyFile(from, to);
    }
}

void RemoveTree(const std::string &path)
{
    struct stat facts;
    if (::lstat(path.c_str(), &facts) != 0)
        return;
    if (!S_ISDIR(facts.st_mode)) {
        ::unlink(path.c_str());
        return;
    }
    for (const std::string &name : NamesIn(path))
        RemoveTree(path + "/" + name);
    ::rmdir(path.c_str());
}

std::string MakeRunDirectory(const std::string &root)
{
    for (const std::string &parent : {root + "/runs", std::string("/tmp")}) {
        std::string path = parent + "/appliance.XXXXXX";
        if (::mkdtemp(path.data())) {
            Must(::chmod(path.c_str(), 0755) == 0, "set the mode of", path);
            return path;
        }
    }
    Die("cannot make a directory below %s/runs or /tmp", root.c_str());
}

}  // namespace enter
