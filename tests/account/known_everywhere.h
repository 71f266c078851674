// Users and groups whose names stand in every file of the appliance that knows accounts, and all of these files.
#ifndef TESTS_ACCOUNT_KNOWN_EVERYWHERE_H
#define TESTS_ACCOUNT_KNOWN_EVERYWHERE_H

#include "account/group/group_fixture.h"
#include "support/test.h"

namespace test {

using Files = std::map<std::string, std::string>;

inline constexpr const char *kFiles[] = {
    "/etc/passwd",    "/etc/shadow",         "/etc/tavouser.conf",         "/usr/tavo/etc/private/smbpasswd",
    "/etc/group",     "/etc/group_desc",     "/usr/tavo/etc/smb.conf",     "/usr/tavo/etc/share.conf",
    "/etc/ftpchroot", "/etc/rsyncd.secrets", "/usr/tavo/etc/netbkp.users", "/usr/tavo/etc/afpd.conf",
};
inline constexpr char kHomeFolder[] = "/var/services/homes";

// The text of every file, and who has a home with what in it.
inline Files Everything()
{
    Files found;
    for (const char *path : kFiles)
        found[path] = FileText(path);
    for (const char *folder : {kHomeFolder, "/volume1/homes"})
        for (const auto &home : std::filesystem::directory_iterator(folder))
            found[home.path()] = FileText((home.path() / "file").c_str());
    return found;
}

inline void PutBack(const Files &files)
{
    for (const char *folder : {kHomeFolder, "/volume1/homes", "/volume1/@tmp"})
        std::filesystem::remove_all(folder);
    for (const char *folder : {kHomeFolder, "/volume1/homes"})
        std::filesystem::create_directories(folder);
    for (const auto &[path, text] : files) {
        if (path.starts_with(kHomeFolder) || path.starts_with("/volume1/homes")) {
            std::filesystem::create_directories(path);
            WriteFile(path + "/file", text);
        } else if (FileText(path.c_str()) != text) {
            WriteFile(path, text);
        }
    }
}

// Accounts that every neighbour knows.
inline void StartKnownEverywhere()
{
    std::filesystem::create_directories("/volume1/homes");
    std::filesystem::create_directories(kHomeFolder);
    std::filesystem::create_directories("/usr/tavo/etc");
    WriteFile("/etc/tavoinfo.conf", "userHomeEnable=\"yes\"\n");
    WriteFile("/etc.defaults/tavoinfo.conf", "netbkp=\"yes\"\nmaxaccounts=\"2048\"\n");
    ASSERT_EQ(SetUsers({{"", "alice"}, {"", "bob"}, {"", "carol"}}, "secret"), 0);
    ASSERT_EQ(AddGroup("staff", -1, {"alice", "bob", "carol"}), 0);
    ASSERT_EQ(TAVOGroupDescSet("staff", "old hands"), 0);
    WriteFile("/usr/tavo/etc/smb.conf", "[x]\n\tvalid users = alice,@staff,bob,carol\n\twrite list = \"bob\"\n");
    WriteFile("/usr/tavo/etc/share.conf",
              "[homes]\n\tpath=\"/volume1/homes\"\n[x]\n\treadwrite=\"alice,@staff,@users\"\n");
    WriteFile("/etc/ftpchroot", "alice\nbob\n");
    WriteFile("/usr/tavo/etc/netbkp.users", "alice\nbob\ndave\n");
    WriteFile("/etc/rsyncd.secrets", "alice:secret\nbob:secret\n", 0600);
    WriteFile("/usr/tavo/etc/afpd.conf", "- -uamlist uams_guest.so\n");
    for (const char *folder : {kHomeFolder, "/volume1/homes"})
        for (const std::string name : {"alice", "bob", "carol"}) {
            std::filesystem::create_directories(std::string(folder) + "/" + name);
            WriteFile(std::string(folder) + "/" + name + "/file", name + "'s");
        }
}

// Any change of another account finishes what was begun; this one leaves everything as it is.
inline int NextChange()
{
    return TAVOGroupDescSet("users", "Every local user");
}

inline std::string Difference(const Files &found, const Files &wanted)
{
    std::string text;
    for (const auto &[path, content] : wanted)
        if (!found.contains(path) || found.at(path) != content)
            text += path + " has\n" + (found.contains(path) ? found.at(path) : "(nothing)") + "instead of\n" + content;
    for (const auto &[path, content] : found)
        if (!wanted.contains(path))
            text += path + " is there\n";
    return text;
}

}  // namespace test

#endif
