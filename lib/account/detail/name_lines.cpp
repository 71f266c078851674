// Changes the lines of users in a file of another program.
#include "account/detail/name_lines.h"

#include "tavo_str.h"

#include "core/detail/keep_fault.h"
#include "core/detail/line_reader.h"

namespace tavo {

bool NameLines::Read()
{
    if (state_ != kUnread)
        return state_ == kRead;
    state_ = kUnreadable;
    std::string text;
    if (file_.Open(path_) != 0 ? !file_.IsMissing() : !file_.Read(text))
        return false;
    for (std::string_view rest = text; !rest.empty();)
        lines_.emplace_back(TakeWholeLine(rest));
    state_ = kRead;
    return true;
}

bool NameLines::Change(const std::string &name, const std::function<std::string(std::string_view line)> &change)
{
    const KeepFault keep;
    bool found = false;
    for (std::string &line : lines_) {
        const std::string its_name(WithoutNewline(std::string_view(line).substr(0, line.find(':'))));
        if (line.empty() || TLIBUnicodeUTF8StrCaseCmp(its_name.c_str(), name.c_str()) != 0)
            continue;
        found = true;
        std::string changed = change(line);
        changed_ = changed_ || changed != line;
        line = std::move(changed);
    }
    return found;
}

void NameLines::Append(const std::string &line)
{
    if (!lines_.empty() && !lines_.back().empty() && !lines_.back().ends_with('\n'))
        lines_.back() += '\n';
    lines_.push_back(line + '\n');
    changed_ = true;
}

Code NameLines::Compose(unsigned target, mode_t mode_of_new, AccountCommit &commit)
{
    if (!changed_)
        return 0;
    std::string text;
    for (const std::string &line : lines_)
        text += line;
    changed_ = false;
    return commit.WriteNeighbour(target, file_, text, mode_of_new);
}

}  // namespace tavo
