// Memory runs out at every single allocation of every function of lists, hashes and strings: checks that the code is
// right, nothing has changed and nothing is left allocated.
#include "tavo_hash.h"
#include "tavo_list.h"
#include "tavo_str.h"

#include "support/container_text.h"
#include "support/failing_malloc.h"
#include "support/fault_state.h"

#include <gtest/gtest.h>

#include <functional>

using test::Fault;
using test::Hash;
using test::List;

namespace {

const std::string kLarge(3000, 'x');

// The arguments of a call: a list and a hash with little room left, and their contents.
struct World {
    List list = test::MakeList({"b", "a", "c"});
    List other = test::MakeList({"c", "d", kLarge});
    List sorted = test::MakeList({"c", "d"}, TLIB_SZLIST_SORTED);
    Hash hash;
    Hash wide;  // its key does not fit into the list
    List made;
    Hash made_hash;
    char buffer[16] = "#";

    World()
    {
        hash.reset(PshTLIBSzHashAlloc(64));
        test::Moving(hash, [](auto **addr) { return TLIBSzHashSetValue(addr, "key", "value"); });
        wide.reset(PshTLIBSzHashAlloc(64));
        test::Moving(wide, [](auto **addr) { return TLIBSzHashSetValue(addr, kLarge.c_str(), "value"); });
        test::Moving(list, [](auto **addr) { return TLIBSzListInsert(addr, 4, "hole before"); });
        TLIBISzListClean(list.get());
    }

    auto Contents() const
    {
        return std::tuple(test::Items(list.get()), list->nSize, list->nFree, list->fMode, test::Items(other.get()),
                          test::Items(sorted.get()), test::Pairs(hash.get()), hash->nStrFree, hash->nSlot,
                          std::string(buffer));
    }
};

// Keeps a resulting container for the world to free; returns whether there is one.
bool Keep(World &world, TLIBSZLIST *list)
{
    if (list && list != world.list.get())
        world.made.reset(list);
    return list != nullptr;
}

bool Keep(World &world, TLIBSZHASH *hash)
{
    world.made_hash.reset(hash);
    return hash != nullptr;
}

struct Row {
    const char *name;
    std::function<bool(World &)> call;  // true: it has succeeded
    Fault fault;
    int allocations;
};

void FailEachAllocation(const Row &row)
{
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
        if (faults.Fired()) {
            EXPECT_EQ(test::LastFault(), row.fault);
            EXPECT_EQ(faults.LeftAllocated(), 0);
            EXPECT_EQ(world.Contents(), before);
        } else {
            EXPECT_EQ(TLIBErrGet(), ERR_SUCCESS);
        }
    }
    EXPECT_EQ(faults.Count(), row.allocations);
}

// Calls a step that returns the world's hash, which it may have moved, or NULL.
template <class Step>
bool Replaces(Hash &hash, Step step)
{
    TLIBSZHASH *moved = step(hash.get());
    if (moved) {
        (void)hash.release();
        hash.reset(moved);
    }
    return moved != nullptr;
}

// Calls a function that may move the world's list or hash.
template <class Owner, class Call>
bool Moves(Owner &owner, Call call)
{
    return test::Moving(owner, call) >= 0;
}

