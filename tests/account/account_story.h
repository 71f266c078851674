// A test of users and groups as a story: with the log and with every file in which they are named.
#ifndef TESTS_ACCOUNT_ACCOUNT_STORY_H
#define TESTS_ACCOUNT_ACCOUNT_STORY_H

#include "account/known_everywhere.h"
#include "support/story.h"
#include "support/test.h"

#include <syslog.h>

namespace test {

class AccountStory : public testing::Test {
  protected:
    AccountStory()
    {
        story_.Mask("^(        home [a-z]+ .*) [0-9]+$", "$1 INODE");
        story_.Mask("[0-9]+:[0-9]+:[0-9]+\\.[0-9]{9}", "IDENTITY");  // of a file
        story_.Mask("@del_users_home_[0-9]+", "@del_users_home_PID");
    }

    static std::vector<std::string> Paths()
    {
        std::vector<std::string> paths(std::begin(kFiles), std::end(kFiles));
        paths.insert(paths.end(), {"/etc/.tavoaccount.commit", kHomeFolder, "/volume1/homes", "/volume1/@tmp"});
        return paths;
    }

    CapturedLog log_;
    Story story_{TEST_GOLDEN, {LogOf(log_, LOG_NOTICE)}, Paths()};
};

}  // namespace test

#endif
