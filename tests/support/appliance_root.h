// The root in which a test runs, as described by the program that entered it: docs/appliance.md has the words.
#ifndef TESTS_SUPPORT_APPLIANCE_ROOT_H
#define TESTS_SUPPORT_APPLIANCE_ROOT_H

#include <string_view>

namespace test {

// "namespaces", "chroot", or "machine" in the virtual appliance; empty outside an appliance root.
std::string_view RootForm();

// Whether this root lacks that feature. Outside of a root a test may use nothing of the machine: it lacks everything
// there.
bool RootLacks(std::string_view word);

}  // namespace test

#endif
