// The settings file that a verb of conf or section addresses.
#ifndef TAVOCTL_SETTINGS_FILE_H
#define TAVOCTL_SETTINGS_FILE_H

#include "frame/arguments.h"
#include "frame/failure.h"
#include "frame/held_locks.h"
#include "frame/verb.h"

#include <functional>
#include <optional>
#include <string>
#include <utility>
#include <vector>

namespace tavoctl {

class SettingsFile {
  public:
    // Options of a verb that addresses /etc/tavoinfo.conf unless told otherwise, or always the file that it is told.
    void DeclareSystem(Arguments &arguments, bool changes);
    void DeclareAny(Arguments &arguments, bool changes);

    // Throws a Failure when the options name no file, or two.
    const std::string &Path();

    // Calls edit with the path of the file, under the file's lock; with --dry-run with that of a private copy, and
    // prints the difference that it made there.
    void Change(const Call &call, const std::function<void(const char *path)> &edit);

    // The library's last failure; "not found" when the whole file is missing. For what does not create the file.
    Failure Failed(const std::string &attempted);

    // Every line, without its newline.
    std::vector<std::string> Lines();

  private:
    std::string path_;
    bool defaults_ = false;
    bool must_be_named_ = false;
    int wait_ = usual_wait;
};

// The key and value of a line as the library reads it; empty for a line that sets nothing.
std::optional<std::pair<std::string, std::string>> SplitSetting(std::string line);

// "KEY=VALUE" as an argument of the command line.
std::pair<std::string, std::string> PairArgument(const std::string &argument);

}  // namespace tavoctl

#endif
