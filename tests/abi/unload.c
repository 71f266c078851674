/* A host that loads the library, has it install its handler of SIGCHLD, unloads it and lives on; twice. */
#include <dlfcn.h>
#include <stdio.h>
#include <sys/wait.h>
#include <unistd.h>

static int UseAndUnload(const char *path)
{
    void *const library = dlopen(path, RTLD_NOW | RTLD_LOCAL);
    int (*timed_exec)(int, const char *, ...);
    if (!library) {
        fprintf(stderr, "%s\n", dlerror());
        return 1;
    }
    *(void **)&timed_exec = dlsym(library, "TLIBTimedExec");
    if (!timed_exec || timed_exec(60, "/bin/true", (char *)NULL) != 0 || dlclose(library) != 0) {
        fprintf(stderr, "no use or no end of the library\n");
        return 1;
    }
    if (fork() == 0)
        _exit(0);
    return wait(NULL) > 0 ? 0 : 1;
}

int main(int argc, char **argv)
{
    return argc != 2 || UseAndUnload(argv[1]) || UseAndUnload(argv[1]);
}
