// Takes the place of ioctl, sleep, sync, fsync and fdatasync in a test program: the calls are kept in their order, the
// test answers the requests, and nothing waits.
#ifndef TESTS_SUPPORT_RECORDED_CALLS_H
#define TESTS_SUPPORT_RECORDED_CALLS_H

#include <functional>
#include <string>
#include <vector>

namespace test {

class RecordedCalls {
  public:
    // The test's ioctl: returns its result, sets errno, fills in the argument.
    using Request = std::function<int(int fd, unsigned long request, void *argument)>;

    explicit RecordedCalls(Request on_ioctl = {});
    ~RecordedCalls();
    RecordedCalls(const RecordedCalls &) = delete;
    RecordedCalls &operator=(const RecordedCalls &) = delete;

    // "sync", "fsync", "fdatasync", "sleep 10"; requests only where the test's own function notes them.
    const std::vector<std::string> &Calls() const { return calls_; }
    std::vector<std::string> Take()  // those since the last call
    {
        const std::vector<std::string> calls = calls_;
        calls_.clear();
        return calls;
    }
    void Note(std::string call) { calls_.push_back(std::move(call)); }
    void Clear() { calls_.clear(); }
    void OnIoctl(Request on_ioctl) { on_ioctl_ = std::move(on_ioctl); }

    int Ioctl(int fd, unsigned long request, void *argument);

  private:
    Request on_ioctl_;
    std::vector<std::string> calls_;
};

}  // namespace test

#endif
