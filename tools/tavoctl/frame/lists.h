// Lists: the short loops that every verb needs.
#ifndef TAVOCTL_LISTS_H
#define TAVOCTL_LISTS_H

#include <algorithm>
#include <functional>
#include <type_traits>
#include <vector>

namespace tavoctl {

// The results of a function, or a member, for each item; as Made where that is given.
template <class Made = void, class List, class Make>
auto Mapped(const List &list, Make make)
{
    using Result = std::decay_t<std::invoke_result_t<Make &, decltype(*std::begin(list))>>;
    std::vector<std::conditional_t<std::is_void_v<Made>, Result, Made>> made;
    for (const auto &item : list)
        made.emplace_back(std::invoke(make, item));
    return made;
}

template <class List, class Item>
bool Contains(const List &list, const Item &item)
{
    return std::find(std::begin(list), std::end(list), item) != std::end(list);
}

template <class List>
List Sorted(List list)
{
    std::sort(list.begin(), list.end());
    return list;
}

}  // namespace tavoctl

#endif
