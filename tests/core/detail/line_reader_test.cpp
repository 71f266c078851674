// Lines of any length with any bytes, wherever the reads happen to end.
#include "core/detail/line_reader.h"

#include "core/detail/open_file.h"
#include "support/test.h"

#include <thread>

namespace {

std::vector<std::string> LinesOf(int fd)
{
    tavo::LineReader reader(fd);
    std::vector<std::string> lines;
    for (std::string_view line; reader.Next(line);)
        lines.emplace_back(line);
    EXPECT_FALSE(reader.Failed());
    return lines;
}

TEST(LineReader, KeepsEveryByte)
{
    const test::ScratchDir dir;
    const std::string zeros("a\0b\n", 4);
    const std::vector<std::vector<std::string>> files = {
        {},
        {"\n"},
        {"no newline"},
        {"a\n", "\n", "\r\n", zeros, "\xFF\n", "end"},
        {std::string(16383, 'x') + "\n", "y\n"},
        {std::string(16384, 'x') + "\n", "y"},
        {"y\n", std::string(300000, 'x') + "\n", std::string(16385, 'z')},
    };
    for (const auto &lines : files) {
        std::string text;
        for (const std::string &line : lines)
            text += line;
        test::WriteFile(dir / "file", text);
        const tavo::Fd fd = tavo::OpenRegular((dir / "file").c_str(), O_RDONLY);
        EXPECT_EQ(LinesOf(fd.Get()), lines);
    }
}

TEST(LineReader, JoinsLinesThatArriveInPieces)
{
    int ends[2];
    ASSERT_EQ(::pipe(ends), 0);
    const tavo::Fd in(ends[0]);
    std::thread writer([out = ends[1]] {
        for (const char *piece : {"on", "e\ntw", "o\n\n", "three"}) {
            tavo::WriteAll(out, piece);
            std::this_thread::sleep_for(std::chrono::milliseconds(5));
        }
        ::close(out);
    });
    EXPECT_THAT(LinesOf(in.Get()), testing::ElementsAre("one\n", "two\n", "\n", "three"));
    writer.join();
}

TEST(LineReader, DistinguishesAnErrorFromTheEnd)
{
    const tavo::Fd directory = tavo::OpenFd("/", O_RDONLY);
    tavo::LineReader reader(directory.Get());
    std::string_view line;
    EXPECT_FALSE(reader.Next(line));
    EXPECT_TRUE(reader.Failed());
}

}  // namespace
