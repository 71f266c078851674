// "Did you mean": the known word with the fewest typing mistakes.
#include "frame/suggestion.h"

#include <algorithm>
#include <numeric>
#include <utility>

namespace tavoctl {
namespace {

// Insertions, deletions, replacements and swaps of neighbours.
std::size_t Mistakes(const std::string &from, const std::string &to)
{
    std::vector<std::size_t> before(to.size() + 1), row(to.size() + 1), next(to.size() + 1);
    std::iota(row.begin(), row.end(), std::size_t{0});
    for (std::size_t i = 1; i <= from.size(); ++i) {
        next[0] = i;
        for (std::size_t j = 1; j <= to.size(); ++j) {
            next[j] = std::min({row[j] + 1, next[j - 1] + 1, row[j - 1] + (from[i - 1] != to[j - 1])});
            if (i > 1 && j > 1 && from[i - 1] == to[j - 2] && from[i - 2] == to[j - 1])
                next[j] = std::min(next[j], before[j - 2] + 1);
        }
        before = std::exchange(row, next);
    }
    return row.back();
}

}  // namespace

std::string DidYouMean(const std::string &word, const std::vector<std::string> &known, const std::string &otherwise)
{
    constexpr std::size_t longest = 64;
    std::string best;
    std::size_t fewest = std::max<std::size_t>(2, word.size() / 3) + 1;
    for (const std::string &name : known) {
        if (name.size() > longest || word.size() > longest)
            continue;
        const bool begins = word.size() >= 2 && name.starts_with(word);
        const std::size_t mistakes = begins ? 1 : Mistakes(word, name);
        if (mistakes && mistakes < std::min(fewest, name.size())) {
            fewest = mistakes;
            best = name;
        }
    }
    return best.empty() ? otherwise : "did you mean " + best + "?";
}

}  // namespace tavoctl
