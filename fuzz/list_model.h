// Any sequence of list operations does what it does to a plain model: items, results, counters, growth. The fuzzer takes the
// operations from its inputs, the tests from random bytes.
#ifndef FUZZ_LIST_MODEL_H
#define FUZZ_LIST_MODEL_H

#include "tavo_list.h"

#include "input.h"

#include <algorithm>
#include <cstring>
#include <functional>
#include <string>
#include <vector>

#include <strings.h>

namespace fuzz {

// The expected list, on a vector; counts bytes as the appliance does.
class ListModel {
  public:
    struct Item {
        std::string text;
        bool hole;

        auto operator<=>(const Item &) const = default;
    };

    std::vector<Item> items;
    int size = 512;
    int mode = 0;
    int stored = 0;  // bytes of strings since the block was created

    int Count() const { return static_cast<int>(items.size()); }
    int Free() const { return size - 24 - 4 * Count() - stored; }
    int Used() const { return size - Free(); }
    bool IsSorted() const { return mode == 1 || mode == 16; }
    const Item &At(int i) const { return items[static_cast<size_t>(i)]; }

    int Insert(int i, const std::string &text)
    {
        if (IsSorted()) {
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
            const int order = Compare(text, At(mid).text);
            if (order == 0)
                return mid;
            (order < 0 ? hi : lo) = order < 0 ? mid - 1 : mid + 1;
        }
        return -(lo + 1);
    }

    int Scan(const std::string &text, bool fold) const
    {
        for (int i = 0; i < Count(); ++i) {
            const Item &item = At(i);
            if (!item.hole && (fold ? ::strcasecmp(item.text.c_str(), text.c_str()) == 0 : item.text == text))
                return i;
        }
        return -1;
    }

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

// A list and its model.
class ListPair {
  public:
    explicit ListPair(Input &input) : input_(input) {}
    ~ListPair() { TLIBSzListFree(list_); }
    ListPair(const ListPair &) = delete;
    ListPair &operator=(const ListPair &) = delete;

    void Step()
    {
        const int operation = Any(100);
        const std::string text = Text();
        if (operation < 30)
            Inserts(operation < 12 ? Any(model_.Count() + 3) : operation < 24 ? model_.Count() : 0, text);
        else if (operation < 48)
            Removes(operation);
        else if (operation < 58)
            Sets(text);
        else if (operation < 76)
            Finds(text);
        else if (operation < 78)
            Sorts();
        else if (operation < 80)
            Shrinks();
        else if (operation < 83)
            Combines();
        else if (operation < 86)
            Joins(text);
        else
            PutsOwnString();
        if (model_.Count() > 60 || (model_.mode && Any(50) == 0))
            StartAgain();
        CheckAll();
    }

  private:
    int Any(int below) { return (input_.Byte() + (below > 256 ? 256 * input_.Byte() : 0)) % below; }

    std::string Text()
    {
        std::string text(static_cast<size_t>(Any(10) == 0 ? Any(120) : Any(5)), ' ');
        for (char &letter : text)
            letter = "abAB"[Any(4)];
        return text;
    }

    void CheckAll() const { CheckList(list_, model_); }

    static void CheckList(const TLIBSZLIST *list, const ListModel &model)
    {
        Check(list && list->nItem == model.Count(), "count");
        Check(list->nSize == model.size && list->nFree == model.Free(), "sizes");
        Check(list->fMode == model.mode, "mode");
        Check(list->pszEmpty + 1 - list->EndofFree == model.stored && *list->pszEmpty == 0, "stored bytes");
        Check(static_cast<const void *>(list->pszItem + list->nItem) <= list->EndofFree, "within the block");
        for (int i = 0; i < list->nItem; ++i)
            Check(list->pszItem[i] == model.At(i).text && IsHole(list, i) == model.At(i).hole, "item");
    }

    static std::vector<ListModel::Item> ItemsOf(const TLIBSZLIST *list)
    {
        std::vector<ListModel::Item> items;
        for (int i = 0; i < list->nItem; ++i)
            items.push_back({list->pszItem[i], IsHole(list, i)});
        return items;
    }

