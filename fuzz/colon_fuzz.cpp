// Colon encoding: every text comes back, what is encoded fits in a field, and decoding takes any text.
#include "tavo_str.h"

#include "input.h"

#include <cstring>
#include <vector>

using fuzz::Check;

extern "C" int LLVMFuzzerTestOneInput(const uint8_t *data, size_t size)
{
    const std::string text = fuzz::Input(data, size).Rest();
    const int length = TLIBStrEncodeColon(text.c_str(), nullptr, 0);
    Check(length > static_cast<int>(text.size()), "an encoded text is not shorter");
    std::vector<char> encoded(static_cast<size_t>(length));
    Check(TLIBStrEncodeColon(text.c_str(), encoded.data(), length - 1) == -1, "one byte too few");
    Check(TLIBStrEncodeColon(text.c_str(), encoded.data(), length) == length, "the length asked for");
    Check(std::strlen(encoded.data()) + 1 == encoded.size(), "the length is that of the text");
    Check(!std::strpbrk(encoded.data(), ":\r\n"), "a field holds it");

    std::vector<char> decoded(text.size() + 1);
    const int decoded_length = static_cast<int>(decoded.size());
    Check(TLIBStrDecodeColon(encoded.data(), decoded.data(), decoded_length) == decoded_length, "it fits again");
    Check(decoded.data() == text, "the text comes back");
    Check(TLIBStrDecodeColon(encoded.data(), encoded.data(), length) == decoded_length, "in place");
    Check(encoded.data() == text, "the text comes back in place");

    const int any = TLIBStrDecodeColon(text.c_str(), nullptr, 0);
    Check(any > 0 && any <= decoded_length, "any text decodes");
    return 0;
}
