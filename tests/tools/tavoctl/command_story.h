// Commands of tavoctl as a story: for each its exit status, what it prints, and the files that it changes.
#ifndef TESTS_TOOLS_TAVOCTL_COMMAND_STORY_H
#define TESTS_TOOLS_TAVOCTL_COMMAND_STORY_H

#include "run_tavoctl.h"
#include "support/story.h"
#include "support/text_lines.h"

namespace test {

class CommandStory {
  public:
    explicit CommandStory(std::vector<std::string> paths)
        : story_(TEST_GOLDEN, {[this] {
                     return std::exchange(said_, {});
                 }},
                 std::move(paths))
    {
        story_.Mask(R"(\$1\$[./0-9A-Za-z]{1,8}\$[./0-9A-Za-z]{22})", "$$1$$...");
        story_.Mask("(:[^:]*):[0-9]{5}:([0-9]+:[0-9]+:)", "$1:TODAY:$2");  // the last change of a password
        story_.Mask("\"line\":[0-9]+", "\"line\":...");
    }

    void Run(const Words &words, const std::string &input = {})
    {
        std::string line = "tavoctl";
        for (const std::string &word : words)
            line += word.empty() || word.find_first_of(" \n") != word.npos ? " '" + word + "'" : " " + word;
        story_.Tell(line, [&] {
            const std::vector<std::string> before = SambaAccounts();
            const Ran ran = Tavoctl(words, input);
            said_ = Lines(ran.out);
            for (const std::string &said : Lines(ran.err))
                said_.push_back("error " + said);
            if (const std::vector<std::string> after = SambaAccounts(); after != before)
                said_.insert(said_.end(), after.begin(), after.end());
            return ran.status;
        });
    }
    void Run(const std::vector<Words> &lines)
    {
        for (const Words &words : lines)
            Run(words);
    }
    void Head(const std::string &text) { story_.Head(text); }
    void Mask(const std::string &pattern, const std::string &text) { story_.Mask(pattern, text); }

  private:
    // Without the second of the last change.
    static std::vector<std::string> SambaAccounts()
    {
        const std::string path = "/usr/tavo/etc/private/smbpasswd";
        std::vector<std::string> lines = Lines(std::filesystem::exists(path) ? ReadFile(path) : "");
        for (std::string &line : lines)
            line = "samba " + line.substr(0, line.find(":LCT-"));
        return lines;
    }

    std::vector<std::string> said_;
    Story story_;
};

}  // namespace test

#endif
