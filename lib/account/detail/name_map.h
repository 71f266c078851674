// The renames and deletions to apply to names elsewhere on the appliance, any number of them combined.
#ifndef TAVO_ACCOUNT_DETAIL_NAME_MAP_H
#define TAVO_ACCOUNT_DETAIL_NAME_MAP_H

#include "account/detail/commit_marker.h"

#include <map>
#include <string>
#include <string_view>

namespace tavo {

class NameMap {
  public:
    // Adds the next change, in the order in which they happened: after "bob" to "carol" and "alice" to "bob", no
    // account has the rights of two.
    void Add(const NameStep &step);

    // The new name, "" for a deleted one, nullptr for an unchanged one. Groups have "@" before their name.
    const std::string *Find(std::string_view name) const;

    bool IsEmpty() const { return names_.empty(); }
    const std::map<std::string, std::string, std::less<>> &Names() const { return names_; }  // by upper-case key

  private:
    std::map<std::string, std::string, std::less<>> names_;
    std::map<std::string, std::string, std::less<>> first_;  // the key that the holder of a key began with
};

}  // namespace tavo

#endif
