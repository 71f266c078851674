// Files that an unprivileged user may plant at a name under /tmp before the appliance uses it.
#include "support/planted_name.h"

#include "support/test.h"

namespace test {
namespace {

namespace fs = std::filesystem;

constexpr uid_t kSomebody = 1000;
constexpr int kDepth = 20000;

int PlantTree(const std::string &path)
{
    int at = ::mkdir(path.c_str(), 0755) == 0 ? ::open(path.c_str(), O_RDONLY | O_DIRECTORY | O_CLOEXEC) : -1;
    for (int depth = 0; at >= 0 && depth < kDepth; ++depth) {
        const int below = ::mkdirat(at, "d", 0755) == 0 ? ::openat(at, "d", O_RDONLY | O_DIRECTORY | O_CLOEXEC) : -1;
        ::close(at);
        at = below;
    }
    return at < 0 ? -1 : ::close(at);
}

int PlantFolder(const std::string &path)
{
    if (::mkdir(path.c_str(), 0755) != 0)
        return -1;
    WriteFile(path + "/kept", "kept");
    return ::chown((path + "/kept").c_str(), kSomebody, 0);
}

int PlantLink(const std::string &path)
{
    WriteFile(path + ".target", "kept");
    return ::symlink((path + ".target").c_str(), path.c_str());
}

int PlantKind(const std::string &path, Plant plant)
{
    switch (plant) {
    case Plant::file:
        WriteFile(path, "kept");
        return 0;
    case Plant::full_folder:
        return PlantFolder(path);
    case Plant::deep_tree:
        return PlantTree(path);
    case Plant::link:
        return PlantLink(path);
    case Plant::fifo:
        break;
    }
    return ::mkfifo(path.c_str(), 0666);
}

}  // namespace

void PlantAt(const std::string &path, Plant plant)
{
    ASSERT_EQ(PlantKind(path, plant), 0) << plant;
    ASSERT_EQ(::lchown(path.c_str(), kSomebody, 0), 0) << plant;
}

std::string MovedAside(const std::string &path)
{
    const fs::path folder = fs::path(path).parent_path();
    std::string found;
    for (const auto &entry : fs::directory_iterator(folder)) {
        if (!entry.path().string().starts_with(path + ".foreign-"))
            continue;
        EXPECT_EQ(found, "") << "moved aside twice";
        found = entry.path();
    }
    return found;
}

void RemovePlanted(const std::string &path)
{
    // From the top: each folder is replaced by its own subfolder.
    const std::string at = path + "/d", below = at + "/d", aside = path + "/aside";
    while (::rename(below.c_str(), aside.c_str()) == 0 && ::rmdir(at.c_str()) == 0 &&
           ::rename(aside.c_str(), at.c_str()) == 0) {
    }
    std::error_code ignored;
    fs::remove_all(path, ignored);
    fs::remove(path + ".target", ignored);
}

std::ostream &operator<<(std::ostream &out, Plant plant)
{
    constexpr const char *kNames[] = {"a file", "a folder that is not empty", "a deep tree", "a link", "a FIFO"};
    return out << kNames[static_cast<int>(plant)];
}

}  // namespace test
