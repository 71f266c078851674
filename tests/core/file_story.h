// Stories of settings files: each call's result, and the whole files that it changed.
#ifndef TESTS_CORE_FILE_STORY_H
#define TESTS_CORE_FILE_STORY_H

#include "support/story.h"
#include "support/test.h"

namespace test {

class FileStory : public testing::Test {
  protected:
    FileStory() { story_.Mask(dir_.Path(), ""); }

    void Before(std::string_view text)
    {
        story_.Head(std::string(text));
        WriteFile(file_, text, 0640);
    }
    // The published line of the last failure.
    void ShowLine() { story_.Show("line", TAVOErrorGetLine()); }
    struct stat Facts(const std::string &name = "file") const
    {
        struct stat facts = {};
        EXPECT_EQ(::stat((dir_ / name).c_str(), &facts), 0) << name;
        return facts;
    }

    const ScratchDir dir_;
    const std::string file_ = dir_ / "file", missing_ = dir_ / "missing";
    const char *path_ = file_.c_str(), *missing_path_ = missing_.c_str(), *folder_ = dir_.Path().c_str();
    CapturedLog log_;
    Story story_{TEST_GOLDEN, {LogOf(log_)}, {dir_.Path()}};
};

// A call and the text of the file before it.
#define EDIT(before, ...) (Before(before), TELL(__VA_ARGS__))

}  // namespace test

#endif
