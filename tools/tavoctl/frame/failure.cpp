// How a failure reads, and which exit status it gives.
#include "frame/failure.h"

#include "tavo_error.h"

#include "frame/error_codes.h"
#include "frame/table.h"
#include "frame/text.h"

#include <nlohmann/json.hpp>

#include <cerrno>
#include <cstring>
#include <iostream>
#include <iterator>
#include <utility>
#include <vector>

#include <fcntl.h>
#include <unistd.h>

namespace tavoctl {
namespace {

constexpr int absent_codes[] = {ERR_PATH_NOT_FOUND, ERR_FILE_NOT_FOUND,  ERR_KEY_NOT_FOUND, ERR_SECTION_NOT_FOUND,
                                ERR_NO_SUCH_SHARE,  ERR_NO_SUCH_GROUP,   ERR_NO_SUCH_USER,  ERR_NO_VOLUME_ID,
                                ERR_NO_DISK_ID,     ERR_BACKUP_NOT_FOUND};
constexpr int busy_codes[] = {ERR_LOCK_FAILED, ERR_DEVICE_BUSY};
constexpr int usage_codes[] = {ERR_BAD_PARAMETERS,      ERR_USAGE,
                               ERR_INVALID_SERVERNAME,  ERR_INVALID_DOMAINNAME,
                               ERR_INVALID_NETNAME,     ERR_INVALID_SHARENAME,
                               ERR_INVALID_GROUPNAME,   ERR_INVALID_USERNAME,
                               ERR_INVALID_PASSWORDNAME};

int StatusOf(int code)
{
    return Contains(absent_codes, code)  ? exit_not_found
           : Contains(busy_codes, code)  ? exit_busy
           : Contains(usage_codes, code) ? exit_usage
           : code == ERR_ACCESS_DENIED   ? exit_denied
                                         : exit_failed;
}

// Checks for as many descriptors as the library needs at a time. Without them even a free lock cannot be taken.
bool HasDescriptors()
{
    constexpr std::size_t needed = 16;
    std::vector<int> probes;
    while (probes.size() < needed)
        if (probes.emplace_back(::open("/dev/null", O_RDONLY | O_CLOEXEC)) < 0)
            break;
    const bool enough = probes.back() >= 0 || (errno != EMFILE && errno != ENFILE);
    for (const int fd : probes)
        if (fd >= 0)
            ::close(fd);
    return enough;
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

std::string Failure::Text(bool verbose) const
{
    std::string text = "tavoctl: cannot " + attempted + ": ";
    if (!reason.empty())
        text += reason + (code ? ", " : "");
    if (code)
        text += ErrorName(code) + " (" + Hexadecimal(code) + ")";
    if (verbose && !module.empty())
        text += " at " + module + ":" + std::to_string(line);
    if (const std::string advice = Hint(); advice.find_first_not_of(' ') != std::string::npos)
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
    const nlohmann::ordered_json whole = {{"format_version", format_version}, {"error", error}};
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

void Must(bool condition, const std::string &attempted, const std::string &hint)
{
    if (!condition)
        throw LibraryFailure(attempted, hint);
}

void Must(bool condition, const std::string &attempted, const HintFor &hint)
{
    Must(condition, attempted, std::string(condition || TLIBErrGet() != hint.code ? hint.otherwise : hint.hint));
}

void FailIf(bool condition, const std::string &attempted, const std::string &reason, const std::string &hint,
            int status)
{
    if (condition)
        throw Failure{.attempted = attempted, .reason = reason, .hint = hint, .status = status};
}

void RefuseIf(bool condition, const std::string &attempted, const std::string &reason, const std::string &hint)
{
    FailIf(condition, attempted, reason, hint, exit_usage);
}

void BusyIf(bool condition, const std::string &attempted, const std::string &reason, const std::string &hint)
{
    FailIf(condition, attempted, reason, hint, exit_busy);
}

Failure SystemFailure(std::string attempted, int error)
{
    const bool denied = error == EACCES || error == EPERM;
    return {.attempted = std::move(attempted),
            .reason = std::strerror(error),
            .hint = denied ? "run it as root" : "",
            .status = error == ENOENT ? exit_not_found
                      : denied        ? exit_denied
                                      : exit_failed};
}

Failure BusyFailure(std::string attempted, std::string reason, std::string hint)
{
    return {
        .attempted = std::move(attempted), .reason = std::move(reason), .hint = std::move(hint), .status = exit_busy};
}

Failure WithPermissions(Failure failure)
{
    if (failure.code && !HasDescriptors()) {
        failure.reason = "too few file descriptors are left";
        failure.hint = "raise the limit, ulimit -n";
        failure.status = exit_failed;
        return failure;
    }
    if (::geteuid() == 0 || failure.Status() == exit_usage || failure.Status() == exit_not_found)
        return failure;
    std::vector<std::pair<std::string, int>> needed = {{failure.path, R_OK}};
    // The locks are in a folder of root's, and each is a file that only root may open.
    if (failure.code == ERR_LOCK_FAILED || failure.code == ERR_CREATE_FAILED)
        needed.emplace_back("/tmp/lock", W_OK);
    if (failure.code == ERR_LOCK_FAILED || failure.code == ERR_OPEN_FAILED || failure.code == ERR_READ_FAILED)
        needed.insert(needed.end(), {{"/etc/shadow", R_OK}, {"/usr/tavo/etc/private/smbpasswd", R_OK}});
    for (const auto &[path, way] : needed)
        if (!path.empty() && ::eaccess(path.c_str(), way) != 0 && errno == EACCES) {
            failure.reason = "no permission to open " + path;
            failure.hint = "run it as root";
            failure.status = exit_denied;
            break;
        }
    return failure;
}

Failure UsageFailure(std::string attempted, std::string reason, std::string hint)
{
    return {
        .attempted = std::move(attempted), .reason = std::move(reason), .hint = std::move(hint), .status = exit_usage};
}

Failure Absent(std::string attempted, std::string reason, std::string hint)
{
    return {.attempted = std::move(attempted),
            .reason = std::move(reason),
            .hint = std::move(hint),
            .status = exit_not_found};
}

Failure NotFound(std::string attempted, int code, std::string hint)
{
    return {.attempted = std::move(attempted), .hint = std::move(hint), .code = code, .status = exit_not_found};
}

void Warn(const std::string &text)
{
    std::cerr << "tavoctl: warning: " + Printable(text) + "\n";
}

}  // namespace tavoctl
