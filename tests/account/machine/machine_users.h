// Users on the machine itself.
#ifndef TESTS_ACCOUNT_MACHINE_MACHINE_USERS_H
#define TESTS_ACCOUNT_MACHINE_MACHINE_USERS_H

#include "tavo_user.h"

#include <cstdio>
#include <initializer_list>
#include <iterator>
#include <string>

namespace test {

// The tests of a program share a root: what one leaves the next one finds.
inline void DeleteUsers(std::initializer_list<const char *> names)
{
    TAVOUserDelete(std::data(names), static_cast<int>(names.size()));
}

// As Samba writes a hash.
inline std::string Hex(const unsigned char (&hash)[16])
{
    std::string text;
    for (const unsigned char byte : hash) {
        char digits[3];
        std::snprintf(digits, sizeof digits, "%02X", byte);
        text += digits;
    }
    return text;
}

}  // namespace test

#endif
