// The library's containers with an owner.
#include "frame/containers.h"

#include <algorithm>
#include <new>

namespace tavoctl {
namespace {

constexpr int first_size = 512;  // bytes; they grow

}  // namespace

StringList::StringList() : list_(PslTLIBSzListAlloc(first_size))
{
    if (!list_)
        throw std::bad_alloc();
}

StringList::StringList(const std::vector<std::string> &items) : StringList()
{
    for (const std::string &item : items)
        Push(item);
}

void StringList::Push(const std::string &item)
{
    if (TLIBSzListPush(&list_, item.c_str()) < 0)
        throw std::bad_alloc();
}

std::vector<std::string> StringList::Items() const
{
    std::vector<std::string> items;
    for (int i = 0; i < list_->nItem; ++i)
        items.emplace_back(SzTLIBSzListGet(list_, i));
    return items;
}

StringHash::StringHash() : hash_(PshTLIBSzHashAlloc(first_size))
{
    if (!hash_)
        throw std::bad_alloc();
}

void StringHash::Set(const std::string &key, const std::string &value)
{
    if (TLIBSzHashSetValue(&hash_, key.c_str(), value.c_str()) < 0)
        throw std::bad_alloc();
}

std::vector<std::pair<std::string, std::string>> StringHash::Pairs() const
{
    StringList keys;
    if (TLIBSzHashEnumKey(hash_, keys.Address()) < 0)
        throw std::bad_alloc();
    std::vector<std::pair<std::string, std::string>> pairs;
    for (std::string &key : keys.Items()) {
        const char *value = Find(key);
        pairs.emplace_back(std::move(key), value ? value : "");
    }
    std::sort(pairs.begin(), pairs.end());
    return pairs;
}

}  // namespace tavoctl
