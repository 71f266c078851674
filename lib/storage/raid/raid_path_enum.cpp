// Lists the paths of all arrays.
#include "tavo_raid.h"

#include "core/detail/guard.h"
#include "storage/detail/array_name.h"
#include "storage/detail/kernel_text.h"
#include "storage/detail/matching_paths.h"

#include <algorithm>
#include <string>
#include <vector>

namespace {

// Ascending; a device that holds no array (any more) is "clear".
std::vector<int> Numbers(const std::vector<std::string> &states)
{
    constexpr std::string_view block = "/sys/block/md";
    std::vector<int> numbers;
    for (const std::string_view path : states) {
        const std::string_view name = path.substr(path.rfind(block) + block.size());
        const auto number = tavo::ArrayNumberText(name.substr(0, name.find('/')));
        if (number && tavo::KernelText(tavo::ArrayFile(*number, "md/array_state")) != "clear")
            numbers.push_back(*number);
    }
    std::sort(numbers.begin(), numbers.end());
    return numbers;
}

}  // namespace

extern "C" int RAIDPathEnum(TLIBSZLIST **ppList)
{
    if (!ppList || !*ppList)
        return Fail(ERR_BAD_PARAMETERS);
    return Guard([&] {
        const auto states = tavo::MatchingPaths("/sys/block/md[0-9]*/md/array_state");
        if (!states)
            return Fail(states.Failure());
        const std::vector<int> numbers = Numbers(*states);
        for (const int number : numbers) {
            if (TLIBSzListPush(ppList, (std::string(tavo::kArray) + std::to_string(number)).c_str()) < 0)
                return -1;
        }
        return static_cast<int>(numbers.size());
    });
}
