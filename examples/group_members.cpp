// Shows every group with its members and its description.
#include <tavosdk.h>

#include <cstdio>
#include <string>
#include <vector>

namespace {

// The library's lists move when they grow; this one asks for the names and keeps them as strings.
template <typename Enumerate>
std::vector<std::string> Names(Enumerate enumerate)
{
    std::vector<std::string> names;
    TLIBSZLIST *list = PslTLIBSzListAlloc(0);
    if (list && enumerate(&list) >= 0)
        names.assign(list->pszItem, list->pszItem + list->nItem);
    TLIBSzListFree(list);
    return names;
}

}  // namespace

int main()
{
    for (const std::string &group : Names([](TLIBSZLIST **list) { return TAVOGroupEnum(list, TAVO_GROUP_LOCAL); })) {
        char description[1024] = "";
        TAVOGroupDescGet(group.c_str(), description, sizeof description);
        std::printf("%s (%s):", group.c_str(), description);
        for (const std::string &member :
             Names([&](TLIBSZLIST **list) { return TAVOGroupListMember(group.c_str(), list); }))
            std::printf(" %s", member.c_str());
        std::putchar('\n');
    }
    return 0;
}
