// Outputs of the real tools and kernel files, byte for byte; captures/ has one a file, named by what gave it.
#ifndef TESTS_SUPPORT_CAPTURES_H
#define TESTS_SUPPORT_CAPTURES_H

#include <string_view>

namespace test {

struct CaptureRow {
    std::string_view name;
    std::string_view text;
};

// Compiled in: tests run where the source tree is not.
extern const CaptureRow kCaptures[];
extern const int kCaptureCount;

// Ends the program when there is none of that name ("proc_partitions-linux-6.1").
std::string_view Capture(std::string_view name);

}  // namespace test

#endif
