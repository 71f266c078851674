// What a test of the storage families replaces: the kernel's view of the disks, the log, requests and the shell.
#ifndef TESTS_STORAGE_STORAGE_SCENE_H
#define TESTS_STORAGE_STORAGE_SCENE_H

#include "support/captures.h"
#include "support/container_text.h"
#include "support/device_tree.h"
#include "support/recorded_calls.h"
#include "support/recorded_commands.h"
#include "support/story.h"
#include "support/test.h"

#include <initializer_list>

namespace test {

class StorageScene : public testing::Test {
  protected:
    void Model(const std::string &settings) { tree_.Put("/etc.defaults/tavoinfo.conf", settings); }
    // Nodes without content.
    void PutNodes(std::initializer_list<const char *> names)
    {
        for (const char *name : names)
            tree_.Put(std::string("/dev/") + name, "");
    }

    DeviceTree tree_;
    CapturedLog log_;
    RecordedCalls calls_;
    RecordedCommands commands_;
};

#ifdef TEST_GOLDEN  // in the folders that have stories
class StorageStory : public StorageScene {
  protected:
    // Without the commands that match the pattern.
    explicit StorageStory(const std::string &without = "")
        : story_(TEST_GOLDEN, {CommandsOf(commands_, without), CallsOf(calls_), LogOf(log_)})
    {
    }

    Story story_;
};
#endif

}  // namespace test

#endif
