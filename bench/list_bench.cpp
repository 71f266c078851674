// Lists against a vector of strings and GLib's pointer array, and comparing without regard to case against GLib and ICU.
#include "tavo_list.h"
#include "tavo_str.h"

#include "compare.h"

#include <unicode/uchar.h>
#include <unicode/ustring.h>

#include <algorithm>
#include <cstring>
#include <random>
#include <string>
#include <vector>

#include <glib.h>

namespace {

using Texts = std::vector<std::string>;

Texts RandomNames(int count, const std::vector<const char *> &syllables)
{
    std::mt19937 random(5);
    Texts names(static_cast<size_t>(count));
    for (std::string &name : names) {
        for (size_t part = 3 + random() % 4; part > 0; --part)
            name += syllables[random() % syllables.size()];
    }
    return names;
}

TLIBSZLIST *PushTavo(const Texts &names)
{
    TLIBSZLIST *list = PslTLIBSzListAlloc(512);
    for (const std::string &name : names)
        TLIBSzListPush(&list, name.c_str());
    return list;
}

std::vector<std::string> PushVector(const Texts &names)
{
    std::vector<std::string> vector;
    for (const std::string &name : names)
        vector.push_back(name.c_str());
    return vector;
}

GPtrArray *PushGlib(const Texts &names)
{
    GPtrArray *array = g_ptr_array_new_with_free_func(g_free);
    for (const std::string &name : names)
        g_ptr_array_add(array, g_strdup(name.c_str()));
    return array;
}

int CompareGlib(const void *left, const void *right)
{
    return std::strcmp(*static_cast<char *const *>(left), *static_cast<char *const *>(right));
}

// Depends on the order of the items.
uint64_t Digest(const char *first, const char *middle)
{
    return std::hash<std::string>()(std::string(first) + middle);
}

void CompareLists(const Texts &names)
{
    const int count = static_cast<int>(names.size());
    const int middle = count / 2;
    bench::Compare("list_push_free", count,
                   {{"tavo",
                     [=] {
                         TLIBSZLIST *list = PushTavo(names);
                         const uint64_t digest = Digest(list->pszItem[0], list->pszItem[middle]);
                         TLIBSzListFree(list);
                         return digest;
                     }},
                    {"vector<string>",
                     [=] {
                         const auto vector = PushVector(names);
                         return Digest(vector[0].c_str(), vector[static_cast<size_t>(middle)].c_str());
                     }},
                    {"glib",
                     [=] {
                         GPtrArray *array = PushGlib(names);
                         const uint64_t digest =
                             Digest(static_cast<char *>(array->pdata[0]), static_cast<char *>(array->pdata[middle]));
                         g_ptr_array_free(array, TRUE);
                         return digest;
                     }}},
                   bench::Clock::processor);
    bench::Compare("list_push_sort_free", count,
                   {{"tavo",
                     [=] {
                         TLIBSZLIST *list = PushTavo(names);
                         TLIBSzListSortItems(list, TLIB_SZLIST_SORTED);
                         const uint64_t digest = Digest(list->pszItem[0], list->pszItem[middle]);
                         TLIBSzListFree(list);
                         return digest;
                     }},
                    {"vector<string>",
                     [=] {
                         auto vector = PushVector(names);
                         std::sort(vector.begin(), vector.end());
                         return Digest(vector[0].c_str(), vector[static_cast<size_t>(middle)].c_str());
                     }},
                    {"glib",
                     [=] {
                         GPtrArray *array = PushGlib(names);
                         g_ptr_array_sort(array, CompareGlib);
                         const uint64_t digest =
                             Digest(static_cast<char *>(array->pdata[0]), static_cast<char *>(array->pdata[middle]));
                         g_ptr_array_free(array, TRUE);
                         return digest;
                     }}},
                   bench::Clock::processor);

    TLIBSZLIST *list = PushTavo(names);
    TLIBSzListSortItems(list, TLIB_SZLIST_SORTED);
    auto *vector = new std::vector<std::string>(PushVector(names));
    std::sort(vector->begin(), vector->end());
    bench::Compare("list_sorted_find", count,
                   {{"tavo",
                     [=] {
                         uint64_t found = 0;
                         for (const std::string &name : names)
                             found += TLIBSzListFind(list, name.c_str()) >= 0;
                         return found;
                     }},
                    {"vector<string>",
                     [=] {
                         uint64_t found = 0;
                         for (const std::string &name : names) {
                             const std::string_view wanted(name.c_str());
                             const auto at = std::lower_bound(vector->begin(), vector->end(), wanted);
                             found += at != vector->end() && *at == wanted;
                         }
                         return found;
                     }}},
                   bench::Clock::processor);
}

int CompareIcu(const std::string &left, const std::string &right)
{
    UChar left_text[128];
    UChar right_text[128];
    int32_t left_length = 0;
    int32_t right_length = 0;
    UErrorCode error = U_ZERO_ERROR;
    u_strFromUTF8(left_text, 128, &left_length, left.c_str(), -1, &error);
    u_strFromUTF8(right_text, 128, &right_length, right.c_str(), -1, &error);
    const int order = u_strCaseCompare(left_text, left_length, right_text, right_length,
                                       U_FOLD_CASE_DEFAULT | U_COMPARE_CODE_POINT_ORDER, &error);
    return (order > 0) - (order < 0);
}

int CompareFoldedGlib(const std::string &left, const std::string &right)
{
    char *left_folded = g_utf8_casefold(left.c_str(), -1);
    char *right_folded = g_utf8_casefold(right.c_str(), -1);
    const int order = std::strcmp(left_folded, right_folded);
    g_free(left_folded);
    g_free(right_folded);
    return (order > 0) - (order < 0);
}

// Each name with its neighbour and with itself.
template <class Compare>
uint64_t CompareNeighbours(const Texts &names, Compare compare)
{
    uint64_t digest = 0;
    for (size_t i = 1; i < names.size(); ++i)
        digest = digest * 3 + static_cast<uint64_t>(compare(names[i - 1], names[i]) + 1) +
                 static_cast<uint64_t>(compare(names[i], names[i]) == 0);
    return digest;
}

void CompareFolding(const std::string &work, const Texts &names)
{
    bench::Compare(work, static_cast<int>(names.size()),
                   {{"tavo",
                     [=] {
                         return CompareNeighbours(names, [](const std::string &left, const std::string &right) {
                             return TLIBUnicodeUTF8StrCaseCmp(left.c_str(), right.c_str());
                         });
                     }},
                    {"icu",
                     [=] {
                         return CompareNeighbours(names, CompareIcu);
                     }},
                    {"glib",
                     [=] {
                         return CompareNeighbours(names, CompareFoldedGlib);
                     }}},
                   bench::Clock::processor);
}

}  // namespace

int main(int argc, char **argv)
{
    const std::vector<const char *> ascii = {"an", "Be", "cor", "Dun", "el", "fra", "Gus", "hi", "Jo", "ka"};
    const std::vector<const char *> mixed = {"an", "Be", "cör", "Dün", "él", "fra", "Gus", "Škо", "ja", "用"};
    for (const int count : {100, 2000})
        CompareLists(RandomNames(count, ascii));
    CompareFolding("utf8_compare_ascii", RandomNames(1000, ascii));
    CompareFolding("utf8_compare_mixed", RandomNames(1000, mixed));
    return bench::Run(argc, argv);
}
