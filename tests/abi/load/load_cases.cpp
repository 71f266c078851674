// The library as a guest that is loaded late: by dlopen, again after dlclose, in namespaces of its own; and what it loads
// itself, when that cannot be had. This program does not link it; each case loads it in a process of its own.
#include "tavo_bdb.h"
#include "tavo_list.h"
#include "tavo_str.h"
#include "tavo_user.h"

#include "core/detail/extras.h"
#include "support/failing_malloc.h"
#include "support/own_child.h"
#include "support/test.h"

#include <dlfcn.h>
#include <sys/resource.h>

namespace {

constexpr char kUmlauts[] = "gr\xC3\xBC\xC3\x9F";
constexpr int kUpperSize = sizeof "GR\xC3\x9CSS";

template <class Function>
Function *Find(void *library, const char *name, Function *)
{
    return reinterpret_cast<Function *>(::dlsym(library, name));
}
#define FIND(library, name) Find(library, #name, static_cast<decltype(::name) *>(nullptr))

void *Open(const std::string &path)
{
    return ::dlopen(path.c_str(), RTLD_NOW | RTLD_LOCAL);
}

int Upper(void *library, const char *text)
{
    char upper[32];
    return FIND(library, TLIBUnicodeUTF8StrUpper)(text, upper, sizeof upper);
}

// What needs no extras, and what needs them.
bool Works(void *library)
{
    return library && Upper(library, "plain") == 6 && Upper(library, kUmlauts) == kUpperSize;
}

int Code(void *library)
{
    return FIND(library, TLIBErrGet)();
}

// The library somewhere else, with `extras` as what it finds beside it; empty: nothing.
std::string CopyTo(const test::ScratchDir &folder, const std::string &extras = {})
{
    std::filesystem::copy_file(TEST_LIBRARY, folder / "libtavosdk.so.1");
    if (!extras.empty()) {
        std::filesystem::create_directory(folder / "tavosdk");
        std::filesystem::copy_file(extras, folder / (std::string("tavosdk/") + tavo::kExtrasFile));
    }
    return folder / "libtavosdk.so.1";
}

TEST(Load, AgainAfterClosingAndInNamespaces)
{
    for (const bool in_namespace : {false, true}) {
        EXPECT_EQ(test::InChild([&] {
                      for (int round = 0; round < 4; ++round) {
                          void *library =
                              in_namespace ? ::dlmopen(LM_ID_NEWLM, TEST_LIBRARY, RTLD_NOW) : Open(TEST_LIBRARY);
                          if (!Works(library) || ::dlclose(library) != 0)
                              return 1;
                      }
                      return 0;
                  }),
                  0)
            << in_namespace;
    }
}

TEST(Load, FindsItsExtrasFromAnyDirectoryByAnyName)
{
    const test::ScratchDir elsewhere;
    CopyTo(elsewhere, TEST_EXTRAS);
    std::filesystem::create_directory_symlink(elsewhere.Path(), elsewhere / "link");
    for (const char *name : {"./libtavosdk.so.1", "link/libtavosdk.so.1", "tavosdk/../libtavosdk.so.1"}) {
        EXPECT_EQ(test::InChild([&] {
                      if (::chdir(elsewhere.Path().c_str()) != 0)
                          return 1;
                      void *library = Open(name);
                      return ::chdir("/") == 0 && Works(library) ? 0 : 2;
                  }),
                  0)
            << name;
    }
}

// Nothing that needs them is done by halves, the rest works, and the log says once what is missing.
void RefusesAll(void *library, const test::ScratchDir &folder, const char *why)
{
    ASSERT_TRUE(library);
    test::CapturedLog log;
    EXPECT_EQ(Upper(library, "plain"), 6);
    EXPECT_THAT(log.Texts(), testing::ElementsAre());

    errno = EXDEV;
    EXPECT_EQ(Upper(library, kUmlauts), -1);
    EXPECT_EQ(Code(library), ERR_BAD_PARAMETERS);
    EXPECT_EQ(errno, EXDEV);
    EXPECT_EQ(FIND(library, TLIBUnicodeUTF8StrCaseCmp)(kUmlauts, "GR"), -2);
    EXPECT_EQ(FIND(library, TLIBUnicodeUTF8StrCaseCmp)("a", "B"), -1);

    TLIBSZLIST *list = FIND(library, PslTLIBSzListAlloc)(0);
    EXPECT_EQ(FIND(library, TLIBSzListPush)(&list, kUmlauts), 0);
    EXPECT_EQ(FIND(library, TLIBSzListPush)(&list, "a"), 1);
    FIND(library, TLIBSzListSortItems)(list, TLIB_SZLIST_CASESORTED);
    EXPECT_EQ(list->fMode, TLIB_SZLIST_UNSORTED);
    EXPECT_STREQ(FIND(library, SzTLIBSzListGet)(list, 0), kUmlauts);
    FIND(library, TLIBSzListRemoveAll)(list);
    FIND(library, TLIBSzListSortItems)(list, TLIB_SZLIST_CASESORTED);
    EXPECT_EQ(FIND(library, TLIBSzListPush)(&list, kUmlauts), -1);
    EXPECT_EQ(FIND(library, TLIBSzListPush)(&list, "a"), 0);
    EXPECT_EQ(list->nItem, 1);
    FIND(library, TLIBSzListFree)(list);

    unsigned char hash[16] = "unchanged";
    EXPECT_EQ(FIND(library, TLIBSmbMd4Hash)("secret", hash), -1);
    EXPECT_EQ(Code(library), ERR_OP_FAILURE);
    EXPECT_EQ(FIND(library, TLIBSmbLmHash)("secret", hash), -1);
    EXPECT_STREQ(reinterpret_cast<char *>(hash), "unchanged");
    const std::string store = folder / "store";
    test::WriteFile(store, "no store, which an open that can do its work removes");
    EXPECT_FALSE(FIND(library, TAVOBDbOpen)(store.c_str(), O_RDWR | O_CREAT, 1));
    EXPECT_EQ(Code(library), ERR_OPEN_FAILED);
    EXPECT_EQ(::access(store.c_str(), F_OK), 0);

    int told = 0;
    for (const std::string &text : log.Texts())
        told += text.find("extras") != std::string::npos && text.find(why) != std::string::npos;
    EXPECT_EQ(told, 1) << testing::PrintToString(log.Texts());
}

TEST(Load, WithoutItsExtrasOrWithThoseOfAnotherVersion)
{
    const struct {
        const char *extras;
        const char *why;
    } rows[] = {{"", "No such file"}, {TEST_OTHER_EXTRAS, "another version"}};
    for (const auto &row : rows) {
        EXPECT_EQ(test::InChild([&] {
                      const test::ScratchDir folder;
                      RefusesAll(Open(CopyTo(folder, row.extras)), folder, row.why);
                      return testing::Test::HasFailure() ? 1 : 0;
                  }),
                  0)
            << row.why;
    }
}

// Memory can run out inside the library, which throws there and catches, and in the loading.
enum Outcome { kDone, kNotLoaded, kOutOfMemory, kSurvived, kWrong };

// One call that loads the extras, with `fault` at work; whatever comes of it, the next call is as good as the first.
template <class Fault>
Outcome LoadWith(Fault fault)
{
    return static_cast<Outcome>(test::InChild([&]() -> int {
        void *library = Open(TEST_LIBRARY);
        if (!library)
            return kWrong;
        int result = 0;
        const bool met = fault([&] { result = Upper(library, kUmlauts); });
        const int code = Code(library);
        if (!Works(library))
            return kWrong;
        if (result == kUpperSize)
            return met ? kSurvived : kDone;
        if (result != -1 || !met)
            return kWrong;
        return code == ERR_BAD_PARAMETERS ? kNotLoaded : code == ERR_OUT_OF_MEMORY ? kOutOfMemory : kWrong;
    }));
}

TEST(Load, EachAllocationFailing)
{
    int not_loaded = 0;
    int out_of_memory = 0;
    for (int round = 1;; ++round) {
        ASSERT_LT(round, 5000);
        const Outcome outcome = LoadWith([&](const auto &call) {
            test::EachAllocation faults;
            for (int i = 0; i < round; ++i)
                faults.Next();
            faults.Arm();
            call();
            faults.Disarm();
            return faults.Fired();
        });
        ASSERT_NE(outcome, kWrong) << "allocation " << round;
        not_loaded += outcome == kNotLoaded;
        out_of_memory += outcome == kOutOfMemory;
        if (outcome == kDone)
            break;
    }
    EXPECT_GT(not_loaded, 10);
    EXPECT_GT(out_of_memory, 0);
}

TEST(Load, FewDescriptors)
{
    int refused = 0;
    for (int left = 0;; ++left) {
        ASSERT_LT(left, 100);
        const Outcome outcome = LoadWith([&](const auto &call) {
            const int next = ::dup(0);
            ::close(next);
            rlimit limit{};
            ::getrlimit(RLIMIT_NOFILE, &limit);
            const rlimit tight{static_cast<rlim_t>(next + left), limit.rlim_max};
            ::setrlimit(RLIMIT_NOFILE, &tight);
            call();
            ::setrlimit(RLIMIT_NOFILE, &limit);
            return left == 0;
        });
        ASSERT_NE(outcome, kWrong) << left << " descriptors left";
        refused += outcome == kNotLoaded;
        if (outcome == kDone)
            break;
    }
    EXPECT_EQ(refused, 1);
}

}  // namespace
