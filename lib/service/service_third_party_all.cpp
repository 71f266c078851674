// Runs the start-up scripts of installed packages.
#include "tavo_proc.h"
#include "tavo_service.h"

#include "core/detail/folder_reader.h"
#include "core/detail/guard.h"
#include "core/detail/log.h"

#include <algorithm>
#include <cerrno>
#include <string>
#include <string_view>
#include <vector>

#include <unistd.h>

namespace {

constexpr const char *kPackages = "/usr/tavo/etc/rc.d/packages";

// False when the folder could not be read to its end. An appliance without packages has no folder.
bool FindScripts(std::vector<std::string> &scripts)
{
    tavo::FolderReader folder(kPackages);
    while (const char *const name = folder.Next()) {
        const std::string path = std::string(kPackages) + "/" + name;
        if (path.ends_with(".sh") && ::access(path.c_str(), X_OK) == 0)
            scripts.push_back(path);
    }
    std::sort(scripts.begin(), scripts.end());
    return !folder.Failed() || errno == ENOENT;
}

}  // namespace

extern "C" int TAVOServiceThirdPartyAll(const char *szAction)
{
    const std::string_view action = szAction ? szAction : "";
    if (action != "start" && action != "stop" && action != "restart")
        return Fail(ERR_BAD_PARAMETERS);
    return Guard([&] {
        std::vector<std::string> scripts;
        if (!FindScripts(scripts)) {
            LogError("%s:%d Failed to read %s, errno=%d", kPackages, errno);
            return Fail(ERR_READ_FAILED);
        }
        if (action == "stop")
            std::reverse(scripts.begin(), scripts.end());
        int done = 0;
        for (const std::string &script : scripts) {
            if (TLIBExec(script.c_str(), szAction, nullptr) == 0)
                ++done;
            else
                LogError("%s:%d Failed to %s %s", szAction, script);
        }
        return done;
    });
}
