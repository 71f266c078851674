// Compares the text files of accounts with the stores that the library keeps of them, without changing either.
#ifndef TAVOCTL_ACCOUNT_CHECK_H
#define TAVOCTL_ACCOUNT_CHECK_H

#include "frame/verb.h"

#include <map>

namespace tavoctl {

struct CheckedFile {
    const char *path;
    const char *store;
    std::vector<std::string> fields;  // of a line, between colons; the first is the name
};

struct Finding {
    std::string name;  // of the account; empty: the whole file
    std::string file;
    std::string text;
};

inline constexpr Column<Finding> finding_columns[] = {
    {"name", [](const Finding &finding) { return Maybe(finding.name); }, "of the account; null: the whole file"},
    {"file", field<&Finding::file>},
    {"finding", field<&Finding::text>},
};

using LinesByKey = std::map<std::string, std::string>;

class AccountCheck {
  public:
    // The file of accounts themselves comes first, then those that say more about each.
    AccountCheck(std::vector<CheckedFile> files, const char *id_store);

    // Everything that is wrong, in the order of the files. Hold the lock of the family.
    const std::vector<Finding> &Run();
    const LinesByKey &Lines(std::size_t file) const { return lines_[file]; }
    void Add(const std::string &name, const std::string &file, const std::string &text);

    // The findings, and the exit status that they give.
    void Print(Call &call) const;

  private:
    void ReadFile(std::size_t index);
    void CompareStore(std::size_t index);
    void CheckIds();

    std::vector<CheckedFile> files_;
    const char *id_store_;
    std::vector<LinesByKey> lines_;
    std::vector<Finding> findings_;
};

std::vector<std::string> SplitFields(const std::string &line);
// Those of each line of a file; none where it cannot be read.
std::vector<std::vector<std::string>> FieldsIn(const std::string &path);

}  // namespace tavoctl

#endif
