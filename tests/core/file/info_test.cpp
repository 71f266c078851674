// The system settings file, which is written under its lock. Runs in the appliance root: the paths are the real ones.
#include "tavo_file.h"
#include "tavo_lock.h"

#include "support/test.h"

#include <dlfcn.h>

namespace {

constexpr const char *kSettings = "/etc/tavoinfo.conf";
int renames_under_lock;

}  // namespace

// In place of the C library's: checks that the settings' lock is held exclusively at the rename.
extern "C" int rename(const char *from, const char *to) noexcept
{
    const TLIBLOCKFILE &lock = rgslckList[0];
    if (std::string(to) == kSettings && lock.pfLock && (lock.nMode & TAVO_LOCK_EXCLUSIVE) != 0)
        ++renames_under_lock;
    static const auto real = reinterpret_cast<int (*)(const char *, const char *)>(::dlsym(RTLD_NEXT, "rename"));
    return real(from, to);
}

namespace {

TEST(SystemSettings, AreWrittenUnderTheirLock)
{
    test::WriteFile(kSettings, "runsamba=no\nrunftp=no\n");
    test::ForgetFault();
    renames_under_lock = 0;
    EXPECT_EQ(TAVOINFOSetKeyValue("runsamba", "yes"), 1);
    EXPECT_EQ(test::ReadFile(kSettings), "runsamba=yes\nrunftp=no\n");
    EXPECT_EQ(renames_under_lock, 1);
    EXPECT_EQ(rgslckList[0].pfLock, nullptr) << "released again";
    EXPECT_EQ(TLIBErrGet(), ERR_SUCCESS);
}

TEST(SystemSettings, AreLeftAloneWithoutTheLock)
{
    test::WriteFile(kSettings, "runsamba=no\n");
    ASSERT_EQ(ErrTLIBFileLock(TAVO_LOCK_TAVOINFO | TAVO_LOCK_SHARED | TAVO_LOCK_NONBLOCKING, 0), 0);
    EXPECT_EQ(TAVOINFOSetKeyValue("runsamba", "yes"), -1) << "a shared lock does not become exclusive";
    EXPECT_EQ(TLIBErrGet(), ERR_LOCK_FAILED);
    EXPECT_EQ(rgslckList[0].nRef, 1);
    EXPECT_EQ(ErrTLIBFileUnlock(TAVO_LOCK_TAVOINFO), 0);
    EXPECT_EQ(TAVOINFOSetKeyValue("#runsamba", "yes"), -1);
    EXPECT_EQ(test::LastFault(), (test::Fault{ERR_BAD_PARAMETERS, "file_set_key_value"}));
    EXPECT_EQ(TAVOINFOSetKeyValue(nullptr, "yes"), -1);
    EXPECT_EQ(test::LastFault(), (test::Fault{ERR_BAD_PARAMETERS, "info_set_key_value"}));
    EXPECT_EQ(rgslckList[0].pfLock, nullptr);
    EXPECT_EQ(test::ReadFile(kSettings), "runsamba=no\n");
}

}  // namespace
