// Running a program from a parent of one gibibyte: the cost must not grow with the parent.
#include "children.h"

#include <cstdio>

#include <sys/mman.h>

int main(int argc, char **argv)
{
    constexpr size_t size = size_t{1} << 30;
    void *const memory = ::mmap(nullptr, size, PROT_READ | PROT_WRITE, MAP_PRIVATE | MAP_ANONYMOUS, -1, 0);
    if (memory == MAP_FAILED) {
        std::perror("one gibibyte");
        return 1;
    }
    ::madvise(memory, size, MADV_NOHUGEPAGE);  // as a daemon has it: page by page
    for (size_t at = 0; at < size; at += 4096)
        static_cast<volatile char *>(memory)[at] = 1;
    bench::CompareChildren(1024);
    return bench::Run(argc, argv);
}
