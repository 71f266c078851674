// Settings files against GLib's key files, inih and crudini: one key of a file of 500 lines read, one set, twenty set.
// The files are the program's own, in a temporary directory.
#include "tavo_file.h"

#include "compare.h"

#include <cstdio>
#include <cstring>
#include <filesystem>
#include <fstream>
#include <string>
#include <vector>

#include <fcntl.h>
#include <glib.h>
#include <ini.h>
#include <spawn.h>
#include <sys/wait.h>
#include <unistd.h>

extern char **environ;

namespace {

constexpr int kLines = 500;
constexpr const char *kGroup = "settings";  // GLib and crudini want their keys in a section; it makes no odds to us

uint64_t Digest(const char *value)
{
    uint64_t sum = 0;
    for (; value && *value; ++value)
        sum = sum * 31 + static_cast<unsigned char>(*value);
    return sum;
}

std::string Key(int i)
{
    return "setting_" + std::to_string(i);
}

// As /etc/tavoinfo.conf looks: mostly pairs, some of them quoted, some comments.
std::string SettingsText()
{
    std::string text = std::string("[") + kGroup + "]\n";
    for (int i = 1; i < kLines; ++i) {
        if (i % 25 == 0)
            text += "# what follows is about " + std::to_string(i) + "\n";
        else
            text += Key(i) + "=" + (i % 3 == 0 ? "yes" : "value number " + std::to_string(i)) + "\n";
    }
    return text;
}

uint64_t GetByTavo(const char *path, const char *key)
{
    char value[64] = "";
    TLIBFileGetKeyValue(path, key, value, sizeof value, 0);
    return Digest(value);
}

uint64_t GetByGlib(const char *path, const char *key)
{
    GKeyFile *file = g_key_file_new();
    g_key_file_load_from_file(file, path, G_KEY_FILE_NONE, nullptr);
    gchar *value = g_key_file_get_string(file, kGroup, key, nullptr);
    const uint64_t digest = Digest(value);
    g_free(value);
    g_key_file_free(file);
    return digest;
}

struct Wanted {
    const char *key;
    uint64_t digest;
};

uint64_t GetByInih(const char *path, const char *key)
{
    Wanted wanted{key, 0};
    ini_parse(
        path,
        [](void *user, const char *, const char *name, const char *value) {
            auto *found = static_cast<Wanted *>(user);
            if (found->digest == 0 && std::strcmp(name, found->key) == 0)
                found->digest = Digest(value);
            return 1;
        },
        &wanted);
    return wanted.digest;
}

// Runs crudini with its output in a pipe.
std::string RunCrudini(std::vector<const char *> args)
{
    args.insert(args.begin(), "crudini");
    args.push_back(nullptr);
    int ends[2];
    if (::pipe2(ends, O_CLOEXEC) != 0)
        return {};
    posix_spawn_file_actions_t actions;
    posix_spawn_file_actions_init(&actions);
    posix_spawn_file_actions_adddup2(&actions, ends[1], 1);
    pid_t child = 0;
    const int failed = posix_spawnp(&child, "crudini", &actions, nullptr, const_cast<char **>(args.data()), environ);
    posix_spawn_file_actions_destroy(&actions);
    ::close(ends[1]);
    char output[256];
    const ssize_t length = failed ? 0 : ::read(ends[0], output, sizeof output);
    ::close(ends[0]);
    if (!failed)
        ::waitpid(child, nullptr, 0);
    std::string text(output, length > 0 ? static_cast<size_t>(length) : 0);
    while (text.ends_with('\n'))
        text.pop_back();
    return text;
}

void CompareGet(const std::string &work, const std::string &path, const std::string &key)
{
    bench::Compare(work, kLines,
                   {{"tavo",
                     [=] {
                         return GetByTavo(path.c_str(), key.c_str());
                     }},
                    {"inih",
                     [=] {
                         return GetByInih(path.c_str(), key.c_str());
                     }},
                    {"glib",
                     [=] {
                         return GetByGlib(path.c_str(), key.c_str());
                     }},
                    {"crudini", [=] {
                         return Digest(RunCrudini({"--get", path.c_str(), kGroup, key.c_str()}).c_str());
                     }}});
}

using Keys = std::vector<std::string>;

// Sets every key to the next value of its own and gives what a reader then finds in all of them.
template <class Set>
auto SetAndRead(const std::string &path, const Keys &keys, Set set)
{
    return [=] {
        set(path.c_str(), keys);
        uint64_t sum = 0;
        for (const std::string &key : keys)
            sum = sum * 31 + GetByTavo(path.c_str(), key.c_str());
        return sum;
    };
}

constexpr const char *kNewValue = "another value";

void SetByTavo(const char *path, const Keys &keys)
{
    TLIBSZHASH *pairs = PshTLIBSzHashAlloc(1024);
    for (const std::string &key : keys)
        TLIBSzHashSetValue(&pairs, key.c_str(), kNewValue);
    TLIBFileSetKeys(path, pairs, nullptr);
    TLIBSzHashFree(pairs);
}

void SetByTavoOneByOne(const char *path, const Keys &keys)
{
    for (const std::string &key : keys)
        TLIBFileSetKeyValue(path, key.c_str(), kNewValue, nullptr);
}

void SetByGlib(const char *path, const Keys &keys)
{
    GKeyFile *file = g_key_file_new();
    g_key_file_load_from_file(file, path, G_KEY_FILE_KEEP_COMMENTS, nullptr);
    for (const std::string &key : keys)
        g_key_file_set_string(file, kGroup, key.c_str(), kNewValue);
    g_key_file_save_to_file(file, path, nullptr);
    g_key_file_free(file);
}

void SetByCrudini(const char *path, const Keys &keys)
{
    for (const std::string &key : keys)
        RunCrudini({"--set", path, kGroup, key.c_str(), kNewValue});
}

}  // namespace

int main(int argc, char **argv)
{
    char directory[] = "/tmp/file_bench.XXXXXX";
    if (!::mkdtemp(directory))
        return 1;
    const auto file = [&](const char *name) {
        const std::string path = std::string(directory) + "/" + name;
        std::ofstream(path) << SettingsText();
        return path;
    };
    const std::string read = file("read");
    CompareGet("file_get_first_key", read, Key(1));
    CompareGet("file_get_middle_key", read, Key(kLines / 2 + 1));
    CompareGet("file_get_last_key", read, Key(kLines - 1));

    const Keys one = {Key(kLines / 2 + 1)};
    Keys twenty;
    for (int i = 1; i <= 20; ++i)
        twenty.push_back(Key(i * 23));
    bench::Compare("file_set_key", kLines,
                   {{"tavo", SetAndRead(file("one_tavo"), one, SetByTavoOneByOne)},
                    {"glib", SetAndRead(file("one_glib"), one, SetByGlib)},
                    {"crudini", SetAndRead(file("one_crudini"), one, SetByCrudini)}});
    bench::Compare("file_set_20_keys", kLines,
                   {{"tavo", SetAndRead(file("many_tavo"), twenty, SetByTavo)},
                    {"tavo_one_by_one", SetAndRead(file("many_single"), twenty, SetByTavoOneByOne)},
                    {"glib", SetAndRead(file("many_glib"), twenty, SetByGlib)}});
    const int status = bench::Run(argc, argv);
    std::filesystem::remove_all(directory);
    return status;
}
