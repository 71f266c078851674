// The root in which a test runs, as whoever entered it describes it: docs/appliance.md has the words.
#ifndef TESTS_SUPPORT_APPLIANCE_ROOT_H
#define TESTS_SUPPORT_APPLIANCE_ROOT_H

#include <string_view>

namespace test {

// "namespaces", "chroot", or "machine" in the virtual appliance; empty on a machine that is no appliance.
std::string_view RootForm();

// Whether this root has no such thing. Outside of one a test may use nothing of the machine: it lacks everything there.
bool RootLacks(std::string_view word);

}  // namespace test

#endif
