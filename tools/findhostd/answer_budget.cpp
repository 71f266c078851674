// How many queries are answered, and whose.
#include "answer_budget.h"

#include <algorithm>

namespace findhostd {

bool AnswerBudget::Take(in_addr asker, int64_t now) noexcept
{
    if (!all_.HasRoom(now))
        return false;
    auto source =
        std::find_if(sources_.begin(), sources_.end(), [&](const Source &one) { return one.address == asker.s_addr; });
    const bool known = source != sources_.end();
    const bool recent = known && now - source->answers.Last() < kRecent;
    if (recent && (!source->answers.HasRoom(now) || !recent_.HasRoom(now)))
        return false;
    if (!known) {
        source = std::min_element(sources_.begin(), sources_.end(), [](const Source &left, const Source &right) {
            return left.answers.Last() < right.answers.Last();
        });
        *source = {asker.s_addr, {}};
    }
    if (recent)
        recent_.Note(now);
    source->answers.Note(now);
    all_.Note(now);
    return true;
}

}  // namespace findhostd
