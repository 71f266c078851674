// tavoctl error: the library's error codes.
#include "tavo_error.h"

#include "families.h"
#include "frame/error_codes.h"
#include "frame/text.h"

namespace tavoctl {
namespace {

constexpr Column<ErrorCode> error_columns[] = {
    {"code", [](const ErrorCode &row) { return Hexadecimal(row.code); }, "hexadecimal"},
    {"name", [](const ErrorCode &row) { return std::string(row.name); }},
    {"meaning", [](const ErrorCode &row) { return std::string(row.meaning); }},
    {"hint", [](const ErrorCode &row) { return Maybe(row.hint); }, "what usually helps", in_details},
};

// A number as people write codes: 8192 or 0x2000, but not 2000h.
const ErrorCode *Understood(const std::string &text)
{
    const auto code = AnyNumberIn<int>(text);
    return code ? FindErrorCode(*code) : FindErrorCode(text);
}

std::vector<std::string> ErrorNames()
{
    return Mapped<std::string>(ErrorCodes(), &ErrorCode::name);
}

constexpr ArgumentKind error_code = {.name = "code", .candidates = ErrorNames, .sample = "ERR_NO_SUCH_CODE"};

Action ErrorList(Arguments &)
{
    return
        [](Call &call) { call.List(error_columns, std::vector<ErrorCode>(ErrorCodes().begin(), ErrorCodes().end())); };
}

Action ErrorExplain(Arguments &in)
{
    const auto code = in.Text("CODE", error_code, "a number, decimal or with 0x in front, or a name");
    return [=](Call &call) {
        const ErrorCode *row = Understood(*code);
        if (!row)
            throw Absent("explain " + *code, "there is no such code",
                         DidYouMean(*code, ErrorNames(), "tavoctl error list shows them"));
        call.One(error_columns, *row);
    };
}

}  // namespace

void AddError(Program &program)
{
    Family &error = program.Add("error", "The library's error codes");
    error.Add("list", reads, Answer::List(error_columns), ErrorList, R"(Lists the error codes with their meanings.

tavoctl error list
tavoctl error list --json)");
    error.Add("explain", reads, Answer::One(error_columns), ErrorExplain,
              R"(Says what an error code means and what usually helps.

tavoctl error explain 0x2000
tavoctl error explain 8192
tavoctl error explain ERR_KEY_NOT_FOUND
tavoctl error explain key_not_found)");
}

}  // namespace tavoctl
