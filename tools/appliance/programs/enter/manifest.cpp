// Reads the list of what a private copy of the root consists of.
#include "enter.h"

#include <cstdio>
#include <cstdlib>

namespace enter {

std::vector<Entry> ReadManifest(const std::string &root)
{
    const std::string path = root + "/manifest";
    std::FILE *file = std::fopen(path.c_str(), "re");
    if (!file)
        Die("%s is not an appliance root: make one with tools/appliance/build --out %s", root.c_str(), root.c_str());
    std::vector<Entry> entries;
    char *line = nullptr;
    size_t room = 0;
    for (ssize_t length; (length = ::getline(&line, &room, file)) > 0;) {
        line[length - 1] = '\0';
        char kind;
        unsigned mode, uid, gid;
        int used = 0;
        if (std::sscanf(line, "%c %o %u %u %n", &kind, &mode, &uid, &gid, &used) != 4 || used == 0 || !line[used])
            Die("%s: bad line: %s", path.c_str(), line);
        entries.push_back({kind, mode, uid, gid, line + used});
    }
    std::free(line);
    std::fclose(file);
    return entries;
}

}  // namespace enter
