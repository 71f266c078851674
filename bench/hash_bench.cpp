// Hashes against GLib's, the standard library's and absl's: keys and values of 8 to 32 bytes, given as C strings.
#include "tavo_hash.h"

#include "compare.h"

#include <absl/container/flat_hash_map.h>

#include <algorithm>
#include <cstring>
#include <iterator>
#include <random>
#include <string>
#include <string_view>
#include <unordered_map>
#include <vector>

#include <glib.h>

namespace {

using Texts = std::vector<std::string>;

Texts RandomTexts(int count, unsigned seed)
{
    static const char letters[] = "abcdefghijklmnopqrstuvwxyz0123456789_";
    std::mt19937 random(seed);
    Texts texts(static_cast<size_t>(count));
    for (std::string &text : texts) {
        text.resize(8 + random() % 25);
        for (char &letter : text)
            letter = letters[random() % (sizeof letters - 1)];
    }
    return texts;
}

// Eight words in every order: the sum of the words is always the same, so every key begins at the same slot.
Texts PermutedTexts(int count)
{
    Texts words = {"disk", "user", "mail", "home", "raid", "quot", "name", "port"};
    Texts texts;
    for (int i = 0; i < count; ++i) {
        texts.emplace_back();
        for (const std::string &word : words)
            texts.back() += word;
        std::next_permutation(words.begin(), words.end());
    }
    return texts;
}

// A C string may be looked up without making a std::string of it, as absl does by itself.
struct TextHash {
    using is_transparent = void;
    size_t operator()(std::string_view text) const { return std::hash<std::string_view>()(text); }
};
using StdMap = std::unordered_map<std::string, std::string, TextHash, std::equal_to<>>;
using AbslMap = absl::flat_hash_map<std::string, std::string>;

TLIBSZHASH *BuildTavo(const Texts &keys, const Texts &values)
{
    TLIBSZHASH *hash = PshTLIBSzHashAlloc(512);
    for (size_t i = 0; i < keys.size(); ++i)
        TLIBSzHashSetValue(&hash, keys[i].c_str(), values[i].c_str());
    return hash;
}

GHashTable *BuildGlib(const Texts &keys, const Texts &values)
{
    GHashTable *hash = g_hash_table_new_full(g_str_hash, g_str_equal, g_free, g_free);
    for (size_t i = 0; i < keys.size(); ++i)
        g_hash_table_insert(hash, g_strdup(keys[i].c_str()), g_strdup(values[i].c_str()));
    return hash;
}

template <class Map>
Map BuildMap(const Texts &keys, const Texts &values)
{
    Map map;
    for (size_t i = 0; i < keys.size(); ++i)
        map.insert_or_assign(keys[i].c_str(), values[i].c_str());
    return map;
}

void CompareBuild(const std::string &work, const Texts &keys, const Texts &values)
{
    bench::Compare(work, static_cast<int>(keys.size()),
                   {{"tavo",
                     [=] {
                         TLIBSZHASH *hash = BuildTavo(keys, values);
                         const int pairs = TLIBSzHashPairNum(hash);
                         TLIBSzHashFree(hash);
                         return static_cast<uint64_t>(pairs);
                     }},
                    {"glib",
                     [=] {
                         GHashTable *hash = BuildGlib(keys, values);
                         const guint pairs = g_hash_table_size(hash);
                         g_hash_table_destroy(hash);
                         return static_cast<uint64_t>(pairs);
                     }},
                    {"unordered_map",
                     [=] {
                         return static_cast<uint64_t>(BuildMap<StdMap>(keys, values).size());
                     }},
                    {"flat_hash_map",
                     [=] {
                         return static_cast<uint64_t>(BuildMap<AbslMap>(keys, values).size());
                     }}},
                   bench::Clock::processor);
}

// Adds up the first two bytes of what is found; 1 for what is not.
uint64_t Mark(const char *value)
{
    return value ? static_cast<unsigned char>(value[0]) + 256U * static_cast<unsigned char>(value[1]) : 1;
}

template <class View, class Map>
uint64_t FindAll(const Map &map, const std::vector<const char *> &wanted)
{
    uint64_t sum = 0;
    for (const char *key : wanted) {
        const auto found = map.find(View(key));
        sum += Mark(found == map.end() ? nullptr : found->second.c_str());
    }
    return sum;
}

// The containers live as long as the program.
void CompareFind(const std::string &work, const Texts &keys, const Texts &values, const Texts &wanted_texts)
{
    static std::vector<Texts> kept;
    kept.reserve(100);
    kept.push_back(wanted_texts);
    std::vector<const char *> wanted;
    for (const std::string &text : kept.back())
        wanted.push_back(text.c_str());
    std::shuffle(wanted.begin(), wanted.end(), std::mt19937(3));

    const TLIBSZHASH *tavo = BuildTavo(keys, values);
    GHashTable *glib = BuildGlib(keys, values);
    const auto *std_map = new StdMap(BuildMap<StdMap>(keys, values));
    const auto *absl_map = new AbslMap(BuildMap<AbslMap>(keys, values));
    bench::Compare(work, static_cast<int>(keys.size()),
                   {{"tavo",
                     [=] {
                         uint64_t sum = 0;
                         for (const char *key : wanted)
                             sum += Mark(SzTLIBSzHashGetValue(tavo, key));
                         return sum;
                     }},
                    {"glib",
                     [=] {
                         uint64_t sum = 0;
                         for (const char *key : wanted)
                             sum += Mark(static_cast<const char *>(g_hash_table_lookup(glib, key)));
                         return sum;
                     }},
                    {"unordered_map",
                     [=] {
                         return FindAll<std::string_view>(*std_map, wanted);
                     }},
                    {"flat_hash_map",
                     [=] {
                         return FindAll<absl::string_view>(*absl_map, wanted);
                     }}},
                   bench::Clock::processor);
}

}  // namespace

int main(int argc, char **argv)
{
    for (const int count : {24, 100, 500, 2000}) {
        const Texts keys = RandomTexts(count, 1);
        const Texts values = RandomTexts(count, 2);
        CompareBuild("hash_build_free", keys, values);
        CompareFind("hash_find", keys, values, keys);
        CompareFind("hash_find_missing", keys, values, RandomTexts(count, 4));
    }
    for (const int count : {500, 2000})
        CompareFind("hash_find_worst_case", PermutedTexts(count), RandomTexts(count, 2), PermutedTexts(count));
    return bench::Run(argc, argv);
}
