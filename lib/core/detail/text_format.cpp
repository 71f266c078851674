// Fills printf-like formats with typed arguments.
#include "core/detail/text_format.h"

#include "core/detail/ascii.h"

#include <cstdio>
#include <cstring>

namespace tavo {
namespace {

struct Conversion {
    std::string_view spelled;  // the whole conversion, from its percent sign
    bool zeros = false;
    int width = 0;
    char letter = 0;  // 0: the format ends inside the conversion
};

Conversion ReadConversion(const char *percent)
{
    const char *at = percent + 1;
    Conversion found;
    if (*at == '0') {
        found.zeros = true;
        ++at;
    }
    for (; IsDigit(*at) && found.width < 100; ++at)
        found.width = found.width * 10 + (*at - '0');
    while (*at && std::strchr("hljzt", *at))
        ++at;
    found.letter = *at;
    found.spelled = std::string_view(percent, static_cast<size_t>(at - percent) + (*at ? 1 : 0));
    return found;
}

void WriteNumber(TextWriter &out, const Conversion &how, const TextArg &arg)
{
    char text[128];
    int length = 0;
    switch (how.letter) {
    case 'd':
    case 'i':
        length = std::snprintf(text, sizeof text, how.zeros ? "%0*lld" : "%*lld", how.width, arg.Signed());
        break;
    case 'u':
        length = std::snprintf(text, sizeof text, how.zeros ? "%0*llu" : "%*llu", how.width, arg.Bits());
        break;
    case 'X':
        length = std::snprintf(text, sizeof text, how.zeros ? "%0*llX" : "%*llX", how.width, arg.Bits());
        break;
    case 'c':
        text[0] = static_cast<char>(arg.Bits());
        out.Argument({text, 1});
        return;
    default:
        length = std::snprintf(text, sizeof text, how.zeros ? "%0*llx" : "%*llx", how.width, arg.Bits());
        break;
    }
    out.Literal({text, static_cast<size_t>(length)});
}

}  // namespace

void FormatText(TextWriter &out, const char *format, std::initializer_list<TextArg> args)
{
    const TextArg *next = args.begin();
    while (const char *percent = std::strchr(format, '%')) {
        out.Literal({format, static_cast<size_t>(percent - format)});
        const Conversion how = ReadConversion(percent);
        format = percent + how.spelled.size();
        if (how.letter == '%')
            out.Literal("%");
        else if (how.letter == 0 || !std::strchr("sdiuxXc", how.letter) || next == args.end())
            out.Literal(how.spelled);
        else if (const TextArg &arg = *next++; arg.IsText())
            out.Argument(arg.Text());
        else
            WriteNumber(out, how, arg);
    }
    out.Literal(format);
}

}  // namespace tavo
