// Restores the appliance root after each test: where tests share one root, no test finds the services of another.
#include "service_root.h"
#include "support/scratch_dir.h"

#include <map>

namespace {

namespace fs = std::filesystem;

class CleanRoot : public testing::EmptyTestEventListener {
    void OnTestProgramStart(const testing::UnitTest &) override
    {
        // Only in an appliance root: everything here is removed afterwards.
        inside_ = fs::exists("/usr/tavo/etc/rc.table") && fs::exists("/var/standin");
        for (auto &[path, text] : files_) {
            if (inside_)
                text = test::ReadFile(path);
        }
    }

    void OnTestEnd(const testing::TestInfo &) override
    {
        if (!inside_)
            return;
        std::error_code none;
        test::ResetStandins();
        for (const char *folder : {"/var/run", "/tmp"}) {
            for (const auto &entry : fs::directory_iterator(folder, none)) {
                if (entry.path().extension() == ".pid")
                    fs::remove(entry.path(), none);
            }
        }
        fs::remove_all("/var/services", none);
        for (const auto &[path, text] : files_)
            test::WriteFile(path, text);
    }

    bool inside_ = false;
    std::map<std::string, std::string> files_ = {
        {"/etc/tavoinfo.conf", ""}, {"/etc.defaults/tavoinfo.conf", ""}, {"/usr/tavo/etc/share.conf", ""}};
};

[[maybe_unused]] const bool installed = [] {
    testing::UnitTest::GetInstance()->listeners().Append(new CleanRoot);
    return true;
}();

}  // namespace
