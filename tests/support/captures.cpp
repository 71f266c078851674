// Outputs of the real tools and kernel files.
#include "support/captures.h"

#include <cstdio>
#include <cstdlib>

namespace test {

std::string_view Capture(std::string_view name)
{
    for (int i = 0; i < kCaptureCount; ++i) {
        if (kCaptures[i].name == name)
            return kCaptures[i].text;
    }
    std::fprintf(stderr, "no capture %.*s\n", static_cast<int>(name.size()), name.data());
    std::abort();
}

}  // namespace test
