// Takes the place of syslog in a test program: the library's log lines are kept and can be compared.
#ifndef TESTS_SUPPORT_CAPTURED_LOG_H
#define TESTS_SUPPORT_CAPTURED_LOG_H

#include <string>
#include <vector>

namespace test {

struct LoggedLine {
    int priority;
    std::string text;

    bool operator==(const LoggedLine &) const = default;
};

// Lines are kept from its construction on; one object at a time.
class CapturedLog {
  public:
    CapturedLog();
    ~CapturedLog();
    CapturedLog(const CapturedLog &) = delete;
    CapturedLog &operator=(const CapturedLog &) = delete;

    const std::vector<LoggedLine> &Lines() const { return lines_; }
    std::vector<std::string> Texts() const;
    // The texts since the last call, with "#" for the number after a module's name: "raid_stop:# Bad parameters".
    std::vector<std::string> TakeTexts();
    // The same, one below the other.
    std::string Take();
    void Clear() { lines_.clear(); }

    void Add(int priority, std::string text) { lines_.push_back({priority, std::move(text)}); }

  private:
    std::vector<LoggedLine> lines_;
};

}  // namespace test

#endif
