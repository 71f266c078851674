// The settings file that a verb of conf or section addresses.
#ifndef TAVOCTL_SETTINGS_FILE_H
#define TAVOCTL_SETTINGS_FILE_H

#include "frame/verb.h"

namespace tavoctl {

inline constexpr char quoted_setting[] = "%s=\"%s\"\n";

class SettingsFile {
  public:
    // Declares the options of a verb that addresses /etc/tavoinfo.conf unless another file is given, or always the file
    // that is given.
    static SettingsFile OfSystem(Arguments &in, unsigned trait);
    static SettingsFile Any(Arguments &in, unsigned trait);

    // Throws a Failure when the options name no file, or two, or something that is not a regular file or is larger than
    // most_input.
    std::string Path() const;

    // Calls edit with the path of a private copy, and then, if that made a difference, with the path of the file, under
    // the file's lock; not with --dry-run.
    void Change(Call &call, const std::function<void(const char *path)> &edit, const std::string &question = {}) const;

    // The library's last failure; "not found" when the whole file is missing. For what does not create the file.
    Failure Failed(const std::string &attempted, const std::string &hint = {}) const;

    // Every line, without its newline.
    std::vector<std::string> Lines() const;
    // How a new line is written: a file in which every value is quoted stays one. nullptr for the library's way.
    const char *LineFormat() const;
    // The names of its settings; none where it cannot be read.
    std::vector<std::string> Keys() const;

  private:
    bool must_be_named_ = false;
    Given<std::optional<std::string>> file_;
    Given<bool> defaults_;
    Given<std::optional<int64_t>> timeout_;
};

// The key and value of a line as the library reads it; empty for a line that sets nothing.
std::optional<std::pair<std::string, std::string>> SplitSetting(std::string line);

// "KEY=VALUE" as an argument of the command line.
extern const ArgumentKind setting_pair;
std::pair<std::string, std::string> SplitPair(const std::string &pair);

}  // namespace tavoctl

#endif
