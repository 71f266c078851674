// Fills printf-like formats with typed arguments. Log lines and command lines are fixed as such formats; they differ in
// how an argument's text is inserted, so the writer decides that.
#ifndef TAVO_CORE_DETAIL_TEXT_FORMAT_H
#define TAVO_CORE_DETAIL_TEXT_FORMAT_H

#include "core/detail/result.h"

#include <concepts>
#include <initializer_list>
#include <string>
#include <string_view>
#include <type_traits>

namespace tavo {

class TextArg {
  public:
    TextArg(const char *text) noexcept : kind_(Kind::text), text_(text ? text : "(null)") {}
    TextArg(std::string_view text) noexcept : kind_(Kind::text), text_(text) {}
    TextArg(const std::string &text) noexcept : kind_(Kind::text), text_(text) {}
    template <std::signed_integral Number>
    TextArg(Number number) noexcept : kind_(Kind::number), signed_(number), bits_(BitsOf(number))
    {
    }
    template <std::unsigned_integral Number>
    TextArg(Number number) noexcept : kind_(Kind::number), signed_(static_cast<long long>(number)), bits_(number)
    {
    }

    template <class Enum>
    requires std::is_enum_v<Enum> TextArg(Enum value)
    noexcept : TextArg(static_cast<int>(value)) {}
    TextArg(Code code) noexcept : TextArg(static_cast<int>(code)) {}

    bool IsText() const noexcept { return kind_ == Kind::text; }
    std::string_view Text() const noexcept { return text_; }
    long long Signed() const noexcept { return signed_; }
    unsigned long long Bits() const noexcept { return bits_; }  // as the argument's own width: -1 as %X is FFFFFFFF

  private:
    enum class Kind { text, number };

    template <class Number>
    static unsigned long long BitsOf(Number number) noexcept
    {
        return static_cast<std::make_unsigned_t<Number>>(number);
    }

    Kind kind_;
    std::string_view text_{};
    long long signed_ = 0;
    unsigned long long bits_ = 0;
};

class TextWriter {
  public:
    virtual void Literal(std::string_view piece) = 0;  // text of the format itself, and numbers
    virtual void Argument(std::string_view text) = 0;  // text that came from a caller, a file or a device

  protected:
    ~TextWriter() = default;
};

// Supports %s, %c, %d, %i, %u, %x and %X with a zero flag, a width and the length modifiers (which the typed arguments
// make superfluous), and %%. A conversion without an argument is copied unchanged.
void FormatText(TextWriter &out, const char *format, std::initializer_list<TextArg> args);

}  // namespace tavo

#endif
