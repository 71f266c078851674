// The verbs of the user family that are in files of their own.
#ifndef TAVOCTL_USER_VERBS_H
#define TAVOCTL_USER_VERBS_H

#include "tavo_user.h"

#include "account/account_verbs.h"
#include "account/user_record.h"

namespace tavoctl {

struct UserKind {
    using Record = User;
    static constexpr char noun[] = "user";
    static constexpr const char *name_help = user_help;
    static constexpr char delete_warning[] = ", with home folders";
    static constexpr char force_help[] = "also a user who is logged in or has processes";
    static constexpr bool guards_names = false;
    static constexpr int exists_code = ERR_USER_EXISTS;
    static constexpr const auto &columns = user_columns;
    static constexpr const ArgumentKind &kind = user_kind;
    static constexpr const ArgumentKind &new_kind = new_user_kind;
    static constexpr auto remove = TAVOUserDelete;

    static std::vector<User> All(const std::string &prefix, const std::string &part);
    static constexpr auto Find = FindUser;
    static constexpr auto Read = ReadUser;
    static constexpr auto IsSystem = IsSystemUser;
    static void RefuseDelete(const User &user, const std::string &attempted);
    static void RefuseUsed(const User &user, const std::string &attempted);
    static constexpr auto RefuseId = RefuseTakenId;
    static constexpr auto Set = SetUser;
};

// An account in the lists that export writes and import reads.
struct ExportedUser {
    User user;
    std::optional<std::string> hash, lm, nt;  // where all three are known
};

inline constexpr Column<ExportedUser> user_export_columns[] = {
    {"name", [](const ExportedUser &e) { return e.user.name; }},
    {"uid", [](const ExportedUser &e) { return Id(e.user.uid); }, "user id"},
    {"gid", [](const ExportedUser &e) { return Id(e.user.gid); }, "id of the primary group"},
    {"description", [](const ExportedUser &e) { return e.user.description; }},
    {"home", [](const ExportedUser &e) { return e.user.home; }},
    {"shell", [](const ExportedUser &e) { return e.user.shell; }},
    {"mail", [](const ExportedUser &e) { return e.user.mail; }},
    {"privilege", [](const ExportedUser &e) { return PrivilegeText(e.user.privilege); }, "a mask, hexadecimal"},
    {"expires", [](const ExportedUser &e) { return ExpiryText(e.user.expires); }, "the last day, yyyy-mm-dd"},
    {"cannot_change_password", [](const ExportedUser &e) { return e.user.cannot_change_password; }},
    {"password_hash", field<&ExportedUser::hash>, "with --hashes", in_one},
    {"lm_hash", field<&ExportedUser::lm>, "of Samba, with --hashes", in_one},
    {"nt_hash", field<&ExportedUser::nt>, "of Samba, with --hashes", in_one},
};

Action UserAdd(Arguments &in);
Action UserModify(Arguments &in);
Action UserPasswd(Arguments &in);
Action UserExpire(Arguments &in);
template <bool locked>
Action UserLock(Arguments &in);
Action UserAging(Arguments &in);
Action UserImport(Arguments &in);
Action UserExport(Arguments &in);

}  // namespace tavoctl

#endif
