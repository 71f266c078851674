// The interface files of a bond and of its members.
#include "network/detail/bond_files.h"

#include "tavo_error.h"

#include "network/detail/folder_names.h"
#include "network/detail/interface_file.h"
#include "network/detail/interface_name.h"
#include "network/detail/kernel_interface.h"
#include "network/detail/net_command.h"

#include <algorithm>
#include <cerrno>

#include <sys/stat.h>
#include <unistd.h>

namespace tavo {
namespace {

// The keys that a bond takes over from its first member, so that the appliance keeps its address.
constexpr const char *kAddressKeys[] = {"BOOTPROTO", "IPADDR",   "NETMASK",  "BROADCAST",
                                        "NETWORK",   "IPV6INIT", "IPV6ADDR", "IPV6PREFIXLENG"};

std::string SavedFile(const std::string &interface)
{
    return InterfaceFile(interface) + ".saved";
}

bool Exists(const std::string &path)
{
    struct stat st;
    return ::lstat(path.c_str(), &st) == 0 || errno != ENOENT;
}

// Reads for one change. A new file made from an unreadable one would lack its lines, so the change is cancelled.
class OldFiles {
  public:
    std::string Setting(const std::string &file, const char *key) { return Note(TryReadSetting(file, key)); }

    std::string Text(const std::string &file)
    {
        auto text = ReadKernelFile(file.c_str());
        return !text && errno == ENOENT ? "" : Note(std::move(text));
    }

    bool HasCopyToRestore(const std::string &interface)
    {
        return Exists(SavedFile(interface)) &&
               (!HasInterfaceFile(interface) || !Setting(InterfaceFile(interface), "MASTER").empty());
    }

    // The file that describes the interface outside of any bond.
    std::string PlainFile(const std::string &interface)
    {
        return HasCopyToRestore(interface) ? SavedFile(interface) : InterfaceFile(interface);
    }

    bool AreRead() const { return read_; }

  private:
    std::string Note(std::optional<std::string> text)
    {
        read_ = read_ && text;
        return text.value_or("");
    }

