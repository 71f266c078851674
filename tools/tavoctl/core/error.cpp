// tavoctl error: the library's error codes.
#include "families.h"
#include "frame/error_codes.h"
#include "frame/failure.h"
#include "frame/program.h"
#include "frame/table.h"

#include "tavo_error.h"

#include <charconv>

namespace tavoctl {
namespace {

// A number as people write codes: 8192, 0x2000 or 2000h is not one of them.
const ErrorCode *Understood(const std::string &text)
{
    const bool hexadecimal = text.starts_with("0x") || text.starts_with("0X");
    const char *end = text.data() + text.size();
    int code = 0;
    const auto [stop, error] = std::from_chars(text.data() + (hexadecimal ? 2 : 0), end, code, hexadecimal ? 16 : 10);
    return error == std::errc{} && stop == end ? FindErrorCode(code) : FindErrorCode(text);
}

std::vector<std::string> ErrorNames()
{
    std::vector<std::string> names;
    for (const ErrorCode &row : ErrorCodes())
        names.emplace_back(row.name);
    return names;
}

class ErrorList : public Verb {
  public:
    static constexpr VerbInfo info = {"list", reads, "Lists the error codes with their meanings.",
                                      "tavoctl error list\n"
                                      "tavoctl error list --json"};

    int Run(const Call &call) override
    {
        Table table({"code", "name", "meaning"});
        for (const ErrorCode &row : ErrorCodes())
            table.Add({Hexadecimal(row.code), row.name, row.meaning});
        call.Print(table);
        return exit_done;
    }
};

class ErrorExplain : public Verb {
  public:
    static constexpr VerbInfo info = {"explain", reads, "Says what an error code means and what usually helps.",
                                      "tavoctl error explain 0x2000\n"
                                      "tavoctl error explain 8192\n"
                                      "tavoctl error explain ERR_KEY_NOT_FOUND\n"
                                      "tavoctl error explain key_not_found"};

    void Declare(Arguments &arguments) override
    {
        arguments.Text("CODE", code_, "a number, decimal or with 0x in front, or a name", ErrorNames);
    }

    int Run(const Call &call) override
    {
        const ErrorCode *row = Understood(code_);
        if (!row)
            throw Failure{.attempted = "explain " + code_,
                          .reason = "there is no such code",
                          .hint = "tavoctl error list shows them",
                          .status = exit_not_found};
        Record record;
        record.Add("code", Hexadecimal(row->code));
        record.Add("name", row->name);
        record.Add("meaning", row->meaning);
        record.Add("hint", *row->hint ? Cell(row->hint) : Cell());
        call.Print(record);
        return exit_done;
    }

  private:
    std::string code_;
};

}  // namespace

void AddError(Program &program)
{
    Family &error = program.Add("error", "The library's error codes");
    error.Add<ErrorList>();
    error.Add<ErrorExplain>();
}

}  // namespace tavoctl
