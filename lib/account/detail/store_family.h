// The files of an account family: its stores, the text files that they mirror, and the files beside them.
#ifndef TAVO_ACCOUNT_DETAIL_STORE_FAMILY_H
#define TAVO_ACCOUNT_DETAIL_STORE_FAMILY_H

#include "tavo_bdb.h"

#include <array>
#include <cstddef>
#include <span>

namespace tavo {

// Stores belong to root: files that other users may write are never trusted, and only root may read hashes.
inline constexpr unsigned kPublicStore = 0644;
inline constexpr unsigned kSecretStore = 0600;

struct StoreRow {
    const char *path;  // the store
    const char *text;  // whose modification time is the store's sync time
    unsigned mode;     // kPublicStore or kSecretStore
};

struct TextRow {
    const char *path;       // a text file
    const char *temporary;  // where its next generation is written
    unsigned mode;          // of a text file that did not exist
};

struct StoreFamily {
    const char *prefix;  // the names of all store files of the family begin with it
    const char *seal;    // the record that the stores match the text files
    std::span<const StoreRow> stores;
    std::span<const TextRow> texts;  // in the order in which they are moved into place
};

// The places of the stores and of the text files of the user family in its tables.
enum UserStoreIndex : size_t { kNameStore, kMiscStore, kShadowStore, kSmbStore, kUidStore, kUserStores };
enum UserTextIndex : size_t { kSmbText, kShadowText, kPasswdText, kMiscText, kUserTexts };

inline constexpr std::array<TextRow, kUserTexts> kUserTextRows{{
    {"/usr/tavo/etc/private/smbpasswd", "/usr/tavo/etc/private/smbpasswd.tmp", 0600},
    {"/etc/shadow", "/etc/shadow.tmp", 0600},
    {"/etc/passwd", "/etc/passwd.tmp", 0644},
    {"/etc/tavouser.conf", "/etc/tavouser.conf.tmp", 0644},
}};
inline constexpr std::array<StoreRow, kUserStores> kUserStoreRows{{
    {TAVO_USER_DB_NAME, kUserTextRows[kPasswdText].path, kPublicStore},
    {TAVO_USER_DB_MISC, kUserTextRows[kMiscText].path, kPublicStore},
    {TAVO_USER_DB_SHADOW, kUserTextRows[kShadowText].path, kSecretStore},
    {TAVO_USER_DB_SMB, kUserTextRows[kSmbText].path, kSecretStore},
    {TAVO_USER_DB_UID, kUserTextRows[kPasswdText].path, kPublicStore},
}};
inline constexpr StoreFamily kUserFamily{
    "/tmp/.db.user.",
    "/tmp/.db.user.seal",
    kUserStoreRows,
    kUserTextRows,
};

// The same of the group family.
enum GroupStoreIndex : size_t { kGroupNameStore, kGidStore, kDescStore, kGroupStores };
enum GroupTextIndex : size_t { kGroupText, kDescText, kGroupTexts };

inline constexpr std::array<TextRow, kGroupTexts> kGroupTextRows{{
    {"/etc/group", "/etc/group_tmp", 0644},
    {"/etc/group_desc", "/etc/group_desc.tmp", 0644},
}};
inline constexpr std::array<StoreRow, kGroupStores> kGroupStoreRows{{
    {TAVO_GROUP_DB_NAME, kGroupTextRows[kGroupText].path, kPublicStore},
    {TAVO_GROUP_DB_ID, kGroupTextRows[kGroupText].path, kPublicStore},
    {TAVO_GROUP_DB_DESC, kGroupTextRows[kDescText].path, kPublicStore},
}};
inline constexpr StoreFamily kGroupFamily{
    "/tmp/.db.group.",
    "/tmp/.db.group.seal",
    kGroupStoreRows,
    kGroupTextRows,
};

}  // namespace tavo

#endif
