// Lists: published numbers, orders, refusals. The fuzzer's model, with random operations, checks what each of them does.
#include "tavo_list.h"

#include "fuzz/list_model.h"
#include "support/container_text.h"
#include "support/rounds.h"
#include "support/test.h"

#include <climits>
#include <random>

#include <malloc.h>

using test::Items;
using test::LastFault;
using test::List;
using test::MakeList;
using testing::ElementsAre;
using Texts = std::vector<std::string>;

namespace {

int Insert(List &list, int i, const char *text)
{
    return test::Moving(list, [&](auto **addr) { return TLIBSzListInsert(addr, i, text); });
}

struct Refusal {
    const char *name;
    std::function<bool()> call;  // true: the function returned its failure value
    test::Fault fault = {};
};
#define INT(call)                                                                                                      \
#call, [&] {                                                                                                       \
        return (call) == -1;                                                                                           \
    }
#define PTR(call)                                                                                                      \
#call, [&] {                                                                                                       \
        return (call) == nullptr;                                                                                      \
    }

TEST(ListModel, AgreesAfterEachOperation)
{
    std::vector<uint8_t> bytes(static_cast<size_t>(test::Rounds(8'000'000)));
    std::generate(bytes.begin(), bytes.end(), std::mt19937(20260));
    fuzz::Input input(bytes.data(), bytes.size());
    fuzz::ListPair pair(input);
    while (!input.Empty())
        pair.Step();
}

TEST(ListAlloc, CountsInWordsOfTheAppliance)
{
    const struct {
        int asked;
        int size;
    } rows[] = {{0, 512}, {-7, 512}, {511, 512}, {512, 512}, {513, 513}, {4099, 4099}};
    for (const auto &row : rows) {
        const List list(PslTLIBSzListAlloc(row.asked));
        ASSERT_TRUE(list);
        EXPECT_EQ(list->nSize, row.size);
        EXPECT_EQ(list->nFree, row.size - 24);
        EXPECT_EQ(list->nItem, 0);
        EXPECT_EQ(TLIBSzListSorted(list.get()), 0);
        EXPECT_EQ(*list->pszEmpty, '\0');
        // The block ends where the counted bytes end, with the pointers as wide as they are here.
        const size_t wider = sizeof *list - 24 + (sizeof(char *) - 4) * (static_cast<size_t>(row.size - 24) / 4);
        EXPECT_EQ(list->pszEmpty + 1, reinterpret_cast<char *>(list.get()) + row.size + wider);
        EXPECT_EQ(list->EndofFree, list->pszEmpty + 1);
    }
}

TEST(ListInsert, FoldsBeyondAscii)
{
    List folded = MakeList({"b", "A", "C"}, TLIB_SZLIST_CASESORTED);
    EXPECT_EQ(Insert(folded, 0, "Ä"), 3);
    EXPECT_EQ(Insert(folded, 0, "B"), 1);
    EXPECT_THAT(Items(folded.get()), ElementsAre("A", "B", "b", "C", "Ä"));
    EXPECT_EQ(TLIBSzListCaseFind(folded.get(), "ä"), 4);
    EXPECT_EQ(TLIBSzListCaseFind(MakeList({"c", "b", "a"}).get(), "C"), 0) << "not in order: from the front";
}

TEST(ListSort, OnlyAnUnsortedListIsSorted)
{
    List list = MakeList({"b", "C", "a"}, TLIB_SZLIST_SORTED);
    EXPECT_THAT(Items(list.get()), ElementsAre("C", "a", "b"));
    TLIBSzListSortItems(list.get(), TLIB_SZLIST_CASESORTED);
    EXPECT_THAT(Items(list.get()), ElementsAre("C", "a", "b"));
    EXPECT_EQ(TLIBSzListSorted(list.get()), TLIB_SZLIST_CASESORTED);

    const struct {
        int mode;
        Texts order;
    } rows[] = {
        {0, {"b", "", "C", "a"}}, {1, {"C", "a", "b"}},     {16, {"a", "b", "C"}},
        {17, {"C", "a", "b"}},    {2, {"b", "", "C", "a"}}, {32, {"b", "", "C", "a"}},
    };
    for (const auto &row : rows) {
        List holed = MakeList({"b"});
        Insert(holed, 2, "C");
        Insert(holed, 3, "a");
        TLIBSzListSortItems(holed.get(), row.mode);
        EXPECT_EQ(Items(holed.get()), row.order) << row.mode;
        EXPECT_EQ(TLIBSzListSorted(holed.get()), row.mode);
        EXPECT_EQ(holed->nFree, 488 - 6 - 4 * holed->nItem);
        // Anything but 1 and 16 is searched from the front.
        const int at = TLIBSzListFind(holed.get(), "a");
        EXPECT_EQ(at, row.mode == 16 ? -1 : static_cast<int>(std::ranges::find(row.order, "a") - row.order.begin()));
    }
}

