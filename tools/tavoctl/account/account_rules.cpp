// tavoctl's own rules for accounts, beyond those of the library.
#include "account/account_rules.h"

#include "tavo_str.h"

#include "account/user_record.h"
#include "frame/files.h"

#include <algorithm>
#include <cstdio>

#include <strings.h>

namespace tavoctl {

constexpr std::size_t named_at_most = 5;

std::string SomeOf(const std::vector<std::string> &names)
{
    std::string text;
    for (std::size_t i = 0; i < names.size() && i < named_at_most; ++i)
        text += (i ? ", " : "") + names[i];
    return names.size() > named_at_most ? text + ", ..." : text;
}

void WarnOfName(const std::string &name)
{
    if (name.find_first_not_of("0123456789") == std::string::npos)
        Warn("many programs take the name " + name + " for an id");
    if (name.find(' ') != std::string::npos)
        Warn("some programs do not understand the blank in \"" + name + "\"");
    if (std::any_of(name.begin(), name.end(), [](char c) { return static_cast<unsigned char>(c) >= 0x80; }))
        Warn("letters of the name " + name + " may look like others");
}

int LastUserId()
{
    int last = -1;
    const std::string line = KernelText("/etc/tavouser.conf").value_or("");
    return std::sscanf(line.c_str(), "#$_@UID__INDEX@_$%d$", &last) == 1 ? last : -1;
}

void WarnOfReusedId(const std::string &name, int uid, int last_before)
{
    if (uid <= last_before)
        Warn("the user id " + std::to_string(Id(uid)) +
             " belonged to a deleted user: files of that user now belong to " + name);
}

void RefuseTakenId(const std::string &name, int uid)
{
    const std::optional<User> holder = FindUserById(uid);
    if (holder && ::strcasecmp(holder->name.c_str(), name.c_str()) != 0)
        throw UsageFailure("give " + name + " the user id " + std::to_string(Id(uid)), "it is that of " + holder->name);
}

void RefuseTooMany(int additions, const std::string &attempted)
{
    TLIBErrSet(ERR_SUCCESS);
    const int left = TAVOConfGetUserLimit();
    const bool unknown = left == -1 && TLIBErrGet() != ERR_SUCCESS;  // the model names no limit
    if (!unknown && left < additions)
        throw Failure{.attempted = attempted, .code = ERR_TOO_MANY_USERS};
}

EntryFailures DeleteAll(const std::vector<std::string> &names, int (*remove)(const char *const *, int),
                        bool (*is_there)(const std::string &), const std::string &noun)
{
    const std::vector<const char *> texts = Mapped(names, &std::string::c_str);
    Must(remove(texts.data(), static_cast<int>(texts.size())) == 0,
         "delete the " + noun + (names.size() > 1 ? "s " : " ") + SomeOf(names));
    EntryFailures failures;
    for (const std::string &name : names) {
        const char *const again[] = {name.c_str()};
        if (is_there(name))
            TryAgain(
                name, "delete the " + noun + " " + name, failures, [&] { return remove(again, 1); },
                [&] { return !is_there(name); });
    }
    return failures;
}

std::string AccountKey(const std::string &name)
{
    constexpr std::size_t growth = 6;  // bytes that one may become in upper case
    std::string key(name.size() * growth + 1, '\0');
    if (TLIBUnicodeUTF8StrUpper(name.c_str(), key.data(), static_cast<int>(key.size())) < 0)
        return name;
    return key.c_str();
}

}  // namespace tavoctl
