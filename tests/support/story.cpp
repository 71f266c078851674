// A test as a story.
#include "support/story.h"

#include "support/scratch_dir.h"
#include "support/text_lines.h"

#include <gtest/gtest.h>

#include <algorithm>
#include <cstdio>
#include <cstdlib>
#include <filesystem>
#include <iterator>

namespace test {
namespace {

namespace fs = std::filesystem;

// Its name, or its number when it has none.
std::string TextOf(int code)
{
    const auto index = static_cast<size_t>(code) / 0x100;
    if (code % 0x100 == 0 && index < std::size(rgszErrMsg) && *rgszErrMsg[index])
        return rgszErrMsg[index];
    char number[16];
    std::snprintf(number, sizeof number, "0x%04X", static_cast<unsigned>(code));
    return number;
}

}  // namespace

Story::~Story()
{
    if (text_.empty() || testing::Test::IsSkipped())
        return;
    const testing::TestInfo &test = *testing::UnitTest::GetInstance()->current_test_info();
    std::string name = std::string(test.test_suite_name()) + "." + test.name() + ".txt";
    std::replace(name.begin(), name.end(), '/', '-');  // of a row: Of/Every.Action/web
    name.insert(0, "/");
    if (const char *kept = std::getenv("TAVO_KEEP_GOLDEN")) {
        WriteFile(kept + name, text_);
        return;
    }
    const std::string golden = ReadFile(golden_ + name);
    if (text_ != golden)
        ADD_FAILURE() << "not as in the golden file " << name.substr(1) << "\n"
                      << testing::internal::edit_distance::CreateUnifiedDiff(Lines(golden), Lines(text_));
}

std::string Story::Text(const std::vector<std::string> &texts)
{
    std::string all;
    for (const std::string &text : texts)
        all += (all.empty() ? "" : ", ") + Text(text);
    return all.empty() ? "none" : all;
}

// One line of the text: what cannot be printed or would be lost at its end is written as a number.
void Story::Line(const std::string &text)
{
    std::string line = text;
    for (const auto &[pattern, mask] : masks_)
        line = std::regex_replace(line, pattern, mask);
    for (size_t i = 0; i < line.size(); ++i) {
        const auto byte = static_cast<unsigned char>(line[i]);
        const bool is_plain = byte >= ' ' && byte < 0x7F && (byte != ' ' || i + 1 < line.size());
        char number[5];
        std::snprintf(number, sizeof number, "\\x%02X", unsigned{byte});
        text_ += is_plain ? std::string(1, line[i]) : byte == '\t' ? "\\t" : byte == '\n' ? "\\n" : number;
    }
    text_ += '\n';
}

std::map<std::string, std::string> Story::Files() const
{
    std::map<std::string, std::string> files;
    const auto add = [&](const fs::path &path) {
        if (fs::is_symlink(path))
            files[path] = "-> " + fs::read_symlink(path).string() + "\n";
        else if (fs::is_regular_file(path))
            files[path] = ReadFile(path);
        else if (fs::exists(fs::symlink_status(path)))
            files[path] = "(not a file)\n";
    };
    for (const std::string &path : paths_) {
        if (!fs::is_directory(fs::symlink_status(path)))
            add(path);
        else
            for (const auto &entry : fs::directory_iterator(path))
                add(entry.path());
    }
    return files;
}

void Story::Begin()
{
    files_ = Files();
    for (const Source &source : sources_)
        source();
    ForgetFault();
}

void Story::End(const std::string &text)
{
    const Fault fault = LastFault();
    // The same however the source breaks its lines.
    Line(std::regex_replace(text, std::regex("\\( "), "(") +
         (fault.code ? ", " + TextOf(fault.code) + " of " + fault.module : ""));
    for (const Source &source : sources_) {
        for (const std::string &line : source())
            Line("    " + line);
    }
    const std::map<std::string, std::string> files = Files();
    for (const auto &[path, content] : files) {
        if (const auto before = files_.find(path); before != files_.end() && before->second == content)
            continue;
        Line("    file " + path + (content.empty() || content.back() == '\n' ? "" : ", without a last newline"));
        for (const std::string &line : Lines(content))
            Line("        " + line);
    }
    for (const auto &[path, content] : files_) {
        if (!files.contains(path))
            Line("    gone " + path);
    }
}

Story::Source LogOf(CapturedLog &log, int least)
{
    return [&log, least] {
        const std::vector<LoggedLine> kept = log.Lines();
        const std::vector<std::string> texts = log.TakeTexts();
        std::vector<std::string> lines;
        for (size_t i = 0; i < kept.size(); ++i) {
            const int priority = kept[i].priority;
            if (priority <= least)
                lines.push_back((priority == LOG_ERR ? "log " : "log at " + std::to_string(priority) + " ") + texts[i]);
        }
        return lines;
    };
}

}  // namespace test
