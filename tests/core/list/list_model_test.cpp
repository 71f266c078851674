// Random operations on a list and on a plain model of it, compared after each: items, results, counters, growth.
#include "tavo_list.h"

#include "support/container_text.h"
#include "support/test.h"

#include <cctype>
#include <random>

namespace {

constexpr int kOperations = 600000;

// The expected list, on a vector; counts bytes as the appliance does.
class Model {
  public:
    struct Item {
        std::string text;
        bool hole;
    };

    std::vector<Item> items;
    int size = 512;
    int mode = 0;
    int stored = 0;  // bytes of strings since the block was created

    int Count() const { return static_cast<int>(items.size()); }
    int Free() const { return size - 24 - 4 * Count() - stored; }

    int Insert(int i, const std::string &text)
    {
        if (mode == 1 || mode == 16) {
            const int found = Search(text);
            i = found < 0 ? -found - 1 : found;
        }
        MakeRoom(static_cast<int>(text.size()) + 1 + 4 * (std::max(0, i - Count()) + 1));
        while (Count() < i)
            items.push_back({"", true});
        items.insert(items.begin() + i, Store(text));
        return i;
    }

    void Set(int i, const std::string &text)
    {
        Item &item = items[static_cast<size_t>(i)];
        if (text.size() <= item.text.size()) {
            item.text = text;
            return;
        }
        MakeRoom(static_cast<int>(text.size()) + 1);
        item = Store(text);
    }

    void Expand()
    {
        size *= 2;
        stored = 0;
        for (Item &item : items) {
            if (!item.hole)
                item = Store(item.text);
        }
    }

    void Clean()
    {
        std::erase_if(items, [](const Item &item) { return item.hole; });
    }

    int Compare(const std::string &a, const std::string &b) const
    {
        return mode == 16 ? ::strcasecmp(a.c_str(), b.c_str()) : a.compare(b);
    }

    int Search(const std::string &text) const
    {
        int lo = 0;
        int hi = Count() - 1;
        while (lo <= hi) {
            const int mid = (lo + hi) / 2;
            const int order = Compare(text, items[static_cast<size_t>(mid)].text);
            if (order == 0)
                return mid;
            (order < 0 ? hi : lo) = order < 0 ? mid - 1 : mid + 1;
        }
        return -(lo + 1);
    }

    int Scan(const std::string &text, bool fold) const
    {
        for (int i = 0; i < Count(); ++i) {
            const Item &item = items[static_cast<size_t>(i)];
            if (!item.hole && (fold ? ::strcasecmp(item.text.c_str(), text.c_str()) == 0 : item.text == text))
                return i;
        }
        return -1;
    }

  private:
    void MakeRoom(int bytes)
    {
        while (Free() < bytes)
            Expand();
    }

    // The first string of a block ends in the byte that all holes share: an empty first string is a hole.
    Item Store(const std::string &text)
    {
        const bool hole = text.empty() && stored == 0;
        stored += static_cast<int>(text.size()) + 1;
        return {text, hole};
    }
};

class Pair {
  public:
    explicit Pair(unsigned seed) : random_(seed), list_(PslTLIBSzListAlloc(0)) {}

    void Step()
    {
        const int operation = Any(100);
        const std::string text = Text();
        if (operation < 30)
            Inserts(operation < 12 ? Any(model_.Count() + 3) : operation < 24 ? model_.Count() : 0, text);
        else if (operation < 50)
            Removes(operation);
        else if (operation < 60)
            Sets(text);
        else if (operation < 80)
            Finds(text);
        else if (operation < 81)
            Sorts();
        else if (operation < 82)
            Shrinks();
        else
            PutsOwnString();
        if (model_.Count() > 60 || (model_.mode && Any(50) == 0))
            StartAnew();
    }

    void Check() const
    {
        const TLIBSZLIST *list = list_.get();
        ASSERT_EQ(list->nItem, model_.Count());
        ASSERT_EQ(list->nSize, model_.size);
        ASSERT_EQ(list->nFree, model_.Free());
        ASSERT_EQ(list->fMode, model_.mode);
        ASSERT_EQ(list->pszEmpty + 1 - list->EndofFree, model_.stored);
        ASSERT_LE(static_cast<const void *>(list->pszItem + list->nItem), list->EndofFree);
        for (int i = 0; i < list->nItem; ++i) {
            const Model::Item &item = model_.items[static_cast<size_t>(i)];
            ASSERT_EQ(list->pszItem[i], item.text);
            ASSERT_EQ(list->pszItem[i] == list->pszEmpty, item.hole);
        }
    }

  private:
    int Any(int below) { return std::uniform_int_distribution(0, below - 1)(random_); }

    std::string Text()
    {
        static const char letters[] = "abAB";
        std::string text(static_cast<size_t>(Any(10) == 0 ? Any(120) : Any(5)), ' ');
        for (char &letter : text)
            letter = letters[Any(4)];
        return text;
    }

    void Inserts(int i, const std::string &text)
    {
        const int expected = model_.Insert(i, text);
        ASSERT_EQ(test::Moving(list_, [&](auto **addr) { return TLIBSzListInsert(addr, i, text.c_str()); }), expected);
    }

