// The matches of a search for processes, read line by line.
#ifndef TAVO_CORE_DETAIL_PS_SEARCH_H
#define TAVO_CORE_DETAIL_PS_SEARCH_H

#include <cstdio>
#include <string>
#include <string_view>

#include <sys/types.h>

namespace tavo {

class PsSearch {
  public:
    // Stores the first `capacity` pids, and counts all.
    PsSearch(const std::string &pattern, pid_t *pids, int capacity);

    // A line without a pid (a title, a complaint of grep) is not a process.
    void Add(std::string_view line);

    // Throws bad_alloc when the stream cannot be read to its end: an incomplete list would hide running processes.
    void AddLines(std::FILE *stream);

    // The search itself is a process that matches: no line at all means that no processes were listed.
    bool HasListed() const { return listed_; }
    int Count() const { return count_; }

  private:
    std::string plain_;
    std::string quoted_;
    pid_t *pids_;
    int capacity_;
    int count_ = 0;
    bool listed_ = false;
};

}  // namespace tavo

#endif
