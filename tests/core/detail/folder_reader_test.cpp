// Reading folders to their end, or reporting that the end was not reached.
#include "core/detail/folder_reader.h"

#include "core/detail/open_file.h"
#include "support/descriptors.h"
#include "support/test.h"

#include <dlfcn.h>

namespace {

int entries_until_failure = -1;  // then the disk fails

}  // namespace

extern "C" dirent *readdir(DIR *folder)
{
    if (entries_until_failure >= 0 && entries_until_failure-- == 0) {
        errno = EIO;
        return nullptr;
    }
    // With large files, 32-bit programs call it by its other name.
    static const auto real =
        reinterpret_cast<dirent *(*)(DIR *)>(::dlsym(RTLD_NEXT, sizeof(long) == 4 ? "readdir64" : "readdir"));
    return real(folder);
}

namespace {

std::vector<std::string> NamesOf(tavo::FolderReader &folder)
{
    std::vector<std::string> names;
    errno = EEXIST;  // an earlier error must not look like the folder's
    while (const char *const name = folder.Next())
        names.emplace_back(name);
    return names;
}

TEST(FolderReader, ReturnsEveryNameButTheTwoDots)
{
    const test::ScratchDir dir;
    const std::vector<std::string> names = {"...", ".a", "..b", "file", "folder"};
    for (const std::string &name : names)
        test::WriteFile(dir / name, "");
    const int before = test::OpenDescriptors();
    {
        tavo::FolderReader folder(dir.Path().c_str());
        EXPECT_THAT(NamesOf(folder), testing::UnorderedElementsAreArray(names));
        EXPECT_FALSE(folder.Failed());
        EXPECT_GE(folder.Descriptor(), 0);
    }
    EXPECT_EQ(test::OpenDescriptors(), before);
}

TEST(FolderReader, ReportsAnUnreadableFolder)
{
    const test::ScratchDir dir;
    test::WriteFile(dir / "file", "");
    ASSERT_EQ(::mkdir((dir / "empty").c_str(), 0755), 0);
    const struct {
        std::string path;
        int error;
    } rows[] = {{dir / "absent", ENOENT}, {dir / "file", ENOTDIR}};
    for (const auto &row : rows) {
        tavo::FolderReader folder(row.path.c_str());
        EXPECT_THAT(NamesOf(folder), testing::IsEmpty()) << row.path;
        errno = 0;
        EXPECT_TRUE(folder.Failed()) << row.path;
        EXPECT_EQ(errno, row.error) << row.path;
    }
    for (const std::string &path : {dir / "empty", dir.Path()}) {
        for (const int good : {0, 1, 2, 3}) {
            tavo::FolderReader folder(path.c_str());
            entries_until_failure = good;
            NamesOf(folder);
            const bool reached = entries_until_failure < 0;
            entries_until_failure = -1;
            errno = 0;
            EXPECT_EQ(folder.Failed(), reached) << path << " after " << good;
            EXPECT_EQ(errno, reached ? EIO : 0);
        }
    }
}

}  // namespace