    void Removes(int operation)
    {
        if (model_.Count() == 0)
            return;
        const int i = operation < 40 ? Any(model_.Count()) : operation < 45 ? 0 : model_.Count() - 1;
        const char *removed = operation < 40   ? SzTLIBSzListRemove(list_.get(), i)
                              : operation < 45 ? SzTLIBSzListShift(list_.get())
                                               : SzTLIBSzListPop(list_.get());
        ASSERT_EQ(removed, model_.items[static_cast<size_t>(i)].text);
        model_.items.erase(model_.items.begin() + i);
    }

    void Sets(const std::string &text)
    {
        if (model_.Count() == 0)
            return;
        const int i = Any(model_.Count());
        model_.Set(i, text);
        const int result = test::Moving(list_, [&](auto **addr) { return TLIBSzListSet(addr, i, text.c_str()); });
        if (model_.mode == 1 || model_.mode == 16) {
            TakeOrder();
            ASSERT_EQ(result, model_.mode == 1 ? model_.Search(text) : -1);
        } else {
            ASSERT_EQ(result, i);
        }
    }

    void Finds(const std::string &text)
    {
        const bool fold = model_.mode == 16 || (model_.mode != 1 && Any(2) == 0);
        const bool sorted = model_.mode == 1 || model_.mode == 16;
        const int expected = sorted ? std::max(-1, model_.Search(text)) : model_.Scan(text, fold);
        ASSERT_EQ((fold ? TLIBSzListCaseFind : TLIBSzListFind)(list_.get(), text.c_str()), expected);
    }

    void Sorts()
    {
        static const int modes[] = {0, 1, 2, 16, 17};
        const int mode = modes[Any(5)];
        const bool sorts = model_.mode == 0 && (mode & 17);
        TLIBSzListSortItems(list_.get(), mode);
        if (sorts)
            model_.Clean();
        // Relabelled lists are out of order, which the model does not follow.
        model_.mode = sorts && mode == 17 ? 1 : mode;
        if (sorts)
            TakeOrder();
        if (model_.mode != mode || (!sorts && mode))
            StartAnew();
    }

    // Equal items may be in any order. The model adopts the list's order once it is checked to be a valid one.
    void TakeOrder()
    {
        std::vector<Model::Item> ordered;
        for (int i = 0; i < list_->nItem; ++i)
            ordered.push_back({list_->pszItem[i], list_->pszItem[i] == list_->pszEmpty});
        const auto by_bytes = [](const Model::Item &a, const Model::Item &b) {
            return std::pair(a.text, a.hole) < std::pair(b.text, b.hole);
        };
        const auto in_order = [&](const Model::Item &a, const Model::Item &b) {
            return model_.Compare(a.text, b.text) < 0;
        };
        ASSERT_TRUE(std::is_sorted(ordered.begin(), ordered.end(), in_order));
        std::vector<Model::Item> left = ordered;
        std::vector<Model::Item> right = model_.items;
        std::sort(left.begin(), left.end(), by_bytes);
        std::sort(right.begin(), right.end(), by_bytes);
        ASSERT_TRUE(std::equal(left.begin(), left.end(), right.begin(), right.end(),
                               [](const auto &a, const auto &b) { return a.text == b.text && a.hole == b.hole; }));
        model_.items = ordered;
    }

    void Shrinks()
    {
        if (Any(2)) {
            TLIBISzListClean(list_.get());
            model_.Clean();
        } else if (Any(4) == 0 && model_.size < 100000) {
            list_.reset(PslTLIBISzListExpand(list_.release()));
            model_.Expand();
        } else if (Any(4) == 0) {
            TLIBSzListRemoveAll(list_.get());
            model_.items.clear();
            model_.stored = 0;
        }
    }

    // Adds a string of the list itself again, or its end, also of one that was removed from it.
    void PutsOwnString()
    {
        if (model_.Count() == 0)
            return;
        const int from = Any(model_.Count());
        const bool take_out = Any(2);
        const std::string &whole = model_.items[static_cast<size_t>(from)].text;
        const size_t skipped = static_cast<size_t>(Any(3) ? 0 : Any(static_cast<int>(whole.size()) + 1));
        const std::string text = whole.substr(skipped);
        const char *own = (take_out ? SzTLIBSzListRemove(list_.get(), from) : list_->pszItem[from]) + skipped;
        if (take_out)
            model_.items.erase(model_.items.begin() + from);
        const int to = Any(model_.Count() + 2);
        if (to < model_.Count() && !model_.mode && Any(2)) {
            model_.Set(to, text);
            test::Moving(list_, [&](auto **addr) { return TLIBSzListSet(addr, to, own); });
        } else {
            const int expected = model_.Insert(to, text);
            ASSERT_EQ(test::Moving(list_, [&](auto **addr) { return TLIBSzListInsert(addr, to, own); }), expected);
        }
    }

    void StartAnew()
    {
        list_.reset(PslTLIBSzListAlloc(0));
        model_ = {};
    }

    std::mt19937 random_;
    test::List list_;
    Model model_;
};

TEST(ListModel, AgreesAtEveryStep)
{
    Pair pair(20260);
    for (int step = 0; step < kOperations && !testing::Test::HasFatalFailure(); ++step) {
        SCOPED_TRACE(step);
        pair.Step();
        pair.Check();
    }
}

}  // namespace
