// A place in the source: a file and a line of it.
#ifndef TAVO_CORE_DETAIL_WHERE_H
#define TAVO_CORE_DETAIL_WHERE_H

namespace tavo {

// A published line number: log watchers and support staff know it, so it stays when the code moves.
struct Line {
    int number;
};

// As a default argument it is the caller's place. A function that reports for its caller takes one and passes it on.
struct Where {
    constexpr Where(const char *source = __builtin_FILE(), int number = __builtin_LINE()) noexcept
        : file(source), line(number)
    {
    }
    constexpr Where(Line published, const char *source = __builtin_FILE()) noexcept
        : file(source), line(published.number)
    {
    }

    const char *file;
    int line;
};

// Returns the module of a place: the base name of its file, which the error state and the log show. The text never
// changes and is never freed, because programs keep the pointer. Only files of the library have a module; for others it
// is "unknown".
const char *ModuleOf(const Where &where) noexcept;

}  // namespace tavo

using tavo::Line;

#endif
