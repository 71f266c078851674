// Compares the text files of accounts with the stores that the library keeps of them.
#include "account/account_check.h"

#include "tavo_bdb.h"

#include "account/account_rules.h"
#include "frame/files.h"
#include "frame/private_copy.h"
#include "frame/text.h"

#include <cstdio>
#include <cstdlib>
#include <fstream>

#include <fcntl.h>
#include <sys/stat.h>

namespace tavoctl {
namespace {

class OpenStore {
  public:
    explicit OpenStore(const char *path) : db_(TAVOBDbOpen(path, O_RDONLY, 0)) {}
    ~OpenStore()
    {
        if (db_)
            TAVOBDbClose(db_);
    }
    OpenStore(const OpenStore &) = delete;
    OpenStore &operator=(const OpenStore &) = delete;

    explicit operator bool() const { return db_; }
    TAVOBDB *Get() const { return db_; }

    // Every entry that is not bookkeeping, without the NULs. Nothing when the walk does not reach the end.
    std::optional<LinesByKey> Entries() const
    {
        LinesByKey entries;
        TAVOBDbCursorSetType(db_, TAVO_BDB_CURSOR_FIRST);
        for (;;) {
            void *key = nullptr, *value = nullptr;
            int key_size = 0, value_size = 0;
            if (TAVOBDbCursorGet(db_, 1, &key, &key_size, &value, &value_size) != 0)
                break;
            entries.emplace(static_cast<const char *>(key), static_cast<const char *>(value));
            TAVOBDbFree(key);
            TAVOBDbFree(value);
            TAVOBDbCursorSetType(db_, TAVO_BDB_CURSOR_NEXT);
        }
        return TLIBErrGet() == ERR_DB_END ? std::optional(entries) : std::nullopt;
    }

