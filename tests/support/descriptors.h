// Counts the open descriptors: a descriptor that a call leaves open shows here.
#ifndef TESTS_SUPPORT_DESCRIPTORS_H
#define TESTS_SUPPORT_DESCRIPTORS_H

#include <fcntl.h>

namespace test {

inline int OpenDescriptors()
{
    int count = 0;
    for (int fd = 0; fd < 1024; ++fd)
        count += ::fcntl(fd, F_GETFD) >= 0;
    return count;
}

}  // namespace test

#endif
