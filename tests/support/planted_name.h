// Files that an unprivileged user may plant at a name under /tmp before the appliance uses it.
#ifndef TESTS_SUPPORT_PLANTED_NAME_H
#define TESTS_SUPPORT_PLANTED_NAME_H

#include <ostream>
#include <string>

namespace test {

enum class Plant { file, full_folder, deep_tree, link, fifo };
inline constexpr Plant kPlants[] = {Plant::file, Plant::full_folder, Plant::deep_tree, Plant::link, Plant::fifo};

// Plants at `path` a file, folder or link that belongs to user 1000, with everything in it. A deep tree is 20,000
// folders deep, so that a program that deletes it entry by entry runs out of descriptors, stack or patience. A link
// leads to `path` + ".target", a file that must keep its text "kept". Fails the test when it cannot plant.
void PlantAt(const std::string &path, Plant plant);

// Returns the one name that begins with `path` + ".foreign-", to which root has renamed the planted file; empty when
// there is none.
std::string MovedAside(const std::string &path);

// Removes whatever was planted there, however deep.
void RemovePlanted(const std::string &path);

std::ostream &operator<<(std::ostream &out, Plant plant);

}  // namespace test

#endif
