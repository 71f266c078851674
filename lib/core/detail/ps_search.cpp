// Reads the matches of a search for processes.
#include "core/detail/ps_search.h"

#include "core/detail/strict_number.h"

#include <algorithm>
#include <cstdlib>
#include <new>

namespace tavo {

PsSearch::PsSearch(const std::string &pattern, pid_t *pids, int capacity)
    : plain_("grep " + pattern), quoted_("grep '" + pattern + "'"), pids_(pids), capacity_(capacity)
{
}

void PsSearch::Add(std::string_view line)
{
    if (line.find(plain_) != std::string_view::npos || line.find(quoted_) != std::string_view::npos) {
        listed_ = true;
        return;
    }
    line.remove_prefix(std::min(line.find_first_not_of(" \t"), line.size()));
    const auto pid = LeadingNumber<pid_t>(line);
    if (pid < 1)
        return;
    listed_ = true;
    if (count_ < capacity_)
        pids_[count_] = pid;
    ++count_;
}

void PsSearch::AddLines(std::FILE *stream)
{
    char *line = nullptr;
    size_t size = 0;
    ssize_t length;
    while ((length = ::getline(&line, &size, stream)) >= 0)
        Add({line, static_cast<size_t>(length)});
    const bool all = std::feof(stream) != 0;
    std::free(line);
    if (!all)
        throw std::bad_alloc();
}

}  // namespace tavo