TEST(ContainerFault, EveryAllocationFailsOnce)
{
    const Fault no_code = {};
    const Row rows[] = {
        {"list alloc", [](World &w) { return Keep(w, PslTLIBSzListAlloc(9000)); }, {0x0200, "list_alloc", 42}, 1},
        {"list insert",
         [](World &w) { return Moves(w.list, [](auto **a) { return TLIBSzListInsert(a, 1, kLarge.c_str()); }); },
         {0x0200, "list_insert", 72},
         1},
        {"list push far",
         [](World &w) { return Moves(w.list, [](auto **a) { return TLIBSzListInsert(a, 5000, "x"); }); },
         {0x0200, "list_insert", 72},
         1},
        {"list unshift",
         [](World &w) { return Moves(w.list, [](auto **a) { return TLIBSzListUnshift(a, kLarge.c_str()); }); },
         {0x0200, "list_insert", 72},
         1},
        {"list set",
         [](World &w) { return Moves(w.list, [](auto **a) { return TLIBSzListSet(a, 1, kLarge.c_str()); }); },
         {0x0200, "list_set"},
         1},
        {"list expand",
         [](World &w) {
             TLIBSZLIST *grown = PslTLIBISzListExpand(w.list.get());
             if (grown) {
                 (void)w.list.release();
                 w.list.reset(grown);
             }
             return grown != nullptr;
         },
         {0x0200, "list_expand", 42},
         1},
        {"list and, new",
         [](World &w) { return Keep(w, PslTLIBSzListAnd(w.list.get(), w.other.get(), TLIB_SZLIST_NEW)); },
         {0x0200, "list_and"},
         1},
        {"list and, in place",
         [](World &w) { return Keep(w, PslTLIBSzListAnd(w.list.get(), w.sorted.get(), 0)); },
         {},
         0},
        {"list and, with itself",
         [](World &w) { return Keep(w, PslTLIBSzListAnd(w.list.get(), w.list.get(), 0)); },
         {0x0200, "list_and"},
         1},
        {"list sub, new",
         [](World &w) { return Keep(w, PslTLIBSzListSub(w.list.get(), w.sorted.get(), TLIB_SZLIST_NEW)); },
         {0x0200, "list_sub"},
         1},
        {"list sub, with itself",
         [](World &w) { return Keep(w, PslTLIBSzListSub(w.list.get(), w.list.get(), 0)); },
         {0x0200, "list_sub"},
         1},
        {"list or, new",
         [](World &w) {
             TLIBSZLIST *a = w.list.get();
             return Keep(w, PslTLIBSzListOr(&a, w.other.get(), TLIB_SZLIST_NEW));
         },
         {0x0200, "list_or"},
         3},
        {"list or, in place and growing",
         [](World &w) {
             TLIBSZLIST *a = w.list.release();
             TLIBSZLIST *b = w.other.get();
             const bool done = PslTLIBSzListOr(&a, b, 0) != nullptr;
             w.list.reset(a);
             return done;
         },
         {0x0200, "list_or"},
         3},
        {"list sort", [](World &w) { return TLIBSzListSortItems(w.list.get(), 16), true; }, {}, 0},
        {"list case find", [](World &w) { return TLIBSzListCaseFind(w.list.get(), "C") >= 0; }, {}, 0},
        {"hash alloc", [](World &w) { return Keep(w, PshTLIBSzHashAlloc(100)); }, {0x0200, "hash_allocator", 39}, 1},
        {"hash set, new key",
         [](World &w) {
             return Moves(w.hash, [](auto **a) { return TLIBSzHashSetValue(a, "another", kLarge.c_str()); });
         },
         no_code, 1},
        {"hash set, longer value",
         [](World &w) { return Moves(w.hash, [](auto **a) { return TLIBSzHashSetValue(a, "key", kLarge.c_str()); }); },
         no_code, 1},
        {"hash resize",
         [](World &w) { return Replaces(w.hash, [](TLIBSZHASH *hash) { return PshTLIBIReSizeHash(hash, 50, 500); }); },
         no_code, 1},
        {"hash check space",
         [](World &w) { return Replaces(w.hash, [](TLIBSZHASH *hash) { return PshTLIBICheckSpace(hash, 5000); }); },
         no_code, 1},
        {"hash insert new pair",
         [](World &w) {
             int slot = -1;
             return Replaces(w.hash, [&](TLIBSZHASH *hash) {
                 return PshTLIBIInsertNewPair(hash, &slot, "another", kLarge.c_str());
             });
         },
         no_code, 1},
        {"hash update value",
         [](World &w) {
             int slot = TLIBIGetLookDict(w.hash.get(), "key");
             return Replaces(w.hash,
                             [&](TLIBSZHASH *hash) { return PshTLIBIUpdateValue(hash, &slot, "key", kLarge.c_str()); });
         },
         no_code, 1},
        {"hash enum",
         [](World &w) { return Moves(w.list, [&](auto **a) { return TLIBSzHashEnumKey(w.hash.get(), a); }); },
         {},
         0},
        {"hash enum, growing",
         [](World &w) { return Moves(w.list, [&](auto **a) { return TLIBSzHashEnumKey(w.wide.get(), a); }); },
         {0x0200, "list_insert", 72},
         1},
        {"upper", [](World &w) { return TLIBUnicodeUTF8StrUpper("short", w.buffer, 16) > 0; }, {}, 0},
        {"upper, long",
         [](World &) { return TLIBUnicodeUTF8StrUpper(kLarge.c_str(), nullptr, 0) > 0; },
         {0x0200, "unicode_utf8_str_upper"},
         1},
        {"case compare", [](World &) { return TLIBUnicodeUTF8StrCaseCmp(kLarge.c_str(), kLarge.c_str()) == 0; }, {}, 0},
        {"colon", [](World &w) { return TLIBStrEncodeColon("a:b", w.buffer, 16) > 0; }, {}, 0},
    };
    for (const Row &row : rows)
        FailEachAllocation(row);
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
        const bool set =
            Moves(world.hash, [&](auto **a) { return TLIBSzHashSetValue(a, "a longer key than that", stale); });
        faults.Disarm();
        EXPECT_EQ(set, !faults.Fired());
        EXPECT_EQ(faults.LeftAllocated(), 0);
        EXPECT_EQ(TLIBSzHashPairNum(world.hash.get()), set ? 1 : 0);
        EXPECT_EQ(world.hash->nStrFree, world.hash->nStrSize - (set ? 23 + 6 : 0));
    }
    EXPECT_EQ(faults.Count(), 1);
}

}  // namespace