    static bool IsHole(const TLIBSZLIST *list, int i) { return list->pszItem[i] == list->pszEmpty; }

    void Inserts(int i, const std::string &text)
    {
        const int expected = model_.Insert(i, text);
        Check(TLIBSzListInsert(&list_, i, text.c_str()) == expected, "place of a new item");
    }

    void Removes(int operation)
    {
        Check(!SzTLIBSzListRemove(list_, model_.Count()), "removed beyond the end");
        if (model_.Count() == 0)
            return;
        const int i = operation < 40 ? Any(model_.Count()) : operation < 44 ? 0 : model_.Count() - 1;
        const char *removed = operation < 40   ? SzTLIBSzListRemove(list_, i)
                              : operation < 44 ? SzTLIBSzListShift(list_)
                                               : SzTLIBSzListPop(list_);
        Check(removed && removed == model_.At(i).text, "the removed text");
        model_.items.erase(model_.items.begin() + i);
    }

    void Sets(const std::string &text)
    {
        Check(TLIBSzListSet(&list_, model_.Count(), text.c_str()) == -1, "set beyond the end");
        if (model_.Count() == 0)
            return;
        const int i = Any(model_.Count());
        model_.Set(i, text);
        const int result = TLIBSzListSet(&list_, i, text.c_str());
        if (model_.IsSorted()) {
            TakeOrder();
            Check(result == (model_.mode == 1 ? model_.Search(text) : -1), "place of a changed item");
        } else {
            Check(result == i, "place of a changed item");
        }
    }

    void Finds(const std::string &text)
    {
        const bool fold = model_.mode == 16 || (model_.mode != 1 && Any(2) == 0);
        const int expected = model_.IsSorted() ? std::max(-1, model_.Search(text)) : model_.Scan(text, fold);
        Check((fold ? TLIBSzListCaseFind : TLIBSzListFind)(list_, text.c_str()) == expected, "place of a found item");
    }

    void Sorts()
    {
        static const int modes[] = {0, 1, 2, 16, 17};
        const int mode = modes[Any(5)];
        const bool sorts = model_.mode == 0 && (mode & 17);
        TLIBSzListSortItems(list_, mode);
        if (sorts)
            model_.Clean();
        // Relabelled lists are out of order, which the model does not follow.
        model_.mode = sorts && mode == 17 ? 1 : mode;
        if (sorts)
            TakeOrder();
        if (model_.mode != mode || (!sorts && mode))
            StartAgain();
    }

    // Equal items may be in any order. The model adopts the list's order once it is checked to be a valid one.
    void TakeOrder()
    {
        const std::vector<ListModel::Item> ordered = ItemsOf(list_);
        const auto in_order = [&](const auto &a, const auto &b) {
            return model_.Compare(a.text, b.text) < 0;
        };
        Check(std::is_sorted(ordered.begin(), ordered.end(), in_order), "order");
        std::vector<ListModel::Item> left = ordered, right = model_.items;
        std::sort(left.begin(), left.end());
        std::sort(right.begin(), right.end());
        Check(left == right, "sorted items");
        model_.items = ordered;
    }

    void Shrinks()
    {
        if (Any(2)) {
            TLIBISzListClean(list_);
            model_.Clean();
        } else if (Any(4) == 0 && model_.size < 100000) {
            list_ = PslTLIBISzListExpand(list_);
            model_.Expand();
        } else if (Any(4) == 0) {
            TLIBSzListRemoveAll(list_);
            model_.items.clear();
            model_.stored = 0;
        }
    }