  private:
    TAVOBDB *db_;
};

bool IsAway(const char *path)
{
    struct stat state = {};
    return ::lstat(path, &state) != 0;
}

// The entries of a store, read from a copy: opening one where it is may repair it. Else a reason.
std::optional<LinesByKey> ReadStore(const char *path, std::string &reason)
{
    struct stat state = {};
    if (::lstat(path, &state) != 0) {
        reason = "the store is missing";
        return {};
    }
    reason = "the store is damaged";
    if (!S_ISREG(state.st_mode))
        return {};
    const PrivateCopy copy(path);
    const OpenStore store(copy.Path().c_str());
    return store ? store.Entries() : std::nullopt;
}

// Names the fields in which the two lines differ. Their contents may be secret.
std::string Difference(const std::string &in_file, const std::string &in_store, const std::vector<std::string> &names)
{
    const std::vector<std::string> a = SplitFields(in_file);
    const std::vector<std::string> b = SplitFields(in_store);
    if (a.size() != b.size() || a.size() > names.size())
        return "file and store differ in the number of fields";
    std::vector<std::string> differing;
    for (std::size_t i = 0; i < a.size(); ++i)
        if (a[i] != b[i])
            differing.push_back(names[i]);
    return "file and store differ in " + Joined(differing, ", ");
}

// Daemons may share an id among themselves; people, and root, must not.
bool MustBeAlone(int id)
{
    constexpr int first_of_people = 1024;
    return id == 0 || id >= first_of_people;
}

}  // namespace

std::vector<std::string> SplitFields(const std::string &line)
{
    std::vector<std::string> fields;
    for (std::size_t at = 0;;) {
        const std::size_t end = line.find(':', at);
        fields.push_back(line.substr(at, end - at));
        if (end == std::string::npos)
            return fields;
        at = end + 1;
    }
}

std::vector<std::vector<std::string>> FieldsIn(const std::string &path)
{
    return Mapped(Split(FileText(path), '\n'), SplitFields);
}

AccountCheck::AccountCheck(std::vector<CheckedFile> files, const char *id_store)
    : files_(std::move(files)), id_store_(id_store), lines_(files_.size())
{
}

void AccountCheck::Add(const std::string &name, const std::string &file, const std::string &text)
{
    findings_.push_back({name, file, text});
}

void AccountCheck::ReadFile(std::size_t index)
{
    const CheckedFile &file = files_[index];
    std::ifstream in(file.path);
    if (!in && IsAway(file.path))
        return Add("", file.path, "the file is missing");
    Must(in.is_open(), std::string("read ") + file.path);
    int number = 0;
    for (std::string line; std::getline(in, line);) {
        ++number;
        if (line.empty() || line.front() == '#')
            continue;
        const std::vector<std::string> fields = SplitFields(line);
        if (fields.size() != file.fields.size() || fields[0].empty()) {
            Add(fields[0], file.path,
                "line " + std::to_string(number) + " has " + std::to_string(fields.size()) + " fields and not " +
                    std::to_string(file.fields.size()) + ", or no name");
            continue;
        }
        const std::string key = AccountKey(fields[0]);
        if (!lines_[index].emplace(key, line).second)
            Add(fields[0], file.path, "the name is there twice");
        if (index > 0 && !lines_[0].contains(key))
            Add(fields[0], file.path, std::string("it is not in ") + files_[0].path);
    }
}

void AccountCheck::CompareStore(std::size_t index)
{
    const CheckedFile &file = files_[index];
    std::string reason;
    const std::optional<LinesByKey> store = ReadStore(file.store, reason);
    if (!store)
        return Add("", file.path, reason);
    for (const auto &[key, line] : lines_[index]) {
        if (index > 0 && !lines_[0].contains(key))
            continue;  // said already
        const auto found = store->find(key);
        if (found == store->end())
            Add(SplitFields(line)[0], file.path, "it is in the file only");
        else if (found->second != line)
            Add(SplitFields(line)[0], file.path, Difference(line, found->second, file.fields));
    }
    for (const auto &[key, line] : *store)
        if (!lines_[index].contains(key))
            Add(SplitFields(line)[0], file.path, "it is in the store only");
}

// The third field of a line is the id, and the store of ids leads from it to the account.
void AccountCheck::CheckIds()
{
    std::string reason;
    const std::optional<LinesByKey> ids = ReadStore(id_store_, reason);
    if (!ids)
        return Add("", id_store_, reason);
    std::map<int, std::vector<std::string>> holders;
    for (const auto &[key, line] : lines_[0]) {
        const std::vector<std::string> fields = SplitFields(line);
        const int id = std::atoi(fields[2].c_str());
        char id_key[16];
        std::snprintf(id_key, sizeof id_key, "%06d", id);
        const auto found = ids->find(id_key);
        if (found == ids->end())
            Add(fields[0], id_store_, "its id " + fields[2] + " is not in the store");
        holders[id].push_back(fields[0]);
    }
    for (const auto &[id, names] : holders)
        if (names.size() > 1 && MustBeAlone(id))
            Add("", files_[0].path, "the id " + std::to_string(id) + " is shared: " + Joined(names, ", "));
    for (const auto &[id, key] : *ids)
        if (!lines_[0].contains(key))
            Add("", id_store_, "the id " + id + " leads to " + key + ", which is not an account");
}

const std::vector<Finding> &AccountCheck::Run()
{
    bool none = IsAway(id_store_);
    for (std::size_t i = 0; i < files_.size(); ++i) {
        ReadFile(i);
        none = none && IsAway(files_[i].store);
    }
    if (none)
        return findings_;  // after a start of the machine: they are built when they are needed
    for (std::size_t i = 0; i < files_.size(); ++i)
        CompareStore(i);
    CheckIds();
    return findings_;
}

void AccountCheck::Print(Call &call) const
{
    call.List(finding_columns, findings_);
    call.status = findings_.empty() ? exit_done : exit_failed;
}

}  // namespace tavoctl
