// A directory of a test's own, removed with everything in it, and whole files in one call.
#ifndef TESTS_SUPPORT_SCRATCH_DIR_H
#define TESTS_SUPPORT_SCRATCH_DIR_H

#include <string>
#include <string_view>
#include <vector>

namespace test {

class ScratchDir {
  public:
    explicit ScratchDir(const std::string &parent = "/tmp");
    ~ScratchDir();
    ScratchDir(const ScratchDir &) = delete;
    ScratchDir &operator=(const ScratchDir &) = delete;

    const std::string &Path() const { return path_; }
    std::string operator/(std::string_view name) const { return path_ + "/" + std::string(name); }

    // Returns the names in it, sorted: leftovers of a failed rewrite show here.
    std::vector<std::string> Names() const;

  private:
    std::string path_;
};

std::string ReadFile(const std::string &path);  // fails the test when it cannot be read
void WriteFile(const std::string &path, std::string_view text, unsigned mode = 0644);

}  // namespace test

#endif