    // Sets of two lists: the order of the first one, the comparison of the second one.
    void Combines()
    {
        TLIBSZLIST *other = PslTLIBSzListAlloc(0);
        ListModel b;
        for (int i = Any(8); i > 0; --i) {
            const std::string text = Text();
            TLIBSzListPush(&other, text.c_str());
            b.Insert(b.Count(), text);
        }
        b.mode = Any(2) + 16 * Any(2);
        TLIBSzListSortItems(other, b.mode);
        b.items = ItemsOf(other);
        const bool is_new = Any(2);
        const int operation = Any(3);
        const int flags = is_new ? TLIB_SZLIST_NEW : 0;
        const TLIBSZLIST *const before = list_;
        TLIBSZLIST *result = operation == 0   ? PslTLIBSzListAnd(list_, other, flags)
                             : operation == 1 ? PslTLIBSzListOr(&list_, other, flags)
                                              : PslTLIBSzListSub(list_, other, flags);
        CheckList(other, b);
        if (model_.IsSorted() && b.IsSorted() && model_.mode != b.mode) {
            Check(!result, "lists of different orders");
        } else {
            const auto is_wanted = [&](const ListModel::Item &item) {
                return !item.hole && (operation == 1 || (b.Scan(item.text, b.mode == 16) >= 0) == (operation == 0));
            };
            ListModel expected = is_new ? ListModel() : model_;
            if (is_new) {
                expected.size = std::max(512, model_.Used() + (operation == 1 ? b.Used() : 0));
                expected.mode = model_.mode;
                for (const ListModel::Item &item : model_.items) {
                    if (is_wanted(item))
                        expected.items.push_back(expected.Store(item.text));
                }
            } else {
                std::erase_if(expected.items, std::not_fn(is_wanted));
            }
            if (operation == 1)
                Unites(expected, b);
            Check(result == list_ ? !is_new : is_new && list_ == before, "the list of the result");
            CheckList(result, expected);
            if (!is_new)
                model_ = expected;
        }
        if (is_new)
            TLIBSzListFree(result);
        TLIBSzListFree(other);
    }

    void Unites(ListModel &into, const ListModel &b) const
    {
        std::vector<std::string> missing;
        int bytes = 0;
        for (const ListModel::Item &item : b.items) {
            if (item.hole || model_.Scan(item.text, b.mode == 16) >= 0)
                continue;
            missing.push_back(item.text);
            bytes += static_cast<int>(item.text.size()) + 5;
        }
        into.MakeRoom(bytes);
        for (const std::string &text : missing)
            into.Insert(into.Count(), text);
    }

    void Joins(const std::string &separator)
    {
        std::string joined;
        for (int i = 0; i < model_.Count(); ++i)
            joined += (i ? separator : "") + model_.At(i).text;
        const size_t room = static_cast<size_t>(Any(256));
        std::vector<char> buffer(room + 1);
        const int result = TLIBSzListDump2Str(list_, separator.c_str(), buffer.data(), static_cast<int>(buffer.size()));
        Check((result >= 0) == (joined.size() <= room), "whether it fits");
        Check(buffer.data() == joined.substr(0, room), "the joined text");
    }

    // Adds a string of the list itself again, or its end, also of one that was removed from it.
    void PutsOwnString()
    {
        if (model_.Count() == 0)
            return;
        const int from = Any(model_.Count());
        const bool take_out = Any(2);
        const std::string whole = model_.At(from).text;
        const size_t skipped = static_cast<size_t>(Any(3) ? 0 : Any(static_cast<int>(whole.size()) + 1));
        const std::string text = whole.substr(skipped);
        const char *own = (take_out ? SzTLIBSzListRemove(list_, from) : list_->pszItem[from]) + skipped;
        if (take_out)
            model_.items.erase(model_.items.begin() + from);
        const int to = Any(model_.Count() + 2);
        if (to < model_.Count() && !model_.mode && Any(2)) {
            model_.Set(to, text);
            Check(TLIBSzListSet(&list_, to, own) == to, "place of an own text");
        } else {
            const int expected = model_.Insert(to, text);
            Check(TLIBSzListInsert(&list_, to, own) == expected, "place of an own text");
        }
    }

    void StartAgain()
    {
        TLIBSzListFree(list_);
        list_ = PslTLIBSzListAlloc(0);
        model_ = {};
    }

    Input &input_;
    TLIBSZLIST *list_ = PslTLIBSzListAlloc(0);
    ListModel model_;
};

}  // namespace fuzz

#endif
