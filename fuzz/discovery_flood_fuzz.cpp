// A flood of queries and replies at any moments and from any addresses: how many are answered, and who is listed.
#include "answer_budget.h"
#include "host_table.h"
#include "input.h"

#include <algorithm>
#include <deque>
#include <set>
#include <sstream>

using fuzz::Check;

namespace {

struct Answer {
    int64_t when;
    in_addr_t to;
};

// Each event is 4 bytes: milliseconds since the last one, two of the address, what happens.
struct Event {
    int64_t pause;
    in_addr_t address;
    uint8_t what;
};

void CheckAnswers(std::deque<Answer> &answers, const Answer &newest)
{
    while (!answers.empty() && newest.when - answers.front().when >= 1000)
        answers.pop_front();
    answers.push_back(newest);
    Check(answers.size() <= findhostd::AnswerBudget::kAnswersASecond, "50 answers a second in all");
    const auto to_one =
        std::count_if(answers.begin(), answers.end(), [&](const Answer &one) { return one.to == newest.to; });
    Check(static_cast<size_t>(to_one) <= findhostd::AnswerBudget::kToOneAddress, "2 answers a second to one address");
}

void CheckList(const std::string &text, size_t size)
{
    std::set<std::string> addresses;
    std::istringstream lines(text);
    size_t count = 0;
    for (std::string line; std::getline(lines, line); ++count) {
        const size_t end = line.rfind(',');
        const size_t begin = line.rfind(',', end - 1);
        Check(addresses.insert(line.substr(begin, end - begin)).second, "an address is listed once");
    }
    Check(count == size && size <= findhostd::HostTable::kMost, "the table has a line for each");
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const uint8_t *data, size_t size)
{
    static findhostd::HostTable table;
    findhostd::AnswerBudget budget;
    table = {};
    std::deque<Answer> answers;
    int64_t now = 1;
    for (; size >= 4; data += 4, size -= 4) {
        const Event event = {data[0], static_cast<in_addr_t>(data[1] << 8 | data[2]), data[3]};
        now += event.pause;
        const in_addr address = {event.address + 1};
        if (event.what < 128) {
            if (budget.Take(address, now))
                CheckAnswers(answers, {now, address.s_addr});
        } else if (event.what < 250) {
            findhostd::Host host{};
            host.address = address;
            host.name[0] = static_cast<char>('a' + event.what % 26);
            host.model = 1;
            host.protocol = 240;
            table.Put(host, 1, now);
            Check(!table.Put(host, 1, now), "said twice, it changes nothing");
        } else {
            table.NoteQuery(now);
            const std::string text = table.Text(now);
            CheckList(text, table.Size());
        }
    }
    return 0;
}
