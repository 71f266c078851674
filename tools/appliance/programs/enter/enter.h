// Runs a command in a private copy of an appliance root: what the parts of the program share.
#ifndef TOOLS_APPLIANCE_ENTER_H
#define TOOLS_APPLIANCE_ENTER_H

#include <string>
#include <string_view>
#include <vector>

#include <sys/types.h>

namespace enter {

inline constexpr int exit_refused = 125;  // the root could not be entered: no status of the command

enum class Form { any, namespaces, chroot };

struct Bind {
    std::string from;
    std::string to;  // absolute, inside
    bool writable;
};

// One line of the manifest: how one path of the private copy comes into being.
struct Entry {
    char kind;  // d directory, f copied file, l link, r read-only part of the tree, t directory on a file system of its
                // own
    mode_t mode;
    uid_t uid;
    gid_t gid;
    std::string path;  // relative to the root
};

struct Request {
    std::string root;      // what `build` made: tree/, manifest, mnt/
    std::string emulator;  // static user-mode emulator for programs of another architecture; empty: none
    std::string cwd;       // the caller's working directory
    std::vector<Entry> entries;
    std::vector<Bind> binds;
    std::vector<std::string> command;
    Form form = Form::any;
    bool keep = false;
    char *arguments = nullptr;  // the memory of our own command line
    size_t arguments_size = 0;
};

// options.cpp
Request ReadOptions(int argc, char **argv);

// manifest.cpp
std::vector<Entry> ReadManifest(const std::string &root);

// copy.cpp: everything that makes files
void MakeEntry(const Entry &entry, const std::string &tree, const std::string &place);
void MakeParents(const std::string &place, std::string_view path);
void MakePlaceFor(const std::string &from, const std::string &to);  // an empty file or directory, as `from` is
std::vector<std::string> NamesIn(const std::string &path);
void CopyFile(const std::string &from, const std::string &to);
void LinkTree(const std::string &from, const std::string &to, const std::string &skip);
void RemoveTree(const std::string &path);
extern std::string unfinished;  // a run directory that goes when the program dies of an error
std::string MakeRunDirectory(const std::string &root);

// command.cpp: runs in the entered root, does not return
[[noreturn]] void RunCommand(const Request &request, const char *form, const std::string &lacks, bool emulate);
void DropCapabilities(bool whole_machine_is_visible);

// supervise.cpp
void BlockSignals();
void UnblockSignals();
int WaitFor(pid_t command, bool from_outside_only);  // forwards signals meanwhile; gives the wait status
void KillLeftovers();                                // of a subreaper
[[noreturn]] void EndAs(int wait_status);            // the same exit status, or the same death

// The two forms. Each gives the command's wait status, or -1 with `why` when this form is refused here.
int EnterNamespaces(const Request &request, std::string *why);
int EnterChroot(const Request &request, std::string *why);

// enter.cpp
[[noreturn, gnu::format(printf, 1, 2)]] void Die(const char *format, ...);
void Must(bool done, const char *what, const std::string &path);  // dies with errno's text

}  // namespace enter

#endif
