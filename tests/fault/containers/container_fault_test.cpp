// Memory runs out at every single allocation of the functions of lists, hashes and strings: checks, beyond what every_call/
// does, that the code and the line are right and that nothing has changed.
#include "tavo_hash.h"
#include "tavo_list.h"
#include "tavo_str.h"

#include "support/container_text.h"
#include "support/failing_malloc.h"
#include "support/owned_container.h"
#include "support/test.h"

using test::List;

namespace {

const std::string kLarge(3000, 'x');

// The arguments of a call: a list and a hash with little room left, and their contents.
struct World {
    List list = test::MakeList({"b", "a", "c"});
    List other = test::MakeList({"c", "d", kLarge});
    List sorted = test::MakeList({"c", "d"}, TLIB_SZLIST_SORTED);
    test::Hash hash = test::MakeHash({{"key", "value"}}, 64);
    test::Hash wide = test::MakeHash({{kLarge, "value"}}, 64);  // its key does not fit into the list
    char buffer[16] = "#";

    auto Contents() const
    {
        return std::tuple(test::Items(list.get()), list->nSize, list->nFree, list->fMode, test::Items(other.get()),
                          test::Items(sorted.get()), test::Pairs(hash.get()), hash->nStrFree, hash->nSlot,
                          std::string(buffer));
    }
};

// Calls a step that returns the world's container, which it may have moved, or NULL.
template <class Owner, class Block>
bool Replaces(Owner &owner, Block *moved)
{
    if (moved) {
        (void)owner.release();
        owner.reset(moved);
    }
    return moved != nullptr;
}

struct Row {
    const char *name;
    bool (*call)(World &);  // true: it has succeeded
    test::Fault fault = {};
    int allocations = 1;
};

#define IS(expression)                                                                                                 \
#expression, []([[maybe_unused]] World & w) -> bool {                                                              \
        return expression;                                                                                             \
    }
// `a` is the address of the list or hash, which the call may move.
#define MOVES(owner, call)                                                                                             \
#call, [](World & w) {                                                                                             \
        return test::Moving(w.owner, [&](auto **a) { return call; }) >= 0;                                             \
    }

const Row kRows[] = {
    {IS(List(PslTLIBSzListAlloc(9000)) != nullptr), {0x0200, "list_alloc", 42}},
    {MOVES(list, TLIBSzListInsert(a, 1, kLarge.c_str())), {0x0200, "list_insert", 72}},
    {MOVES(list, TLIBSzListInsert(a, 5000, "x")), {0x0200, "list_insert", 72}},
    {MOVES(list, TLIBSzListUnshift(a, kLarge.c_str())), {0x0200, "list_insert", 72}},
    {MOVES(list, TLIBSzListSet(a, 1, kLarge.c_str())), {0x0200, "list_set"}},
    {IS(Replaces(w.list, PslTLIBISzListExpand(w.list.get()))), {0x0200, "list_expand", 42}},
    {IS(List(PslTLIBSzListAnd(w.list.get(), w.other.get(), TLIB_SZLIST_NEW)) != nullptr), {0x0200, "list_and"}},
    {IS(PslTLIBSzListAnd(w.list.get(), w.sorted.get(), 0) != nullptr), {}, 0},
    {IS(PslTLIBSzListAnd(w.list.get(), w.list.get(), 0) != nullptr), {0x0200, "list_and"}},
    {IS(List(PslTLIBSzListSub(w.list.get(), w.sorted.get(), TLIB_SZLIST_NEW)) != nullptr), {0x0200, "list_sub"}},
    {IS(PslTLIBSzListSub(w.list.get(), w.list.get(), 0) != nullptr), {0x0200, "list_sub"}},
    {IS(test::Moving(w.list,
                     [&](auto **a) { return List(PslTLIBSzListOr(a, w.other.get(), TLIB_SZLIST_NEW)) != nullptr; })),
     {0x0200, "list_or"},
     3},
    {IS(test::Moving(w.list, [&](auto **a) { return PslTLIBSzListOr(a, w.other.get(), 0) != nullptr; })),
     {0x0200, "list_or"},
     3},
    {IS((TLIBSzListSortItems(w.list.get(), 16), true)), {}, 0},
    {IS(TLIBSzListCaseFind(w.list.get(), "C") >= 0), {}, 0},
    {IS(test::Hash(PshTLIBSzHashAlloc(100)) != nullptr), {0x0200, "hash_allocator", 39}},
    {MOVES(hash, TLIBSzHashSetValue(a, "another", kLarge.c_str()))},
    {MOVES(hash, TLIBSzHashSetValue(a, "key", kLarge.c_str()))},
    {IS(Replaces(w.hash, PshTLIBIReSizeHash(w.hash.get(), 50, 500)))},
    {IS(Replaces(w.hash, PshTLIBICheckSpace(w.hash.get(), 5000)))},
    {MOVES(list, TLIBSzHashEnumKey(w.hash.get(), a)), {}, 0},
    {MOVES(list, TLIBSzHashEnumKey(w.wide.get(), a)), {0x0200, "list_insert", 72}},
    {IS(TLIBUnicodeUTF8StrUpper("short", w.buffer, 16) > 0), {}, 0},
    {IS(TLIBUnicodeUTF8StrUpper(kLarge.c_str(), nullptr, 0) > 0), {0x0200, "unicode_utf8_str_upper"}},
    {IS(TLIBUnicodeUTF8StrCaseCmp(kLarge.c_str(), kLarge.c_str()) == 0), {}, 0},
    {IS(TLIBStrEncodeColon("a:b", w.buffer, 16) > 0), {}, 0},
};

TEST(ContainerFault, ReportsEachRefusedAllocationAndChangesNothing)
{
    for (const Row &row : kRows) {
        SCOPED_TRACE(row.name);
        test::EachAllocation faults;
        while (faults.Next()) {
            World world;
            const auto before = world.Contents();
            test::ForgetFault();
            faults.Arm();
            const bool succeeded = row.call(world);
            faults.Disarm();
            EXPECT_EQ(succeeded, !faults.Fired());
            EXPECT_EQ(test::LastFault(), faults.Fired() ? row.fault : test::Fault{});
            if (faults.Fired()) {
                EXPECT_EQ(faults.LeftAllocated(), 0);
                EXPECT_EQ(world.Contents(), before);
            }
        }
        EXPECT_EQ(faults.Count(), row.allocations);
    }
}

// The new key may overwrite a value that the hash has given up: the value is copied first.
TEST(ContainerFault, AValueThatItsKeyOverwrites)
{
    test::EachAllocation faults;
    while (faults.Next()) {
        World world;
        const char *stale = SzTLIBSzHashGetValue(world.hash.get(), "key");
        PslSzHashRemoveAll(world.hash.get());
        faults.Arm();
        const int slot =
            test::Moving(world.hash, [&](auto **a) { return TLIBSzHashSetValue(a, "a longer key than that", stale); });
        faults.Disarm();
        EXPECT_EQ(slot >= 0, !faults.Fired());
        EXPECT_EQ(faults.LeftAllocated(), 0);
        EXPECT_EQ(TLIBSzHashPairNum(world.hash.get()), slot >= 0 ? 1 : 0);
        EXPECT_EQ(world.hash->nStrFree, world.hash->nStrSize - (slot >= 0 ? 23 + 6 : 0));
    }
    EXPECT_EQ(faults.Count(), 1);
}

}  // namespace
