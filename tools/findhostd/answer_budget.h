// How many queries are answered, and whose.
#ifndef FINDHOSTD_ANSWER_BUDGET_H
#define FINDHOSTD_ANSWER_BUDGET_H

#include <array>
#include <cstddef>
#include <cstdint>

#include <netinet/in.h>

namespace findhostd {

// The last so many moments, so that no more than that fall into any second.
template <size_t Most>
class Window {
  public:
    bool HasRoom(int64_t now) const noexcept { return moments_[next_] == 0 || now - moments_[next_] >= kSecond; }
    void Note(int64_t now) noexcept
    {
        moments_[next_] = now;
        next_ = (next_ + 1) % Most;
    }
    int64_t Last() const noexcept { return moments_[(next_ + Most - 1) % Most]; }

  private:
    static constexpr int64_t kSecond = 1000;

    std::array<int64_t, Most> moments_{};  // milliseconds; 0 is never
    size_t next_ = 0;
};

// Any host on the network may ask at any rate and from any address. So an address gets two answers a second, and most
// answers are reserved for addresses that got none in the last ten seconds. A flood from one address, or from all of a
// small network, leaves room for the others.
class AnswerBudget {
  public:
    static constexpr size_t kAnswersASecond = 50;
    static constexpr size_t kToOneAddress = 2;
    static constexpr size_t kToRecentAskers = 15;  // of the 50
    static constexpr int64_t kRecent = 10000;      // milliseconds

    // Returns whether the asker is answered at `now`, a monotonic time in milliseconds above 0, and counts the answer.
    bool Take(in_addr asker, int64_t now) noexcept;

  private:
    struct Source {
        in_addr_t address;
        Window<kToOneAddress> answers;
    };

    // All sources of ten seconds fit, so an entry that is replaced is not a recent one.
    std::array<Source, kAnswersASecond *(kRecent / 1000) + 12> sources_{};
    Window<kAnswersASecond> all_;
    Window<kToRecentAskers> recent_;
};

}  // namespace findhostd

#endif
