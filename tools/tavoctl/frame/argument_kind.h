// The valid values of an argument, checked before a verb runs, so that a message names a wrong one and the allowed
// values.
#ifndef TAVOCTL_ARGUMENT_KIND_H
#define TAVOCTL_ARGUMENT_KIND_H

#include <string>
#include <vector>

namespace tavoctl {

// Names that may be given; for completion.
using Candidates = std::vector<std::string> (*)();

struct ArgumentKind {
    const char *name = "text";                     // for programs, in the list of verbs
    const char *allowed = "";                      // completes "allowed: "
    bool (*valid)(const std::string &) = nullptr;  // nullptr: any text is
    Candidates candidates = nullptr;               // nullptr: file names
    int code = 0;                                  // the library's code for a wrong one; 0: none
    const char *sample = "x";                      // a valid one, of something that is not there
    const char *wrong = nullptr;                   // one that is not valid; nullptr where there is none
};

inline constexpr ArgumentKind any_text = {};
inline constexpr ArgumentKind file_path = {.name = "file", .sample = "/no/such/file"};

}  // namespace tavoctl

#endif
