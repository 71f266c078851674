// Standard input, output and error for programs that may be started without them.
#ifndef TOOLS_STANDARD_DESCRIPTORS_H
#define TOOLS_STANDARD_DESCRIPTORS_H

#include <fcntl.h>
#include <unistd.h>

// Opens /dev/null for each closed descriptor from 0 to 2: otherwise the first file that the program opens, such as a
// disk, becomes its standard output, and messages are written into it. Call it first in main. Returns whether standard
// output was closed, so that output is lost.
inline bool FillStandardDescriptors() noexcept
{
    bool no_output = false;
    for (;;) {
        const int fd = ::open("/dev/null", O_RDWR | O_NOCTTY);
        no_output = no_output || fd == STDOUT_FILENO;
        if (fd > 2)
            ::close(fd);
        if (fd < 0 || fd > 2)
            return no_output;
    }
}

#endif
