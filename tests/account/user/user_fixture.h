// Users as the tests make them, and the files that they end up in.
#ifndef TESTS_ACCOUNT_USER_USER_FIXTURE_H
#define TESTS_ACCOUNT_USER_USER_FIXTURE_H

#include "tavo_user.h"

#include "support/test.h"
#include "support/text_lines.h"

#include <array>

namespace test {

inline constexpr std::array<const char *, 4> kAccountFiles{"/etc/passwd", "/etc/shadow", "/etc/tavouser.conf",
                                                           "/usr/tavo/etc/private/smbpasswd"};

struct FreeUser {
    void operator()(TAVOUSER *user) const { TAVOUserFree(user); }
};
using User = std::unique_ptr<TAVOUSER, FreeUser>;

struct UserTexts {
    std::string name;
    std::string password = "";
    int uid = -1;
    int gid = -1;
    std::string description = "";
    std::string home = "";
    std::string shell = "";
    int expire = -1;
    bool cannot_change = false;
    std::string mail = "";
    int privilege = 0;
};

inline User MakeUser(const UserTexts &texts)
{
    TAVOUSER *user = nullptr;
    TAVOUserAlloc(&user, texts.name.c_str(), texts.password.c_str(), texts.uid, texts.gid, texts.description.c_str(),
                  texts.home.c_str(), texts.shell.c_str(), texts.expire, texts.cannot_change, texts.mail.c_str(),
                  texts.privilege);
    return User(user);
}

inline User GetUser(const std::string &name)
{
    TAVOUSER *user = nullptr;
    return TAVOUserGet(name.c_str(), &user) == 0 ? User(user) : User();
}

// The code of a call that succeeds also when an entry is refused: the last refused entry's, 0 when all were applied.
inline int CodeOfBatch(int result)
{
    return result == 0 || TLIBErrGet() != 0 ? TLIBErrGet() : -1;
}

inline int SetUser(const std::optional<std::string> &old_name, const TAVOUSER *user)
{
    TLIBErrSet(ERR_SUCCESS);
    return CodeOfBatch(TAVOUserSetOne(old_name ? old_name->c_str() : nullptr, user));
}

inline int AddUser(const UserTexts &texts)
{
    return SetUser(std::nullopt, MakeUser(texts).get());
}

using Changes = std::vector<std::pair<std::string, std::string>>;  // old name, empty for a new user, and name

inline int SetUsers(const Changes &changes, const std::string &password)
{
    std::vector<User> users;
    std::vector<const TAVOUSER *> records;
    std::vector<const char *> old_names;
    for (const auto &[old_name, name] : changes) {
        users.push_back(MakeUser({.name = name, .password = password}));
        records.push_back(users.back().get());
        old_names.push_back(old_name.empty() ? nullptr : old_name.c_str());
    }
    TLIBErrSet(ERR_SUCCESS);
    return CodeOfBatch(TAVOUserSet(old_names.data(), records.data(), static_cast<int>(records.size())));
}

inline int DeleteUsers(const std::vector<std::string> &names)
{
    std::vector<const char *> doomed;
    for (const std::string &name : names)
        doomed.push_back(name.c_str());
    TLIBErrSet(ERR_SUCCESS);
    return CodeOfBatch(TAVOUserDelete(doomed.data(), static_cast<int>(doomed.size())));
}

inline int DeleteUser(const std::string &name)
{
    return DeleteUsers({name});
}

inline int Rename(const std::string &old_name, const std::string &new_name)
{
    const User old = GetUser(old_name);
    if (!old)
        return TLIBErrGet();
    TAVOUSER renamed = *old;
    renamed.szName = const_cast<char *>(new_name.c_str());
    return SetUser(old_name, &renamed);
}

inline std::string FileText(const char *path)
{
    return std::filesystem::exists(path) ? ReadFile(path) : std::string();
}

inline std::array<std::string, 4> AllFiles()
{
    std::array<std::string, 4> texts;
    for (size_t i = 0; i < texts.size(); ++i)
        texts[i] = FileText(kAccountFiles[i]);
    return texts;
}

// The line of an account; empty when there is none.
inline std::string LineOf(const char *path, const std::string &name)
{
    for (const std::string &line : Lines(FileText(path)))
        if (line.starts_with(name + ":"))
            return line;
    return {};
}

// As Samba writes a hash.
inline std::string Hex(const unsigned char (&hash)[16])
{
    char digits[33];
    for (int i = 0; i < 16; ++i)
        std::snprintf(digits + 2 * i, 3, "%02X", static_cast<unsigned>(hash[i]));
    return digits;
}

}  // namespace test

#endif
