// Where programs that were compiled against the headers look for the fields of a list and a hash.
#include "tavo_hash.h"
#include "tavo_list.h"

#include <gtest/gtest.h>

#include <cstddef>

namespace {

struct Offset {
    const char *field;
    size_t found;
    size_t with_4_byte_pointers;
    size_t with_8_byte_pointers;
};

void CheckOffsets(std::initializer_list<Offset> offsets)
{
    static_assert(sizeof(void *) == 4 || sizeof(void *) == 8);
    for (const Offset &offset : offsets) {
        EXPECT_EQ(offset.found, sizeof(void *) == 4 ? offset.with_4_byte_pointers : offset.with_8_byte_pointers)
            << offset.field;
    }
}

TEST(ContainerLayout, List)
{
    CheckOffsets({
        {"nSize", offsetof(TLIBSZLIST, nSize), 0, 0},
        {"nItem", offsetof(TLIBSZLIST, nItem), 4, 4},
        {"nFree", offsetof(TLIBSZLIST, nFree), 8, 8},
        {"fMode", offsetof(TLIBSZLIST, fMode), 12, 12},
        {"EndofFree", offsetof(TLIBSZLIST, EndofFree), 16, 16},
        {"pszEmpty", offsetof(TLIBSZLIST, pszEmpty), 20, 24},
        {"pszItem", offsetof(TLIBSZLIST, pszItem), 24, 32},
        {"sizeof", sizeof(TLIBSZLIST), 24, 32},
    });
}

TEST(ContainerLayout, Hash)
{
    CheckOffsets({
        {"nStrSize", offsetof(TLIBSZHASH, nStrSize), 0, 0},
        {"nStrFree", offsetof(TLIBSZHASH, nStrFree), 4, 4},
        {"nSlot", offsetof(TLIBSZHASH, nSlot), 8, 8},
        {"nPair", offsetof(TLIBSZHASH, nPair), 12, 12},
        {"pszNextStr", offsetof(TLIBSZHASH, pszNextStr), 16, 16},
        {"slots", offsetof(TLIBSZHASH, slots), 20, 24},
        {"sizeof", sizeof(TLIBSZHASH), 20, 24},
        {"pszKey", offsetof(TLIBSZHASHSLOT, pszKey), 0, 0},
        {"pszValue", offsetof(TLIBSZHASHSLOT, pszValue), 4, 8},
        {"sizeof slot", sizeof(TLIBSZHASHSLOT), 8, 16},
    });
}

// The block ends where the counted bytes end: the string area begins at the end of a full table.
TEST(ContainerLayout, BlocksHoldWhatTheyCount)
{
    TLIBSZLIST *list = PslTLIBSzListAlloc(1000);
    const size_t counted = 24 + 4 * ((1000 - 24) / 4);
    const size_t wider = offsetof(TLIBSZLIST, pszItem) - 24 + (sizeof(char *) - 4) * ((counted - 24) / 4);
    EXPECT_EQ(list->EndofFree, reinterpret_cast<char *>(list) + 1000 + wider);
    EXPECT_EQ(list->pszEmpty + 1, list->EndofFree);
    TLIBSzListFree(list);

    TLIBSZHASH *hash = PshTLIBIHashAllocator(7, 100);
    EXPECT_EQ(hash->pszNextStr, reinterpret_cast<char *>(hash->slots + 7));
    TLIBSzHashFree(hash);
}

}  // namespace
