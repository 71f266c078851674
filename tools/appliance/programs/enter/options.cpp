// Reads enter's command line.
#include "enter.h"

#include <cstdio>
#include <cstdlib>
#include <cstring>

#include <unistd.h>

namespace enter {
namespace {

constexpr char usage[] =
    "usage: enter [OPTION]... [--] [COMMAND ARGUMENT...]\n"
    "Runs COMMAND (an interactive shell when there is none) in a private copy of an appliance root.\n"
    "  --root DIR                 what tools/appliance/build made there (default: build/appliance of the tree)\n"
    "  --form namespaces|chroot   how to enter (default: namespaces, chroot where they are refused)\n"
    "  --bind SRC[:DST]           SRC is readable inside as DST, an absolute path (default: the same path)\n"
    "  --bind-rw SRC[:DST]        and writable\n"
    "  --emulator FILE            static user-mode emulator for programs of another architecture\n"
    "  --keep                     keep the private copy and print its path\n"
    "Exit status: the command's, also its death by a signal; 125 the root could not be entered; 126 the command\n"
    "cannot be run; 127 there is no such command.\n";

std::string Absolute(const std::string &path)
{
    char *whole = ::realpath(path.c_str(), nullptr);
    Must(whole, "find", path);
    std::string result = whole;
    std::free(whole);
    return result;
}

// The destination keeps the caller's spelling: a path that is compiled into a program must be found inside as it is.
Bind ReadBind(const std::string &text, bool writable, const std::string &cwd)
{
    const size_t colon = text.find(':');
    std::string to = text.substr(colon == std::string::npos ? 0 : colon + 1);
    if (to.empty() || to[0] != '/')
        to = cwd + "/" + to;
    while (to.size() > 1 && to.back() == '/')
        to.pop_back();
    return {Absolute(text.substr(0, colon)), to, writable};
}

Form ReadForm(const std::string &name)
{
    if (name == "namespaces")
        return Form::namespaces;
    if (name == "chroot")
        return Form::chroot;
    Die("no such form: %s", name.c_str());
}

}  // namespace

Request ReadOptions(int argc, char **argv)
{
    Request request;
    char cwd[4096];
    Must(::getcwd(cwd, sizeof cwd), "find", "the current directory");
    request.cwd = cwd;
    int i = 1;
    const auto value = [&] {
        if (i + 1 >= argc)
            Die("%s needs a value", argv[i]);
        return std::string(argv[++i]);
    };
    for (; i < argc && argv[i][0] == '-'; ++i) {
        const std::string_view option = argv[i];
        if (option == "--") {
            ++i;
            break;
        }
        if (option == "--root")
            request.root = Absolute(value());
        else if (option == "--form")
            request.form = ReadForm(value());
        else if (option == "--bind" || option == "--bind-rw")
            request.binds.push_back(ReadBind(value(), option == "--bind-rw", request.cwd));
        else if (option == "--emulator")
            request.emulator = Absolute(value());
        else if (option == "--keep")
            request.keep = true;
        else if (option == "--help") {
            std::fputs(usage, stdout);
            std::exit(0);
        } else {
            std::fputs(usage, stderr);
            Die("no such option: %s", argv[i]);
        }
    }
    if (request.root.empty())
        Die("no root: give --root DIR");
    request.entries = ReadManifest(request.root);
    request.arguments = argv[0];
    request.arguments_size = static_cast<size_t>(argv[argc - 1] + std::strlen(argv[argc - 1]) - argv[0]);
    request.command.assign(argv + i, argv + argc);
    if (request.command.empty())
        request.command = {"/bin/bash", "--norc"};
    return request;
}

}  // namespace enter
