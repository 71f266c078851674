// The interface files of a bond and of its members.
//
// A process may die between any two of the steps, so they are ordered for a network that starts whatever was reached:
// copies of the members' files first, then the bond's file, then the members'; when a bond is dissolved the members'
// files first, then the bond's. A copy counts only while the file that it was made of names a bond: else it is the
// remainder of a change that was cut off, and maybe half a file.
#ifndef TAVO_NETWORK_DETAIL_BOND_FILES_H
#define TAVO_NETWORK_DETAIL_BOND_FILES_H

#include "core/detail/file_rewrite.h"
#include "network/detail/bonding.h"

#include <optional>
#include <string>
#include <vector>

namespace tavo {

// The interfaces whose files say that they are members of the bond; in no order. Empty when a file cannot be read.
std::optional<std::vector<std::string>> MembersOnFile(const std::string &bond);

bool HasInterfaceFile(const std::string &interface);

// One change of a bond, from preparation to the last file.
class BondChange {
  public:
    // Writes all new files beside the old ones, so that a lack of room is noticed here, while the network still runs.
    // Mode none dissolves; `members` are then those that become plain interfaces even without a copy to restore. 0 or
    // ERR_READ_FAILED, ERR_WRITE_FAILED: nothing has changed.
    int Prepare(const std::string &bond, BondMode mode, const std::vector<std::string> &members);

    // Puts them in place. When it fails some of them are, and the caller puts the old ones back.
    bool Apply();

  private:
    struct NewFile {
        std::string target;
        TempFile temp;
    };

    bool PrepareFile(NewFile &file, const std::string &interface, const std::string &text);
    bool Dissolve();
    bool Make();

    std::string bond_;
    std::vector<std::string> members_;   // of the new bond
    std::vector<std::string> restored_;  // get their saved file back first
    NewFile bond_file_;
    std::vector<NewFile> member_files_;  // members of the new bond, or plain interfaces of a dissolved one
};

}  // namespace tavo

#endif
