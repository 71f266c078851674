// Writes one line to the system log.
#include "core/detail/log.h"

#include "core/detail/owner.h"

#include <algorithm>
#include <cstdio>
#include <cstring>

namespace tavo {
namespace {

bool IsControl(unsigned char byte)
{
    return byte < 0x20 || byte == 0x7F;
}

// C1 control characters (U+0080 to U+009F) as UTF-8: 0xC2 and one byte from 0x80 to 0x9F.
bool IsC1(std::string_view text, size_t at)
{
    return at + 1 < text.size() && text[at] == '\xC2' && static_cast<unsigned char>(text[at + 1]) - 0x80u < 0x20u;
}

class LogLine final : public TextWriter {
  public:
    void Literal(std::string_view piece) override
    {
        const size_t taken = std::min(piece.size(), sizeof text_ - 1 - length_);
        std::memcpy(text_ + length_, piece.data(), taken);
        length_ += taken;
        text_[length_] = 0;
    }

    void Argument(std::string_view text) override
    {
        for (size_t at = 0; at < text.size(); ++at) {
            if (IsC1(text, at))
                Escape(text[at++]), Escape(text[at]);
            else if (IsControl(static_cast<unsigned char>(text[at])))
                Escape(text[at]);
            else
                Literal({&text[at], 1});
        }
    }

    const char *Text() const { return text_; }

  private:
    void Escape(char byte)
    {
        char spelled[5];
        std::snprintf(spelled, sizeof spelled, "\\x%02X", static_cast<unsigned char>(byte));
        Literal(spelled);
    }

    char text_[1024] = "";
    size_t length_ = 0;
};

}  // namespace

void WriteLog(int priority, const char *format, std::initializer_list<TextArg> args) noexcept
{
    KeepErrno keep;
    LogLine line;
    FormatText(line, format, args);
    syslog(priority, "%s", line.Text());
}

}  // namespace tavo
