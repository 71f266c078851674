// The contents of some folders, as a value that can be compared and restored.
#ifndef TESTS_SUPPORT_FILE_SNAPSHOT_H
#define TESTS_SUPPORT_FILE_SNAPSHOT_H

#include "support/test.h"

namespace test {

struct KeptFile {
    struct stat facts;
    std::string content;  // of a file; the target of a link

    bool SameContent(const KeptFile &other) const
    {
        return (facts.st_mode & S_IFMT) == (other.facts.st_mode & S_IFMT) && content == other.content;
    }
};

using KeptFiles = std::map<std::string, KeptFile>;

class FileSnapshot {
  public:
    explicit FileSnapshot(std::vector<std::string> folders);

    const KeptFiles &Files() const { return files_; }

    // Reads the current state; contents of files that have not been touched since are taken from here.
    KeptFiles Now() const;

    // Restores changed files, including owner, mode and modification time, and removes new ones.
    void Restore();

  private:
    std::vector<std::string> folders_;
    KeptFiles files_;
};

}  // namespace test

#endif
