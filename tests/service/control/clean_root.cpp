// Restores the appliance root after each test: where tests share one root, no test finds the services of another.
#include "service_root.h"
#include "support/file_snapshot.h"
#include "support/test.h"

namespace {

class CleanRoot : public testing::EmptyTestEventListener {
    void OnTestProgramStart(const testing::UnitTest &) override
    {
        // Only in an appliance root: everything here is put back afterwards.
        if (std::filesystem::exists("/usr/tavo/etc/rc.table") && std::filesystem::exists("/var/standin"))
            before_.emplace(std::vector<std::string>{"/etc", "/etc.defaults", "/usr/tavo/etc", "/var", "/tmp"});
    }

    void OnTestEnd(const testing::TestInfo &) override
    {
        if (!before_)
            return;
        test::ResetStandins();
        before_->Restore();
    }

    std::optional<test::FileSnapshot> before_;
};

[[maybe_unused]] const bool installed = [] {
    testing::UnitTest::GetInstance()->listeners().Append(new CleanRoot);
    return true;
}();

}  // namespace
