// Outputs of the real tools and kernel files, byte for byte; captures/ has one file each, named by its origin.
#ifndef TESTS_SUPPORT_CAPTURES_H
#define TESTS_SUPPORT_CAPTURES_H

#include <string_view>

namespace test {

struct CaptureRow {
    std::string_view name;
    std::string_view text;
};

// Compiled in: tests run where the source tree is not visible.
extern const CaptureRow kCaptures[];
extern const int kCaptureCount;

// Ends the program when there is none of that name ("proc_partitions-linux-6.1").
std::string_view Capture(std::string_view name);

}  // namespace test

#endif
