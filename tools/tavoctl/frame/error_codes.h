// The library's error codes with what they mean and what usually helps.
#ifndef TAVOCTL_ERROR_CODES_H
#define TAVOCTL_ERROR_CODES_H

#include <span>
#include <string>

namespace tavoctl {

struct ErrorCode {
    int code;
    const char *name;
    const char *meaning;
    const char *hint;  // "" where nothing helps in general
};

// In the order of the codes.
std::span<const ErrorCode> ErrorCodes();

const ErrorCode *FindErrorCode(int code);
const ErrorCode *FindErrorCode(const std::string &name);  // in any case, with or without "ERR_"

std::string ErrorName(int code);    // "unnamed" for a code that is not in the table
std::string Hexadecimal(int code);  // "0x2000"

}  // namespace tavoctl

#endif
