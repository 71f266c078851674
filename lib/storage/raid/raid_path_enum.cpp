// Lists the paths of all arrays.
#include "tavo_raid.h"

#include "core/detail/guard.h"
#include "storage/detail/array_name.h"
#include "storage/detail/kernel_text.h"

#include <algorithm>
#include <string>
#include <vector>

#include <glob.h>

namespace {

class Arrays {
  public:
    Arrays() : error_(::glob("/sys/block/md[0-9]*/md/array_state", 0, nullptr, &found_)) {}
    ~Arrays() { ::globfree(&found_); }
    Arrays(const Arrays &) = delete;
    Arrays &operator=(const Arrays &) = delete;

    // 0, or the code of what went wrong.
    int Failure() const
    {
        return error_ == 0 || error_ == GLOB_NOMATCH ? 0 : error_ == GLOB_NOSPACE ? ERR_OUT_OF_MEMORY : ERR_OPEN_FAILED;
    }

    // Ascending; a device that holds no array (any more) is "clear".
    std::vector<int> Numbers() const
    {
        constexpr std::string_view block = "/sys/block/md";
        std::vector<int> numbers;
        for (size_t i = 0; error_ == 0 && i < found_.gl_pathc; ++i) {
            const std::string_view path = found_.gl_pathv[i];
            const std::string_view name = path.substr(path.rfind(block) + block.size());
            const auto number = tavo::ArrayNumberText(name.substr(0, name.find('/')));
            if (number && tavo::KernelText(tavo::ArrayFile(*number, "md/array_state")) != "clear")
                numbers.push_back(*number);
        }
        std::sort(numbers.begin(), numbers.end());
        return numbers;
    }

  private:
    glob_t found_ = {};
    int error_;
};

}  // namespace

extern "C" int RAIDPathEnum(TLIBSZLIST **ppList)
{
    if (!ppList || !*ppList)
        return Fail(ERR_BAD_PARAMETERS);
    return Guard([&] {
        const Arrays arrays;
        if (arrays.Failure() != 0)
            return Fail(arrays.Failure());
        const std::vector<int> numbers = arrays.Numbers();
        for (const int number : numbers) {
            if (TLIBSzListPush(ppList, (std::string(tavo::kArray) + std::to_string(number)).c_str()) < 0)
                return -1;
        }
        return static_cast<int>(numbers.size());
    });
}
