// Switches of settings files that cannot be read.
#include "core/detail/setting_switch.h"

#include "support/test.h"
#include "support/traced_call.h"

namespace {

enum Answer : int { kOff, kOn, kUnreadable };

Answer Read(const std::string &path)
{
    const std::optional<bool> answer = tavo::ReadSetting(path.c_str(), "home", "yes");
    return !answer ? kUnreadable : *answer ? kOn : kOff;
}

// "Off" would leave undone what the setting asks for.
TEST(ReadSetting, WhatCannotBeReadIsNotOff)
{
    const test::ScratchDir dir;
    const std::string path = dir / "settings";
    EXPECT_EQ(Read(path), kOff) << "no file";
    test::WriteFile(path, "home=\"no\"\n");
    EXPECT_EQ(Read(path), kOff);
    test::WriteFile(path, "home=\"yes\"\n");
    EXPECT_EQ(Read(path), kOn);
    if (!test::CanTrace())
        GTEST_SKIP() << "no ptrace here";
    for (const bool is_root : {true, false}) {
        const std::function<void()> work = [&] {
            if (!is_root && ::seteuid(65534) != 0)
                ::_exit(kUnreadable + 1);
            test::MarkCalls();
            const Answer answer = Read(path);
            test::MarkCalls();
            ::_exit(answer);
        };
        for (const test::SystemCall &call : test::SystemCallsOf(work)) {
            if (call.Name() != "openat" && call.Name() != "read")
                continue;
            for (const int error : {EACCES, EIO, EMFILE}) {
                if (call.Name() == "read" && error != EIO)
                    continue;
                const bool is_closed_to_others = error == EACCES && !is_root;
                EXPECT_EQ(test::FailsAtCall(call, error, work).status >> 8, is_closed_to_others ? kOff : kUnreadable)
                    << call.Name() << " " << ::strerrorname_np(error) << (is_root ? "" : ", without root");
            }
        }
    }
}

}  // namespace
