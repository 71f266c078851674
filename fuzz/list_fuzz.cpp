// Any sequence of list operations does what it does to a vector, and never leaves the counted bytes.
#include "tavo_list.h"

#include "input.h"

#include <cstring>
#include <vector>

using fuzz::Check;

namespace {

// Only the texts: where the model cannot know the order (equal items, sorted without regard to case) it takes the list's.
class Pair {
  public:
    ~Pair() { TLIBSzListFree(list_); }

    void Step(fuzz::Input &input)
    {
        switch (input.Byte() % 12) {
        case 0:
        case 1:
            Inserts(input.Byte(), input.Text(40));
            break;
        case 2:
            Inserts(Count(), input.Text(255));
            break;
        case 3:
            Removes(input.Byte());
            break;
        case 4:
            Sets(input.Byte(), input.Text(60));
            break;
        case 5:
            TLIBSzListSortItems(list_, input.Byte() % 34);
            TakeItems();
            break;
        case 6:
            PutsOwnString(input.Byte(), input.Byte());
            break;
        case 7:
            Finds(input.Text(8));
            break;
        case 8:
            TLIBISzListClean(list_);
            TakeItems();
            break;
        case 9:
            if (list_->nSize < 1 << 16)
                list_ = PslTLIBISzListExpand(list_);
            break;
        case 10:
            Combines(input.Byte(), input);
            break;
        default:
            Joins(input.Byte(), input.Text(3));
        }
    }

    void CheckAll() const
    {
        Check(list_->nItem == Count(), "count");
        Check(list_->nFree == list_->nSize - 24 - 4 * list_->nItem - (list_->pszEmpty + 1 - list_->EndofFree), "nFree");
        Check(list_->nFree >= 0 && *list_->pszEmpty == 0, "within the block");
        for (int i = 0; i < list_->nItem; ++i)
            Check(list_->pszItem[i] == items_[static_cast<size_t>(i)], "item");
    }

  private:
    int Count() const { return static_cast<int>(items_.size()); }
    bool Sorted() const { return list_->fMode == 1 || list_->fMode == 16; }
    void TakeItems() { items_.assign(list_->pszItem, list_->pszItem + list_->nItem); }

    void Inserts(int i, const std::string &text)
    {
        const bool sorted = Sorted();
        const int at = TLIBSzListInsert(&list_, i, text.c_str());
        Check(at >= 0 && (sorted || at == i), "index");
        if (at > Count())
            items_.resize(static_cast<size_t>(at));
        items_.insert(items_.begin() + at, text);
    }

    void Removes(int i)
    {
        const char *removed = SzTLIBSzListRemove(list_, i);
        Check((removed != nullptr) == (i < Count()), "removed");
        if (!removed)
            return;
        Check(removed == items_[static_cast<size_t>(i)], "the removed text");
        items_.erase(items_.begin() + i);
    }

    void Sets(int i, const std::string &text)
    {
        const bool sorted = Sorted();
        const int at = TLIBSzListSet(&list_, i, text.c_str());
        if (i >= Count()) {
            Check(at == -1, "no such index");
            return;
        }
        if (sorted) {
            TakeItems();
            return;
        }
        Check(at == i, "index");
        items_[static_cast<size_t>(i)] = text;
    }

    void PutsOwnString(int from, int to)
    {
        if (Count() == 0)
            return;
        from %= Count();
        const std::string text = items_[static_cast<size_t>(from)];
        const char *own = list_->pszItem[from];
        if (to % 2) {
            own = SzTLIBSzListRemove(list_, from);
            items_.erase(items_.begin() + from);
        }
        const int at = TLIBSzListPush(&list_, own);
        items_.insert(items_.begin() + at, text);
    }

    void Finds(const std::string &text) const
    {
        for (const int found : {TLIBSzListFind(list_, text.c_str()), TLIBSzListCaseFind(list_, text.c_str())})
            Check(found >= -1 && found < Count(), "an index of the list");
        const int found = TLIBSzListFind(list_, text.c_str());
        Check(found < 0 || items_[static_cast<size_t>(found)] == text, "what was wanted");
    }

    void Combines(int operation, fuzz::Input &input)
    {
        TLIBSZLIST *other = PslTLIBSzListAlloc(0);
        for (int i = input.Byte() % 8; i > 0; --i)
            TLIBSzListPush(&other, input.Text(6).c_str());
        TLIBSzListSortItems(other, operation & 0x11);
        const int flags = operation & 2 ? TLIB_SZLIST_NEW : 0;
        TLIBSZLIST *result = operation & 4   ? PslTLIBSzListAnd(list_, other, flags)
                             : operation & 8 ? PslTLIBSzListOr(&list_, other, flags)
                                             : PslTLIBSzListSub(list_, other, flags);
        if (result && flags)
            TLIBSzListFree(result);
        TLIBSzListFree(other);
        TakeItems();
    }

    void Joins(int size, const std::string &separator) const
    {
        std::string joined;
        for (int i = 0; i < Count(); ++i)
            joined += (i ? separator : "") + items_[static_cast<size_t>(i)];
        std::vector<char> buffer(static_cast<size_t>(size) + 1);
        const int result = TLIBSzListDump2Str(list_, separator.c_str(), buffer.data(), size + 1);
        Check((result >= 0) == (joined.size() <= static_cast<size_t>(size)), "whether it fits");
        Check(buffer.data() == joined.substr(0, static_cast<size_t>(size)), "the joined text");
    }

    TLIBSZLIST *list_ = PslTLIBSzListAlloc(0);
    std::vector<std::string> items_;
};

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const uint8_t *data, size_t size)
{
    fuzz::Input input(data, size);
    Pair pair;
    while (!input.Empty()) {
        pair.Step(input);
        pair.CheckAll();
    }
    return 0;
}
