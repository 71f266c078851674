// Reads the model of a drive.
#include "tavo_disk.h"

#include "core/detail/guard.h"
#include "core/detail/line_reader.h"
#include "core/detail/log.h"
#include "core/detail/open_file.h"
#include "storage/detail/device_name.h"

#include <algorithm>
#include <cstring>
#include <string>

extern "C" int TAVOLnxDiskGetModel(const char *szPath, char *szModel, int cbModel)
{
    if (!szPath || !szModel || cbModel < 1 || !tavo::IsDevicePath(szPath))
        return Fail(ERR_BAD_PARAMETERS);
    return Guard([&] {
        if (!tavo::OpenFd(szPath, O_RDONLY)) {
            LogError("%s(%d) Failed to open %s. %d (%s)", szPath, errno, std::strerror(errno));
            return -1;
        }
        const std::string source = "/sys/block/" + std::string(tavo::LastPart(szPath)) + "/device/model";
        const tavo::Fd file = tavo::OpenFd(source.c_str(), O_RDONLY);
        if (!file) {
            LogError("%s (%d) Failed to open %s", source);
            return -1;
        }
        tavo::LineReader lines(file.Get());
        std::string_view line;
        if (!lines.Next(line)) {
            LogError("%s (%d) Failed get disk model");
            return -1;
        }
        const std::string_view model = tavo::WithoutNewline(line).substr(0, static_cast<size_t>(cbModel) - 1);
        *std::copy(model.begin(), model.end(), szModel) = 0;
        return 0;
    });
}