// Text that is not UTF-8 does not compare, but still needs one place in the order.
TEST(ListSort, PutsInvalidUtf8Last)
{
    List list = MakeList({"\xff", "b", "a\xc3", "A", "\xe4pfel", "Z"}, TLIB_SZLIST_CASESORTED);
    EXPECT_THAT(Items(list.get()), ElementsAre("A", "b", "Z", "a\xc3", "\xe4pfel", "\xff"));
    EXPECT_EQ(TLIBSzListCaseFind(list.get(), "a"), 0);
    EXPECT_EQ(TLIBSzListCaseFind(list.get(), "\xff"), -1);
    EXPECT_EQ(Insert(list, 0, "c"), 2);

    const Texts texts = {"a", "B", "Ä", "ß", "SS", "\xff", "a\xff", "A\xff", "", "\xc0\x80", "z"};
    for (const std::string &x : texts) {
        for (const std::string &y : texts) {
            const char *left = x.c_str();
            const char *right = y.c_str();
            const int order = TLIBISzListUTF8StrCasecmp(&left, &right);
            EXPECT_EQ(order > 0, TLIBISzListUTF8StrCasecmp(&right, &left) < 0) << x << " " << y;
            for (const std::string &z : texts) {
                const char *third = z.c_str();
                if (order <= 0 && TLIBISzListUTF8StrCasecmp(&right, &third) <= 0) {
                    EXPECT_LE(TLIBISzListUTF8StrCasecmp(&left, &third), 0) << x << " " << y << " " << z;
                }
            }
        }
    }
}

TEST(ListFind, BinarySearchReturnsThePlace)
{
    const List list = MakeList({"b", "d", "f"}, TLIB_SZLIST_SORTED);
    const struct {
        const char *text;
        int hi, lo, fold;
        int result;
    } rows[] = {
        {"b", 2, 0, 0, 0},    {"f", 2, 0, 0, 2},          {"a", 2, 0, 0, -1},  {"c", 2, 0, 0, -2},
        {"e", 2, 0, 0, -3},   {"g", 2, 0, 0, -4},         {"D", 2, 0, 1, 1},   {"D", 2, 0, 0, -1},
        {"d", -1, 0, 0, -1},  {"b", 2, 1, 0, -2},         {"f", 1, 0, 0, -3},  {"f", 99, 0, 0, 2},
        {"z", 99, 50, 0, -4}, {"a", INT_MAX, -50, 0, -1}, {"b", -5, 0, 0, -1}, {"\xff", 2, 0, 1, -1},
    };
    for (const auto &row : rows)
        EXPECT_EQ(TLIBISzListFind(list.get(), row.hi, row.lo, row.text, row.fold), row.result)
            << row.text << " " << row.hi << " " << row.lo;
    EXPECT_EQ(TLIBSzListFind(list.get(), "c"), -1);
}

// Twice nothing is nothing: such a block would grow for ever.
TEST(List, ABlockWithoutASizeIsRefused)
{
    const List list = MakeList({"a", "b"});
    const List other = MakeList({"c"});
    TLIBSZLIST *broken = list.get();
    TLIBSZLIST *whole = other.get();
    const std::string text(600, 'x');
    const Refusal rows[] = {
        {INT(TLIBSzListPush(&broken, text.c_str()))},
        {INT(TLIBSzListInsert(&broken, 0, text.c_str()))},
        {INT(TLIBSzListUnshift(&broken, text.c_str()))},
        {INT(TLIBSzListSet(&broken, 0, text.c_str()))},
        {PTR(PslTLIBISzListExpand(broken))},
        {PTR(PslTLIBSzListOr(&broken, whole, 0))},
        {PTR(PslTLIBSzListOr(&whole, broken, TLIB_SZLIST_NEW))},
        {PTR(PslTLIBSzListAnd(broken, whole, TLIB_SZLIST_NEW))},
        {PTR(PslTLIBSzListSub(broken, whole, TLIB_SZLIST_NEW))},
    };
    const int32_t size = broken->nSize, free = broken->nFree;
    for (const int32_t wrong : {0, 23, -1, INT_MIN}) {
        broken->nSize = broken->nFree = wrong;
        for (const auto &row : rows) {
            test::ForgetFault();
            EXPECT_TRUE(row.call()) << row.name << " of " << wrong;
            EXPECT_EQ(TLIBErrGet(), ERR_BAD_PARAMETERS) << row.name << " of " << wrong;
        }
    }
    broken->nSize = size;
    broken->nFree = free;
    EXPECT_EQ(Items(broken), (std::vector<std::string>{"a", "b"}));
}

