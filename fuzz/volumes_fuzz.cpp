// The kernel's texts about mounts and processes: only a mount at /volumeN is a volume, and a process has the name of
// its program.
#include "input.h"
#include "service/detail/process_named.h"
#include "service/detail/volume_list.h"

#include <algorithm>

using fuzz::Check;

namespace {

void CheckVolumes(const std::string &mounts)
{
    const std::vector<tavo::Mount> table = tavo::ParseMounts(mounts);
    int before = 0;
    for (const tavo::Volume &volume : tavo::VolumesIn(table)) {
        Check(volume.number > before, "volumes stand in the order of their numbers, each once");
        before = volume.number;
        Check(volume.path == "/volume" + std::to_string(volume.number), "a volume's path is its number's");
        Check(tavo::VolumeNumber(volume.path) == volume.number, "and leads back to it");
        Check(tavo::VolumeOf(volume.path + "/@database/x") == volume.path, "what lies below lies on it");
        Check(std::any_of(table.begin(), table.end(), [&](const tavo::Mount &one) { return one.point == volume.path; }),
              "nothing is mounted that the kernel did not name");
        tavo::KindOf(volume);
    }
}

void CheckName(const std::string &name, const std::string &command)
{
    if (name.empty() || name.find_first_of(" \t\n\r\v\f/[]:") != std::string::npos)
        return;
    Check(tavo::CommandHasName("/usr/sbin/" + name + " -D", name), "a program wherever it lies");
    Check(tavo::CommandHasName(name + ": working", name), "a daemon that tells what it does");
    Check(tavo::CommandHasName("[" + name + "]", "[" + name + "]"), "a kernel thread");
    if (tavo::CommandHasName(command, name))
        Check(command.find(name) != std::string::npos, "a name that does not stand there");
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const uint8_t *data, size_t size)
{
    fuzz::Input input(data, size);
    const std::string name = input.Text(20);
    const std::string text = input.Rest();
    CheckVolumes(text);
    CheckName(name, text);
    const std::string_view on = tavo::VolumeOf(text);
    Check(on.empty() || (text.starts_with(on) && tavo::VolumeNumber(on) > 0),
          "a path lies on the volume it begins with");
    return 0;
}
