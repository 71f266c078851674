// Users on the machine itself.
#ifndef TESTS_ACCOUNT_MACHINE_MACHINE_USERS_H
#define TESTS_ACCOUNT_MACHINE_MACHINE_USERS_H

#include "tavo_user.h"

#include <initializer_list>
#include <iterator>

namespace test {

// The tests of a program share a root: what one leaves the next one finds.
inline void DeleteUsers(std::initializer_list<const char *> names)
{
    TAVOUserDelete(std::data(names), static_cast<int>(names.size()));
}

}  // namespace test

#endif