TEST(ListSets, OfAListWithItself)
{
    for (const int mode : {0, 1, 16}) {
        const Texts texts = {"a", "b", "c"};
        List list = MakeList(texts, mode);
        EXPECT_EQ(PslTLIBSzListAnd(list.get(), list.get(), 0), list.get());
        EXPECT_EQ(Items(list.get()), texts);
        TLIBSZLIST *addr = list.release();
        EXPECT_EQ(PslTLIBSzListOr(&addr, addr, 0), addr);
        list.reset(addr);
        EXPECT_EQ(Items(list.get()), texts);
        EXPECT_EQ(PslTLIBSzListSub(list.get(), list.get(), 0), list.get());
        EXPECT_THAT(Items(list.get()), testing::IsEmpty());
    }
}

// A union that lacks one byte moves the list, once and before it adds anything.
TEST(ListSets, GrowForTheLastByte)
{
    for (const size_t length : {483u, 484u}) {
        List list = MakeList({});
        const List other = MakeList({std::string(length, 'x')});
        TLIBSZLIST *addr = list.release();
        EXPECT_EQ(PslTLIBSzListOr(&addr, other.get(), 0), addr);
        list.reset(addr);
        EXPECT_EQ(list->nSize, length == 483 ? 512 : 1024);
        EXPECT_EQ(Items(list.get()), Items(other.get()));
    }
}

// A list that was only labelled as sorted may hold holes: they match nothing, not even a stored empty string.
TEST(ListSets, HolesOfALabelledListMatchNothing)
{
    const List a = MakeList({"z", ""}, TLIB_SZLIST_SORTED);
    List b = MakeList({});
    Insert(b, 1, "z");
    b->fMode = TLIB_SZLIST_SORTED;
    const List both(PslTLIBSzListAnd(a.get(), b.get(), TLIB_SZLIST_NEW));
    EXPECT_THAT(Items(both.get()), ElementsAre("z"));
}

// New memory is filled, which the sanitizers do by themselves, so the slot after the last item is not a text.
TEST(List, WalksEndAtTheLastItem)
{
    ::mallopt(M_PERTURB, 0x5A);
    const List list = MakeList({"b", "a"});
    TLIBSZLIST *addr = list.get();
    EXPECT_EQ(TLIBSzListCaseFind(addr, "none"), -1);
    EXPECT_EQ(TLIBSzListFind(addr, "none"), -1);
    const List all(PslTLIBSzListOr(&addr, addr, TLIB_SZLIST_NEW));
    EXPECT_THAT(Items(all.get()), ElementsAre("b", "a"));
    const List none(PslTLIBSzListSub(addr, all.get(), TLIB_SZLIST_NEW));
    EXPECT_THAT(Items(none.get()), testing::IsEmpty());
    TLIBISzListClean(addr);
    TLIBSzListSortItems(addr, TLIB_SZLIST_SORTED);
    EXPECT_THAT(Items(addr), ElementsAre("a", "b"));
    ::mallopt(M_PERTURB, 0);
}

TEST(ListDump2Str, JoinsWithinTheBuffer)
{
    const struct {
        Texts items;
        const char *separator;
        int size;
        int result;
        const char *text;
    } rows[] = {
        {{"a", "bc", "d"}, ", ", 10, 0, "a, bc, d"},
        {{"a", "bc", "d"}, ", ", 9, 0, "a, bc, d"},
        {{"a", "bc", "d"}, ", ", 8, -1, "a, bc, "},
        {{"a", "bc", "d"}, ", ", 3, -1, "a,"},
        {{"a", "bc", "d"}, ", ", 1, -1, ""},
        {{"a", "bc"}, "", 9, 0, "abc"},
        {{"a", "", "", "b"}, "--", 20, 4, "a------b"},
        {{"", "", "x"}, ":", 20, 1, "::x"},
        {{"", ""}, ":", 1, -1, ""},
        {{}, ":", 1, 0, ""},
    };
    for (const auto &row : rows) {
        const List list = MakeList(row.items);
        char buffer[24];
        std::memset(buffer, '#', sizeof buffer);
        test::ForgetFault();
        EXPECT_EQ(TLIBSzListDump2Str(list.get(), row.separator, buffer, row.size), row.result);
        std::string expected(static_cast<size_t>(row.size), '\0');
        expected.replace(0, std::strlen(row.text), row.text);
        EXPECT_EQ(std::string(buffer, static_cast<size_t>(row.size)), expected) << "the rest is cleared";
        EXPECT_EQ(buffer[row.size], '#');
        EXPECT_EQ(LastFault(), row.result < 0 ? (test::Fault{ERR_TRUNCATED, "list_dump_2_str", 50}) : test::Fault{});
    }
}

