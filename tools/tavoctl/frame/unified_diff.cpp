// The difference between two texts as patch(1) reads it: the shortest edit script of their lines, in hunks.
#include "frame/unified_diff.h"

#include <algorithm>
#include <vector>

namespace tavoctl {
namespace {

constexpr std::size_t context = 3;  // unchanged lines around a change
constexpr int most_edits = 2000;    // of a difference that is looked for; beyond, the whole middle counts as replaced

using Lines = std::vector<std::string_view>;  // with their newlines

Lines Split(std::string_view text)
{
    Lines lines;
    while (!text.empty()) {
        const std::size_t length = std::min(text.find('\n'), text.size() - 1) + 1;
        lines.push_back(text.substr(0, length));
        text.remove_prefix(length);
    }
    return lines;
}

struct Edit {
    char mark;  // ' ', '-' or '+'
    std::string_view line;
};

// The greedy search for the shortest script: best[k] is how far into `before` a path of d edits comes on the diagonal k
// (lines of before minus lines of after). Each round's state is kept for walking back.
std::vector<Edit> ShortestScript(const Lines &before, const Lines &after)
{
    const int n = static_cast<int>(before.size());
    const int m = static_cast<int>(after.size());
    const int limit = std::min(n + m, most_edits);
    const auto left = [&](int i) { return before[static_cast<std::size_t>(i)]; };
    const auto right = [&](int i) { return after[static_cast<std::size_t>(i)]; };
    const auto index = [](int k, int d) { return static_cast<std::size_t>(k + d + 1); };

    std::vector<std::vector<int>> rounds;
    std::vector<int> best = {0, 0, 0};
    int x = 0;
    int y = 0;
    int d = 0;
    for (bool found = false; !found; ++d) {
        if (d > limit) {
            std::vector<Edit> all;
            for (const std::string_view line : before)
                all.push_back({'-', line});
            for (const std::string_view line : after)
                all.push_back({'+', line});
            return all;
        }
        std::vector<int> next(2 * static_cast<std::size_t>(d) + 5, -1);
        for (int k = -d; k <= d && !found; k += 2) {
            const bool down = d == 0 || k == -d || (k != d && best[index(k - 1, d - 1)] < best[index(k + 1, d - 1)]);
            x = d == 0 ? 0 : down ? best[index(k + 1, d - 1)] : best[index(k - 1, d - 1)] + 1;
            for (y = x - k; x < n && y < m && left(x) == right(y); ++y)
                ++x;
            next[index(k, d)] = x;
            found = x >= n && y >= m;
        }
        rounds.push_back(std::move(best));
        best = std::move(next);
    }

    std::vector<Edit> script;
    for (--d; d >= 0; --d) {
        const std::vector<int> &past = rounds[static_cast<std::size_t>(d)];
        const int k = x - y;
        const bool down = d > 0 && (k == -d || (k != d && past[index(k - 1, d - 1)] < past[index(k + 1, d - 1)]));
        const int from = d == 0 ? 0 : down ? past[index(k + 1, d - 1)] : past[index(k - 1, d - 1)];
        const int start = d == 0 ? 0 : down ? from : from + 1;
        for (; x > start; --x, --y)
            script.push_back({' ', left(x - 1)});
        if (d > 0 && down)
            script.push_back({'+', right(--y)});
        else if (d > 0)
            script.push_back({'-', left(--x)});
    }
    std::reverse(script.begin(), script.end());
    return script;
}

std::string Range(std::size_t start, std::size_t count)
{
    // A range without lines is numbered by the line before it.
    return std::to_string(count ? start + 1 : start) + (count == 1 ? "" : "," + std::to_string(count));
}

}  // namespace

std::string UnifiedDiff(std::string_view before, std::string_view after, const std::string &name_before,
                        const std::string &name_after)
{
    if (before == after)
        return {};
    const std::vector<Edit> script = ShortestScript(Split(before), Split(after));
    const auto changed = [](const Edit &edit) { return edit.mark != ' '; };

    std::string diff = "--- " + name_before + "\n+++ " + name_after + "\n";
    std::size_t line_before = 0;
    std::size_t line_after = 0;
    for (std::size_t i = 0; i < script.size();) {
        const auto first = std::find_if(script.begin() + static_cast<std::ptrdiff_t>(i), script.end(), changed);
        if (first == script.end())
            break;
        // A hunk begins with its context and ends where the next change is further away than both contexts.
        const auto at = static_cast<std::size_t>(first - script.begin());
        const std::size_t begin = std::max(i, at - std::min(at, context));
        std::size_t end = at;
        for (std::size_t j = at; j < script.size() && j <= end + 2 * context; ++j)
            if (changed(script[j]))
                end = j;
        end = std::min(script.size(), end + 1 + context);
        line_before += begin - i;
        line_after += begin - i;

        std::string body;
        std::size_t count_before = 0;
        std::size_t count_after = 0;
        for (i = begin; i < end; ++i) {
            body += script[i].mark + std::string(script[i].line);
            if (!script[i].line.ends_with('\n'))
                body += "\n\\ No newline at end of file\n";
            count_before += script[i].mark != '+';
            count_after += script[i].mark != '-';
        }
        diff += "@@ -" + Range(line_before, count_before) + " +" + Range(line_after, count_after) + " @@\n" + body;
        line_before += count_before;
        line_after += count_after;
    }
    return diff;
}

}  // namespace tavoctl
