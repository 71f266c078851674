// How a failure reads, and which exit status it gives.
#include "frame/failure.h"

#include "frame/error_codes.h"
#include "frame/terminal_text.h"

#include "tavo_error.h"

#include <nlohmann/json.hpp>

#include <utility>

namespace tavoctl {
namespace {

int StatusOf(int code)
{
    switch (code) {
    case ERR_PATH_NOT_FOUND:
    case ERR_FILE_NOT_FOUND:
    case ERR_KEY_NOT_FOUND:
    case ERR_SECTION_NOT_FOUND:
    case ERR_NO_SUCH_SHARE:
    case ERR_NO_SUCH_GROUP:
    case ERR_NO_SUCH_USER:
    case ERR_NO_VOLUME_ID:
    case ERR_NO_DISK_ID:
    case ERR_BACKUP_NOT_FOUND:
        return exit_not_found;
    case ERR_LOCK_FAILED:
    case ERR_DEVICE_BUSY:
        return exit_busy;
    case ERR_BAD_PARAMETERS:
    case ERR_USAGE:
        return exit_usage;
    default:
        return exit_failed;
    }
}

}  // namespace

int Failure::Status() const
{
    return status.value_or(StatusOf(code));
}

std::string Failure::Hint() const
{
    if (!hint.empty() || !code)
        return hint;
    const ErrorCode *error = FindErrorCode(code);
    return error ? error->hint : "";
}

std::string Failure::Text() const
{
    std::string text = "tavoctl: cannot " + attempted + ": ";
    if (!reason.empty())
        text += reason + (code ? ", " : "");
    if (code)
        text += ErrorName(code) + " (" + Hexadecimal(code) + ")";
    if (!module.empty())
        text += " at " + module + ":" + std::to_string(line);
    if (const std::string advice = Hint(); !advice.empty())
        text += "; " + advice;
    return Printable(text);
}

std::string Failure::Json() const
{
    nlohmann::ordered_json error = {{"attempted", attempted}};
    if (!reason.empty())
        error["reason"] = reason;
    if (code) {
        error["code"] = Hexadecimal(code);
        error["name"] = ErrorName(code);
    }
    if (!module.empty()) {
        error["module"] = module;
        error["line"] = line;
    }
    if (const std::string advice = Hint(); !advice.empty())
        error["hint"] = advice;
    error["status"] = Status();
    const nlohmann::ordered_json whole = {{"error", error}};
    return whole.dump(-1, ' ', true, nlohmann::ordered_json::error_handler_t::replace);
}

Failure LibraryFailure(std::string attempted, std::string hint)
{
    const char *module = TAVOErrorGetFile();
    Failure failure = {.attempted = std::move(attempted), .hint = std::move(hint), .code = TLIBErrGet()};
    if (module) {
        failure.module = module;
        failure.line = TAVOErrorGetLine();
    }
    if (!failure.code)
        failure.reason = "the library gives no reason";
    return failure;
}

Failure UsageFailure(std::string attempted, std::string reason, std::string hint)
{
    return {
        .attempted = std::move(attempted), .reason = std::move(reason), .hint = std::move(hint), .status = exit_usage};
}

Failure NotFound(std::string attempted, int code, std::string hint)
{
    return {.attempted = std::move(attempted), .hint = std::move(hint), .code = code, .status = exit_not_found};
}

}  // namespace tavoctl