TEST(ListDump, PrintsItemsAndHeader)
{
    const List list = MakeList({"one", "two"});
    testing::internal::CaptureStdout();
    TLIBISzListDump(list.get());
    char expected[512];
    std::snprintf(expected, sizeof expected,
                  "%p start address \n%p ,%p pszItem[0]=one\n%p ,%p pszItem[1]=two\n"
                  "nSize =512 \t nItem =2 \t nFree =472 \t fMode =0 \t EndofFree=%p\n",
                  static_cast<void *>(list.get()), static_cast<void *>(list->pszItem[0]),
                  static_cast<void *>(&list->pszItem[0]), static_cast<void *>(list->pszItem[1]),
                  static_cast<void *>(&list->pszItem[1]), static_cast<void *>(list->EndofFree));
    EXPECT_EQ(testing::internal::GetCapturedStdout(), expected);
}

// Bad arguments are in the table of refusals; these are about what the lists are.
TEST(List, RefusesAndChangesNothing)
{
    const List list = MakeList({"a", "b"});
    const List sorted = MakeList({"a", "b"}, TLIB_SZLIST_SORTED);
    const List folded = MakeList({"a", "b"}, TLIB_SZLIST_CASESORTED);
    TLIBSZLIST *addr = list.get();
    TLIBSZLIST *sorted_addr = sorted.get();
    const Refusal rows[] = {
        {INT(TLIBSzListInsert(&addr, INT_MAX, "x")), {ERR_OUT_OF_MEMORY, "list_insert", 72}},
        {INT(TLIBSzListInsert(&addr, 1 << 30, "x")), {ERR_OUT_OF_MEMORY, "list_insert", 72}},
        {INT(TLIBSzListFind(folded.get(), "a")), {ERR_BAD_PARAMETERS, "list_find", 37}},
        {INT(TLIBSzListCaseFind(sorted.get(), "a")), {ERR_BAD_PARAMETERS, "list_case_find", 46}},
        {PTR(PslTLIBSzListAnd(sorted.get(), folded.get(), 0)), {ERR_BAD_PARAMETERS, "list_and", 69}},
        {PTR(PslTLIBSzListAnd(addr, sorted.get(), 1)), {ERR_BAD_PARAMETERS, "list_and"}},
        {PTR(PslTLIBSzListOr(&sorted_addr, folded.get(), 0)), {ERR_BAD_PARAMETERS, "list_or", 73}},
        {PTR(PslTLIBSzListSub(sorted.get(), folded.get(), 0x1000)), {ERR_BAD_PARAMETERS, "list_sub", 68}},
        {PTR(PslTLIBSzListSub(addr, sorted.get(), 0x1001)), {ERR_BAD_PARAMETERS, "list_sub"}},
        // Finding nothing is not a failure.
        {INT(TLIBSzListFind(addr, "x")), {}},
        {INT(TLIBSzListFind(sorted.get(), "x")), {}},
        {INT(TLIBSzListCaseFind(addr, "\xff")), {}},
        {INT(TLIBSzListCaseFind(folded.get(), "\xff")), {}},
    };
    test::CapturedLog log;
    for (const auto &row : rows) {
        test::ForgetFault();
        log.Clear();
        EXPECT_TRUE(row.call()) << row.name;
        EXPECT_EQ(LastFault(), row.fault) << row.name;
        EXPECT_THAT(log.Texts(), testing::IsEmpty());
        EXPECT_EQ(addr, list.get());
        for (const List *untouched : {&list, &sorted, &folded})
            ASSERT_THAT(Items(untouched->get()), ElementsAre("a", "b")) << row.name;
    }
    EXPECT_EQ(TLIBSzListDump2Str(addr, ",", nullptr, 4), -1);
    EXPECT_THAT(log.Texts(), ElementsAre("list_dump_2_str:37 Parameter error"));
    TLIBSzListFree(nullptr);
    TLIBSzListRemoveAll(nullptr);
    TLIBSzListSortItems(nullptr, 1);
    TLIBISzListClean(nullptr);
    TLIBISzListDump(nullptr);
}

}  // namespace
