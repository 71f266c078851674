// The commit marker of the accounts: the steps of a change, written before the first file is moved. It names the new
// files, the changes of names elsewhere on the appliance, and those of home folders. A process that finds it completes
// the change; every step can be repeated. One line per step, blanks between the fields:
//
//     file account|TARGET TEMPORARY PATH IDENTITY-OF-THE-NEW IDENTITY-OF-THE-OLD
//     name user|group TARGETS PENDING OLD NEW     NEW empty: deleted. PENDING: targets without a file line
//     home make|move|remove NAME NEW UID GID INODE
//     stage FOLDER                                with folders to be removed
//     end
//
// It belongs to root and is in /etc, because it must survive a restart of the machine. The holder of the system's lock
// on the password files may read and write it.
#ifndef TAVO_ACCOUNT_DETAIL_COMMIT_MARKER_H
#define TAVO_ACCOUNT_DETAIL_COMMIT_MARKER_H

#include "core/detail/result.h"

#include <cstdint>
#include <string>
#include <string_view>
#include <vector>

namespace tavo {

inline constexpr char kCommitMarker[] = "/etc/.tavoaccount.commit";

// Where else on the appliance users and groups are known by name: bits.
enum Target : unsigned {
    kAccountFile = 0,
    kSambaLists = 1,
    kShareLists = 2,
    kMemberLists = 4,
    kFtpList = 8,
    kBackupUsers = 16,
    kGuestModule = 32,
};

// Identifies a file and its content: it changes with every change of the file. "-" for a file that does not exist.
std::string FileIdentity(const char *path);

struct FileStep {
    unsigned target = kAccountFile;
    std::string temporary;
    std::string path;
    std::string made;    // the identity of the temporary file, complete
    std::string before;  // of the file that it replaces
};

struct NameStep {
    bool is_group = false;
    unsigned targets = 0;
    unsigned pending = 0;
    std::string old_name;
    std::string new_name;  // for kGuestModule: "yes" or "no"
};

struct HomeStep {
    enum Kind { kMake, kMove, kRemove } kind = kMake;
    std::string name;
    std::string new_name;
    int32_t uid = -1;
    int32_t gid = -1;
    uint64_t inode = 0;  // of the folder that is meant, whatever is called so by now
};

struct Marker {
    std::vector<FileStep> files;
    std::vector<NameStep> names;
    std::vector<HomeStep> homes;
    std::vector<std::string> stages;

    bool IsEmpty() const { return files.empty() && names.empty() && homes.empty() && stages.empty(); }
    bool HasMoreThanFiles() const;  // folders, or names that no file line is about

    // A target's new file could not be put in place: its names are changed in what the file says by then.
    void MakePending(unsigned target) noexcept;

    // Keeps only the names that are pending.
    void DropDone();
};

std::string FormatMarker(const Marker &marker);
bool ParseMarker(std::string_view text, Marker &marker);  // false when it was cut short

bool MarkerStands() noexcept;

// 0, also when there is none or only one that was cut short: that change was not decided, and its marker is gone.
// ERR_READ_FAILED.
Code ReadMarker(Marker &marker);

// Replaces it; with `durable` it is on the disk afterwards. False with errno, the old one unchanged.
bool WriteMarker(const std::string &text, bool durable) noexcept;

void RemoveMarker() noexcept;

}  // namespace tavo

#endif