    bool read_ = true;
};

bool SyncPath(const char *path, int flags)
{
    const Fd fd = OpenFd(path, flags);
    return fd && SyncFd(fd.Get());
}

// The copy must be on the disk before the file that it was made of changes.
bool SaveMember(const std::string &member)
{
    const std::string file = InterfaceFile(member);
    return RunNetCommand("/bin/cp -f %s %s.saved", file, file) == 0 && SyncPath(SavedFile(member).c_str(), O_RDONLY);
}

bool RestoreMember(const std::string &member)
{
    const std::string file = InterfaceFile(member);
    return RunNetCommand("/bin/mv -f %s.saved %s", file, file) == 0;
}

std::string BondText(OldFiles &old, const std::string &bond, BondMode mode, const std::string &first_member)
{
    const std::string file = InterfaceFile(bond);
    std::vector<SettingChange> changes = {
        {"DEVICE", bond}, {"ONBOOT", "yes"}, {"USERCTL", "no"}, {"BONDING_OPTS", std::string(BondOptions(mode))}};
    // A bond that is only changed may have got an address of its own since it was made.
    if (old.Setting(file, "BOOTPROTO").empty()) {
        for (const char *key : kAddressKeys) {
            if (std::string value = old.Setting(old.PlainFile(first_member), key); !value.empty())
                changes.push_back({key, std::move(value)});
        }
    }
    return EditSettings(old.Text(file), changes);
}

std::string MemberText(OldFiles &old, const std::string &bond, const std::string &member)
{
    std::vector<SettingChange> changes = {
        {"DEVICE", member}, {"ONBOOT", "yes"}, {"MASTER", bond}, {"SLAVE", "yes"}, {"BOOTPROTO", "none"}};
    for (const char *key : kAddressKeys) {
        if (std::string_view(key) != "BOOTPROTO")
            changes.push_back({key, std::nullopt});
    }
    return EditSettings(old.Text(old.PlainFile(member)), changes);
}

// Of a member whose copy is lost: any address will do but none.
std::string PlainText(OldFiles &old, const std::string &member)
{
    const SettingChange changes[] = {{"DEVICE", member},
                                     {"ONBOOT", "yes"},
                                     {"BOOTPROTO", "dhcp"},
                                     {"MASTER", std::nullopt},
                                     {"SLAVE", std::nullopt}};
    return EditSettings(old.Text(InterfaceFile(member)), changes);
}

}  // namespace

bool HasInterfaceFile(const std::string &interface)
{
    return Exists(InterfaceFile(interface));
}

std::optional<std::vector<std::string>> MembersOnFile(const std::string &bond)
{
    constexpr std::string_view stem = "ifcfg-";
    const auto names = FolderNames(kInterfaceFolder);
    if (!names)
        return std::nullopt;
    std::vector<std::string> members;
    OldFiles files;
    for (const std::string &file : *names) {
        if (!file.starts_with(stem) || file.ends_with(".saved"))
            continue;
        std::string interface = file.substr(stem.size());
        // A file's own name for its interface tells it from the temporary ones that a crash leaves.
        if (IsInterfaceName(interface) && files.Setting(InterfaceFile(interface), "MASTER") == bond &&
            files.Setting(InterfaceFile(interface), "DEVICE") == interface)
            members.push_back(std::move(interface));
    }
    return files.AreRead() ? std::optional(std::move(members)) : std::nullopt;
}

bool BondChange::PrepareFile(NewFile &file, const std::string &interface, const std::string &text)
{
    file.target = InterfaceFile(interface);
    struct stat old;
    const mode_t mode = ::stat(file.target.c_str(), &old) == 0 ? old.st_mode & 0777 : 0644;
    return file.temp.CreateBeside(file.target) && WriteAll(file.temp.Descriptor(), text) &&
           ::fchmod(file.temp.Descriptor(), mode) == 0 && SyncFd(file.temp.Descriptor()) && file.temp.Close();
}

int BondChange::Prepare(const std::string &bond, BondMode mode, const std::vector<std::string> &members)
{
    bond_ = bond;
    const auto on_file = MembersOnFile(bond);
    if (!on_file)
        return ERR_READ_FAILED;
    OldFiles old;
    std::vector<std::string> plain = members;
    plain.insert(plain.end(), on_file->begin(), on_file->end());
    std::sort(plain.begin(), plain.end());
    plain.erase(std::unique(plain.begin(), plain.end()), plain.end());
    std::copy_if(plain.begin(), plain.end(), std::back_inserter(restored_),
                 [&](const std::string &interface) { return old.HasCopyToRestore(interface); });
    if (mode != BondMode::none)
        members_ = members;

    // Members that neither get their saved file back nor join the new bond must change, too.
    std::erase_if(plain, [&](const std::string &interface) {
        return old.HasCopyToRestore(interface) ||
               (HasInterfaceFile(interface) && old.Setting(InterfaceFile(interface), "MASTER").empty()) ||
               std::find(members_.begin(), members_.end(), interface) != members_.end();
    });

    member_files_ = std::vector<NewFile>(members_.size() + plain.size());
    auto file = member_files_.begin();
    for (const std::string &member : members_) {
        if (!PrepareFile(*file++, member, MemberText(old, bond, member)))
            return ERR_WRITE_FAILED;
    }
    for (const std::string &interface : plain) {
        if (!PrepareFile(*file++, interface, PlainText(old, interface)))
            return ERR_WRITE_FAILED;
    }
    if (!members_.empty() && !PrepareFile(bond_file_, bond, BondText(old, bond, mode, members_.front())))
        return ERR_WRITE_FAILED;
    return old.AreRead() ? 0 : ERR_READ_FAILED;
}

bool BondChange::Dissolve()
{
    const bool restored = std::all_of(restored_.begin(), restored_.end(), RestoreMember);
    return restored && (::unlink(InterfaceFile(bond_).c_str()) == 0 || errno == ENOENT);
}

bool BondChange::Make()
{
    for (const std::string &member : members_) {
        if (HasInterfaceFile(member) && !SaveMember(member))
            return false;
    }
    return members_.empty() || bond_file_.temp.RenameTo(bond_file_.target);
}

bool BondChange::Apply()
{
    const bool done = Dissolve() && Make() &&
                      std::all_of(member_files_.begin(), member_files_.end(),
                                  [](NewFile &file) { return file.temp.RenameTo(file.target); });
    SyncPath(kInterfaceFolder, O_RDONLY | O_DIRECTORY);
    return done;
}

}  // namespace tavo
