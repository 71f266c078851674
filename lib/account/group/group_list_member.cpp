// Lists the members of a group.
#include "tavo_group.h"
#include "tavo_user.h"

#include "account/detail/account_listing.h"
#include "account/detail/account_name.h"
#include "account/detail/group_line.h"
#include "account/detail/group_owner.h"
#include "core/detail/guard.h"
#include "core/detail/text_fields.h"

#include <optional>

extern "C" int TAVOGroupListMember(const char *szName, TLIBSZLIST **ppList)
{
    if (!szName || !*szName || !ppList || !*ppList)
        return Fail(ERR_BAD_PARAMETERS);
    return Guard([&] {
        const std::optional<std::string> key = tavo::AccountKey(szName, tavo::kGroupKeySize);
        if (key && tavo::IsEverybody(*key)) {
            const int count = TAVOUserEnum(ppList, TAVO_USER_LOCAL);
            return count >= 0 ? count : Fail(tavoerrno);
        }
        tavo::GroupOwner group;
        if (TAVOGroupGet(szName, group.Fill()) != 0)
            return Fail(tavoerrno);
        std::string valid;
        size_t room = 1;
        for (char **member = group->rgszMember; *member; ++member)
            room += std::char_traits<char>::length(*member) + 1;
        valid.resize(room);
        const int length = TAVOUserGetValidUserList(group->rgszMember, valid.data(), static_cast<int>(room));
        if (length < 0)
            return Fail(tavoerrno);
        std::vector<std::string> names;
        for (std::string_view rest(valid.data(), static_cast<size_t>(length) - 1); !rest.empty();)
            names.emplace_back(tavo::TakeUntil(rest, ','));
        return tavo::PushNames(ppList, names) ? static_cast<int>(names.size()) : Fail(ERR_OUT_OF_MEMORY);
    });
}
